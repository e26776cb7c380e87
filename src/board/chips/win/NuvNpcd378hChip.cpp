#include "board/chips/win/NuvNpcd378hChip.h"

#include <array>

#include "board/base/IniReader.h"
#include "board/chips/win/HoodLock.h"
#include "board/parts/Bits.h"
#include "board/parts/ConfigMode.h"
#include "board/parts/ReadBase.h"
#include "board/parts/RowOf.h"
#include "board/parts/RpmOf.h"

namespace panelglow {

namespace {

// Logical devices with a base.
constexpr std::uint8_t kMonitorDevice = 4;
constexpr std::uint8_t kGpioDevice = 8;

// Configuration registers.
constexpr RegisterId kHoodPins{ConfigRegisters::kGlobal, 0x23};
constexpr std::uint8_t kHoodLockOnPins = 0x10;

// The GPIO port with the LED.
constexpr RegisterId kLed{0, 0};

// Hardware monitor, page 0: a row a fan.
constexpr std::size_t kFans = 8;
constexpr std::uint8_t kSpeed = 0x60;    // pairs
constexpr std::uint8_t kControl = 0x70;  // how the part drives the fan
constexpr std::uint8_t kDuty = 0x80;
constexpr std::uint8_t kManual = 0x9F;  // bits of the control that stay when it is taken
constexpr unsigned kPages = 4;

}  // namespace

NuvNpcd378hChip::NuvNpcd378hChip()
    : RegisterChip("nuv_npcd378h"),
      config(IndexedPorts(devio, ReadIniWord("chip.nuv_npcd378h.cfgbar", 0x2E)), {}, {}),
      monitor(devio, 0, PagedPorts::WriteLock::kHost),
      gpio(devio, 0) {
  const std::uint16_t monitorBase = ReadBase(config, kMonitorDevice);
  const std::uint16_t gpioBase = ReadIniWordUnlessZero("chip.nuv_npcd378h.gpiobar", ReadBase(config, kGpioDevice));
  hasMonitor = IsBase(monitorBase);
  if (hasMonitor) {
    monitor = PagedPorts(devio, monitorBase, PagedPorts::WriteLock::kHost);
    fans = {.tachs = RegisterPairs(0, kSpeed, kFans), .duties = RegisterRun(0, kDuty, kFans)};
    controls = RegisterRun(0, kControl, kFans);
  }
  if (IsBase(gpioBase)) {
    gpio = PortRegisters(devio, gpioBase);
    led = {
        .saved = {kLed}, .green = Steps{Put(kLed, 0x1E)}, .red = Steps{Put(kLed, 0x1F)}, .off = Steps{Put(kLed, 0)}};
  }
}

// ---- fans

std::uint32_t NuvNpcd378hChip::ReadFanTach(int fan, int arg) {
  return hasMonitor ? RegisterChip::ReadFanTach(fan, arg) : kTachStopped;
}

int NuvNpcd378hChip::TachToRpm(std::uint32_t raw, int /*multiplier*/) { return static_cast<int>(raw); }

std::vector<RegisterId> NuvNpcd378hChip::ControlOf(int fan) const {
  const RegisterId* control = RowOf(controls, fan);
  return control == nullptr ? std::vector<RegisterId>{} : std::vector<RegisterId>{*control};
}

void NuvNpcd378hChip::SaveFanControl(int fan) {
  for (const RegisterId control : ControlOf(fan)) {
    savedControls.Keep(monitor, control);
  }
}

void NuvNpcd378hChip::TakeFanControl(int fan) {
  for (const RegisterId control : ControlOf(fan)) {
    Run(std::array{Change(control, kManual, 0)}, monitor);
  }
}

void NuvNpcd378hChip::RestoreFanControl(int fan) { savedControls.Restore(monitor, ControlOf(fan)); }

// ---- registers that files name

bool NuvNpcd378hChip::ReadEnvironmentRegister(std::uint16_t reg, std::uint8_t& value) {
  if (!hasMonitor || HighByte(reg) >= kPages) {
    return false;
  }
  value = monitor.Read({HighByte(reg), LowByte(reg)});
  return true;
}

bool NuvNpcd378hChip::ReadConfigBit(std::uint8_t ldn, std::uint8_t reg, int bit, bool& value) {
  const std::uint32_t mask = MaskOfBit(bit, 8);
  if (mask == 0) {
    return false;
  }
  const ConfigMode mode(config);
  config.SelectDevice(ldn);
  value = (config.Read({ConfigRegisters::kGlobal, reg}) & mask) != 0;
  return true;
}

// ---- hood lock

bool NuvNpcd378hChip::MoveHood(bool locks) {
  Run(std::array{SetBits(kHoodPins, kHoodLockOnPins)}, config);
  return MoveHoodLock(config, locks ? HoodCommand::kLock : HoodCommand::kUnlock);
}

bool NuvNpcd378hChip::LockHood(int /*line*/, bool /*check*/) { return MoveHood(true); }

bool NuvNpcd378hChip::UnlockHood(int /*line*/, bool /*check*/) { return MoveHood(false); }

}  // namespace panelglow
