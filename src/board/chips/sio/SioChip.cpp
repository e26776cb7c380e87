#include "board/chips/sio/SioChip.h"

#include <array>
#include <optional>
#include <utility>

#include "board/base/IniReader.h"
#include "board/parts/LineActivity.h"
#include "board/parts/Lines.h"
#include "board/parts/RowOf.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

// Runtime registers, from their base on.
constexpr RegisterId kLedLine1{0, 0x33};  // what a line is used for
constexpr RegisterId kLedLine2{0, 0x34};
constexpr std::uint8_t kOtherFunction = 0x04;  // not a GPIO line
constexpr RegisterId kLed{0, 0x4D};
constexpr std::uint8_t kNotRed = 0xFE;
constexpr std::uint8_t kNotGreen = 0xFD;

// GPIO groups: first line, last line, register with the levels.
constexpr std::array<LineRange, 8> kGpioGroups{{{10, 17, 0x4B},
                                                {20, 27, 0x4C},
                                                {30, 37, 0x4D},
                                                {40, 47, 0x4E},
                                                {50, 57, 0x4F},
                                                {60, 67, 0x50},
                                                {70, 77, 0x51},
                                                {80, 85, 0x52}}};

// The lock of the hood: a set bit is a command that is under way.
constexpr std::uint8_t kLock = 0x01;
constexpr std::uint8_t kUnlock = 0x02;
constexpr std::uint8_t kMoving = kLock | kUnlock;
constexpr std::uint32_t kBetweenLooks_ms = 75;
constexpr int kMostLooks = 40;
constexpr std::uint32_t kHoodSettle_ms = 10;

constexpr int kIntruderLine = 238;

// Hardware monitor.
constexpr RegisterId kStart{0, 0x40};
constexpr RegisterId kFan1Mode{0, 0x5C};
constexpr RegisterId kFan2Mode{0, 0x5D};
constexpr RegisterId kFan3Mode{0, 0x5E};
constexpr std::uint8_t kManual = 0xE0;
constexpr RegisterId kRamp1{0, 0x62};
constexpr RegisterId kRamp2{0, 0x63};
constexpr std::uint8_t kNoSensor = 0x80;
constexpr int kNoTemperature = 255;

}  // namespace

SioChip::SioChip() : SioChip("sio") {}

SioChip::SioChip(std::string chipName)
    : RegisterChip(std::move(chipName)), monitor(IndexedPorts(devio, 0)), runtime(devio, 0) {
  ReadKeys("chip.sio.", 0x400, 0x480);
  hoodLockOffset = ReadIniWord("chip.sio.hoodlockoffset", 0x5D);
  fans = {.tachs = {{{0, 0x28}, {0, 0x29}},
                    {{0, 0x2A}, {0, 0x2B}},
                    {{0, 0x2C}, {0, 0x2D}},
                    {{0, 0x2E}, {0, 0x2F}},
                    {{0, 0x34}, {0, 0x35}},
                    {{0, 0x36}, {0, 0x37}},
                    {{0, 0x38}, {0, 0x39}},
                    {{0, 0x3A}, {0, 0x3B}}},
          .duties = RegisterRun(0, 0x30, 3),  // fans 4 to 8 are watched only
          .saved = {kStart, kFan1Mode, kFan2Mode, kFan3Mode, kRamp1, kRamp2},
          .manual = {FromSaved(kStart, 0xFD, 0x01), FromSaved(kFan1Mode, 0xFF, kManual),
                     FromSaved(kFan2Mode, 0xFF, kManual), FromSaved(kFan3Mode, 0xFF, kManual),
                     FromSaved(kRamp1, 0xF0, 0), Put(kRamp2, 0)}};
  zones = {.zones = RegistersAt(0, {0x25, 0x26, 0x27, 0x80})};
  lowLimits = RegistersAt(0, {0x67, 0x68, 0x69, 0x83});
  led = {.green = Steps{Change(kLed, kNotRed, 0x02)},
         .red = Steps{Change(kLed, kNotGreen, 0x01)},
         .off = Steps{Change(kLed, kNotRed & kNotGreen, 0)},
         .isRedSupported = true};
}

void SioChip::ReadKeys(const std::string& prefix, std::uint16_t pmbarDefault, std::uint16_t hwmbarDefault) {
  pmbar = ReadIniWord(prefix + "pmbar", pmbarDefault);
  runtime = PortRegisters(devio, pmbar);
  monitor = IndexedRegisters(IndexedPorts(devio, ReadIniWord(prefix + "hwmbar", hwmbarDefault)));
}

// ---- temperatures

bool SioChip::ReadZone(const std::vector<RegisterId>& registers, int zone, int& value) {
  const RegisterId* reg = RowOf(registers, zone);
  if (reg == nullptr) {
    return false;
  }
  const std::uint8_t raw = monitor.Read(*reg);
  value = raw == kNoSensor ? kNoTemperature : static_cast<std::int8_t>(raw);
  return true;
}

// ---- lines

bool SioChip::ReadIntrusionLatch(int line, bool /*clearFirst*/, bool& value) {
  if (line == kIntruderLine) {
    platform::TheHost().console.Write("\n SIO Detection using SIO INTRUDER signal (is a STUB!!!)\n");
    value = false;
    return true;
  }
  const int state = ReadLine(line);
  if (state == kNoSuchLine) {
    return false;
  }
  value = state == kAsserted;
  return true;
}

int SioChip::ReadLine(int line) {
  const std::optional<LinePlace> found = FindLine(kGpioGroups, line);
  if (!found) {
    return kNoSuchLine;
  }
  return LineState((devio.InportByte(static_cast<std::uint16_t>(pmbar + found->place)) & found->mask) != 0);
}

bool SioChip::ReadLineActivity(int line, int& value) {
  value = -1;
  if (!FindLine(kGpioGroups, line)) {
    return false;
  }
  value = MeasureLineActivity([&] { return ReadLine(line) == kAsserted; });
  return true;
}

// ---- hood lock

bool SioChip::MoveHood(std::uint8_t command, int line, bool check, int wanted) {
  const auto port = static_cast<std::uint16_t>(pmbar + hoodLockOffset);
  std::uint8_t lock = devio.InportByte(port);
  for (int look = 1; (lock & kMoving) != 0; ++look) {
    if (look == kMostLooks) {
      return false;
    }
    platform::TheHost().clock.Sleep(kBetweenLooks_ms);
    lock = devio.InportByte(port);
  }
  devio.OutportByte(port, lock | command);
  if (!check) {
    return true;
  }
  platform::TheHost().clock.Sleep(kHoodSettle_ms);
  return ReadLine(line) == wanted;
}

bool SioChip::LockHood(int line, bool check) { return MoveHood(kLock, line, check, kNotAsserted); }

bool SioChip::UnlockHood(int line, bool check) { return MoveHood(kUnlock, line, check, kAsserted); }

// ---- power LED

bool SioChip::SavePowerLedState() {
  isSaved = true;
  Run(std::array{ClearBits(kLedLine1, kOtherFunction), ClearBits(kLedLine2, kOtherFunction)}, runtime);
  return true;
}

bool SioChip::RestorePowerLedState() {
  if (isSaved) {
    Run(std::array{SetBits(kLedLine1, kOtherFunction), SetBits(kLedLine2, kOtherFunction)}, runtime);
    isSaved = false;  // last: a restore that is interrupted is done again
  }
  return true;
}

}  // namespace panelglow
