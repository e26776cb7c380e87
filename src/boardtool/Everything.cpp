#include "boardtool/Everything.h"

#include <functional>

#include "board/ChipTable.h"
#include "board/base/mblib_exception.h"
#include "harness/base/CDMException.h"

namespace panelglow::boardtool {

namespace {

void Try(const std::function<void()>& operation) {
  try {
    operation();
  } catch (const mblib_exception&) {
    return;  // a number that the class's lists do not have
  } catch (const CDMException&) {
    return;  // a firmware that is not there
  } catch (const std::string&) {
    return;  // a management service that is not there
  }
}

void AskChip(Chip& chip) {
  constexpr int kFirst = 1;
  int value = 0;
  bool yes = false;
  std::uint8_t byte = 0;
  const std::function<void()> kOperations[] = {
      [&] { chip.ReadFanRpm(kFirst, value, 1); },
      [&] { chip.SetFanPwmPercent(kFirst, 1); },
      [&] { chip.ReadProcessorTemperature(kFirst, value, true, {}); },
      [&] { chip.ReadVirtualTemperature(kFirst, true, value); },
      [&] { chip.ReadTemperature(kFirst, value); },
      [&] { chip.ReadThreshold(kFirst, value); },
      [&] { chip.ReadEnvironmentRegister(kFirst, byte); },
      [&] { chip.ReadIntrusionLatch(kFirst, false, yes); },
      [&] { chip.LockHood(kFirst, false); },
      [&] { chip.ReadLineByNames(1, "1", "1"); },
      [&] { chip.ReadLine(kFirst); },
      [&] { chip.ReadLineDirect(kFirst); },
      [&] { chip.ReadRegister(kFirst); },
  };
  for (const std::function<void()>& operation : kOperations) {
    Try(operation);
  }
}

}  // namespace

void AskEverything(MotherBoard& board) {
  bool yes = false;
  for (bool (MotherBoard::*const ask)(bool&) :
       {&MotherBoard::IsPowerLedRedSupported, &MotherBoard::IsChargeLedRedSupported,
        &MotherBoard::IsHdLedRedSupported, &MotherBoard::IsWirelessLedSupported}) {
    Try([&] { (board.*ask)(yes); });
  }
  for (bool (MotherBoard::*const load)() :
       {&MotherBoard::IsPanelLedLegacy, &MotherBoard::LoadFans, &MotherBoard::LoadFanGroups, &MotherBoard::LoadZones,
        &MotherBoard::LoadZoneGroups, &MotherBoard::LoadHoodSwitch, &MotherBoard::LoadHoodLock,
        &MotherBoard::LoadButtons, &MotherBoard::LoadLegacySettings, &MotherBoard::DetectFans,
        &MotherBoard::SavePowerButton, &MotherBoard::RestorePowerButton}) {
    Try([&] { (board.*load)(); });
  }
  for (std::size_t kind = 0; kind < kDeviceKinds; ++kind) {
    Try([&] { board.Detect(static_cast<DeviceKind>(kind)); });
  }
  for (const ChipRow& row : ChipRows()) {
    Chip& chip = board.GetChip(std::string(row.name));
    if (chip.GetName() == row.name) {
      AskChip(chip);
    }
  }
}

}  // namespace panelglow::boardtool
