#include "board/chips/win/WinWpcd376Chip.h"

#include <array>

#include "board/base/IniReader.h"
#include "board/chips/win/HoodLock.h"
#include "board/parts/ConfigMode.h"
#include "board/parts/RowOf.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kMonitorDevice = 8;
constexpr std::uint8_t kMonitorPage = 0;
constexpr std::uint8_t kGpioDevice = 7;

// Configuration registers.
constexpr RegisterId kPinSelect{ConfigRegisters::kGlobal, 0x25};
constexpr RegisterId kGpioPin{kGpioDevice, 0xF0};
constexpr RegisterId kGpioMode{kGpioDevice, 0xF1};
constexpr std::uint8_t kPinsOfFirmware = 0x40;
constexpr std::array kTakePins{Put(kPinSelect, 0x58), Put(kGpioPin, 0x04), Put(kGpioMode, 0x03), Put(kGpioPin, 0x06),
                               Put(kGpioMode, 0x03)};

// The GPIO port with the LED.
constexpr RegisterId kLed{0, 0};
constexpr std::uint8_t kGreen = 0x40;
constexpr std::uint8_t kRed = 0x10;

// Hardware monitor.
constexpr std::array kFanModes{RegisterId{0, 0x40}, RegisterId{0, 0x41}, RegisterId{0, 0x42}};
constexpr std::uint8_t kManual = 0x9F;  // bits of the mode that stay
constexpr std::uint32_t kDutySettle_ms = 500;

constexpr const char* kBadFanText = "\n INVALID FAN TACK INDEX NUMBER %d\n";

}  // namespace

WinWpcd376Chip::WinWpcd376Chip()
    : RegisterChip("win_wpcd376"),
      config(IndexedPorts(devio, ReadIniWord("chip.win_wpcd376.cfgbar", 0x2E)), {}, {}),
      gpio(devio, ReadIniWord("chip.win_wpcd376.gpiobar", 0x420)),
      pages(devio, ReadIniWord("chip.win_wpcd376.siobar", 0x800), PagedPorts::WriteLock::kNone),
      monitor(*this, &WinWpcd376Chip::ReadMonitor, &WinWpcd376Chip::WriteMonitor) {
  fans = {.tachs = RegisterPairs(0, 0x60, 8),
          .badTachText = kBadFanText,
          .duties = RegisterRun(0, 0x80, 3),
          .badDutyText = kBadFanText};
  led = {.green = Steps{Put(kLed, kGreen)},
         .red = Steps{Put(kLed, kRed)},
         .off = Steps{Put(kLed, 0)},
         .isRedSupported = true};
}

// ---- hardware monitor

std::uint8_t WinWpcd376Chip::ReadMonitor(std::uint8_t reg) {
  config.SelectDevice(kMonitorDevice);
  return pages.Read({kMonitorPage, reg});
}

void WinWpcd376Chip::WriteMonitor(std::uint8_t reg, std::uint8_t value) {
  config.SelectDevice(kMonitorDevice);
  pages.Write({kMonitorPage, reg}, value);
}

bool WinWpcd376Chip::WriteDuty(int fan, int value) {
  const RegisterId* fanMode = RowOf(kFanModes, fan);
  if (fanMode != nullptr) {
    Run(std::array{Change(*fanMode, kManual, 0)}, monitor);
  }
  const bool isWritten = RegisterChip::WriteDuty(fan, value);
  if (isWritten) {
    platform::TheHost().clock.Sleep(kDutySettle_ms);
  }
  return isWritten;
}

// ---- hood lock

bool WinWpcd376Chip::LockHood(int /*line*/, bool /*check*/) { return MoveHoodLock(config, HoodCommand::kLock); }

bool WinWpcd376Chip::UnlockHood(int /*line*/, bool /*check*/) { return MoveHoodLock(config, HoodCommand::kUnlock); }

// ---- power LED

bool WinWpcd376Chip::SavePowerLedState() {
  isSaved = true;
  const ConfigMode mode(config);
  Run(kTakePins, config);
  return true;
}

bool WinWpcd376Chip::RestorePowerLedState() {
  if (isSaved) {
    gpio.Write(kLed, kGreen);
    config.Write(kPinSelect, kPinsOfFirmware);
    isSaved = false;  // last: a restore that is interrupted is done again
  }
  return true;
}

}  // namespace panelglow
