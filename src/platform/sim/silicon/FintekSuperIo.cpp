#include "platform/sim/silicon/FintekSuperIo.h"

#include <algorithm>
#include <array>

namespace panelglow::platform::sim {

namespace {

// Output-enable register of each set; the output register is the next one, the pin levels the one behind that.
constexpr std::array<std::uint8_t, 5> kOutputEnable{0xF0, 0xE0, 0xD0, 0xC0, 0xB0};

constexpr std::uint8_t kPowerManagement = 0x0A;  // logical device

struct LedPin {
  std::string_view name;
  std::uint8_t mode;
};
constexpr std::array<LedPin, 2> kLedPins{{{"LED_VCC", 0xF8}, {"LED_VSB", 0xF9}}};

// What the two bits of a mode say.
enum Mode : unsigned { kLow, kReleased, kHalfHertz, kOneHertz };

Microseconds HalfPeriod(unsigned mode) { return mode == kHalfHertz ? 1'000'000 : 500'000; }

}  // namespace

std::uint8_t FintekSuperIo::ReadRegister(std::uint8_t address) const {
  if (SelectedDevice() == Setup().gpioDevice) {
    for (std::size_t set = 0; set < Setup().gpio.size(); ++set) {
      if (address == kOutputEnable[set] + 2) {
        unsigned levels = 0;
        for (unsigned bit = 0; bit < 8; ++bit) {
          levels |= LineLevel(set, bit) ? 1U << bit : 0U;
        }
        return static_cast<std::uint8_t>(levels);
      }
    }
  }
  return SuperIo::ReadRegister(address);
}

void FintekSuperIo::WriteRegister(std::uint8_t address, std::uint8_t value) {
  const bool isLevel = SelectedDevice() == Setup().gpioDevice &&
                       std::any_of(kOutputEnable.begin(), kOutputEnable.end(),
                                   [&](std::uint8_t enable) { return address == enable + 2; });
  if (!isLevel) {
    SuperIo::WriteRegister(address, value);
  }
}

bool FintekSuperIo::LineLevel(std::size_t set, unsigned bit) const {
  const std::uint8_t device = Setup().gpioDevice;
  const auto output = static_cast<std::uint8_t>(kOutputEnable[set] + 1);
  const bool drives = ((DeviceRegister(device, kOutputEnable[set]) >> bit) & 1U) != 0;
  const unsigned levels = drives ? DeviceRegister(device, output) : Setup().gpio[set].inputs;
  return ((levels >> bit) & 1U) != 0;
}

std::optional<bool> FintekSuperIo::Signal(std::string_view pin) const {
  for (const LedPin& led : kLedPins) {
    if (pin == led.name) {
      const unsigned mode = DeviceRegister(kPowerManagement, led.mode) & 3U;
      return mode == kReleased || (mode != kLow && BlinkLevel(Time().Now(), HalfPeriod(mode)));
    }
  }
  return SuperIo::Signal(pin);
}

std::optional<Microseconds> FintekSuperIo::NextEvent() const {
  std::optional<Microseconds> next;
  for (const LedPin& led : kLedPins) {
    const unsigned mode = DeviceRegister(kPowerManagement, led.mode) & 3U;
    if (mode == kHalfHertz || mode == kOneHertz) {
      const Microseconds edge = NextBlinkEdge(Time().Now(), HalfPeriod(mode));
      next = std::min(next.value_or(edge), edge);
    }
  }
  return next;
}

}  // namespace panelglow::platform::sim
