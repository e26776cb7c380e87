#include "board/chips/win/NuvNct5572Chip.h"

#include <array>

#include "board/parts/RowOf.h"

namespace panelglow {

namespace {

// Configuration registers.
constexpr RegisterId kLed{7, 0xE5};
constexpr RegisterId kLedFunction{7, 0xED};
constexpr std::uint8_t kOthersOfLed = 0x30;  // bits that are not the LED's

// Hardware monitor.
constexpr RegisterId kFanMode{0, 0x04};
constexpr RegisterId kFan1Mode{1, 0x02};
constexpr RegisterId kFan2Mode{2, 0x02};
constexpr RegisterId kFan1Duty{1, 0x09};
constexpr RegisterId kFan2Duty{2, 0x09};
constexpr std::uint32_t kSpeedOverflow = 0xFF00;  // a high byte of 0xFF

// Makes the part work the speeds out.
constexpr std::array kMeasureSpeeds{Put({5, 0x08}, 0x80), Put({5, 0x06}, 0x03), Put({5, 0x06}, 0x30)};

// The chipset's power management block: events and what enables them.
constexpr RegisterId kEvent{0, 1};
constexpr std::array kEnables{RegisterId{0, 2}, RegisterId{0, 3}, RegisterId{0, 4}};
constexpr std::array kDisarm{ClearBits({0, 2}, 0x01), ClearBits({0, 4}, 0x01), ClearBits({0, 3}, 0x01)};
constexpr std::uint8_t kPressed = 0x01;

}  // namespace

NuvNct5572Chip::NuvNct5572Chip() : NuvW83667Chip("nuv_nct5572"), buttonPorts(devio, 0) {
  ReadKeys({"chip.nuv_nct5572.", 0x800, 0xA15, 0x2E});
  buttonPorts = PortRegisters(devio, pmbar);
  // The mode registers that manual mode changes are not among the saved ones: the part keeps its fans manual until it
  // is started anew.
  fans = {.tachs = RegisterPairs(6, 0x56, 2),
          .tachOrder = PairOrder::kHighFirst,
          .tachOverflow = kSpeedOverflow,
          .duties = {kFan1Duty, kFan2Duty},
          .fullSpeed = 0xFF,
          .saved = {kFanMode, kFanMode, kFan2Duty, kFan1Duty},
          .manual = {Change(kFan2Mode, 0x0F, 0), Change(kFan1Mode, 0x0F, 0)}};
  sensors[0] = {{0, 0x27}};
  led = {.saved = {kLed, kLedFunction},
         .green = Steps{Change(kLed, kOthersOfLed, 0x80), Put(kLedFunction, 0)},
         .red = Steps{Change(kLed, kOthersOfLed, 0x40), Put(kLedFunction, 0)},
         .off = Steps{Put(kLedFunction, 0x80), Put(kLedFunction, 0x40)}};
}

// ---- fans

std::uint32_t NuvNct5572Chip::ReadFanTach(int fan, int arg) {
  if (RowOf(fans.tachs, fan) != nullptr) {
    Run(kMeasureSpeeds, Monitor());
  }
  // The base corrects counts, and these are speeds. NOLINTNEXTLINE(bugprone-parent-virtual-call)
  return RegisterChip::ReadFanTach(fan, arg);
}

int NuvNct5572Chip::TachToRpm(std::uint32_t raw, int /*multiplier*/) { return static_cast<int>(raw); }

// ---- power button

bool NuvNct5572Chip::SavePowerButtonState() {
  savedButtonPorts.SaveOnce(buttonPorts, kEnables);
  return true;
}

bool NuvNct5572Chip::ArmPowerButton() {
  SavePowerButtonState();
  Run(kDisarm, buttonPorts);
  return true;
}

bool NuvNct5572Chip::IsPowerButtonPressed(bool& pressed) {
  pressed = (buttonPorts.Read(kEvent) & kPressed) != 0;
  return true;
}

bool NuvNct5572Chip::RestorePowerButtonState() {
  savedButtonPorts.Restore(buttonPorts, kEnables);
  savedButtonPorts.Forget();
  return true;
}

}  // namespace panelglow
