#include "platform/sim/silicon/IteSuperIo.h"

#include <algorithm>
#include <array>

namespace panelglow::platform::sim {

namespace {

constexpr std::uint8_t kConfigureControl = 0x02;
constexpr std::uint8_t kReturnToWaitForKey = 0x02;
constexpr std::uint8_t kFirstFunction = 0x25;  // GPIO function of set 1's pins, one register a set
constexpr std::uint8_t kLastFunction = 0x2A;

constexpr std::uint8_t kFirstPolarity = 0xB0;
constexpr std::uint8_t kFirstSimpleIo = 0xC0;
constexpr std::uint8_t kFirstOutput = 0xC8;

struct Blinker {
  std::uint8_t location;
  std::uint8_t control;
};
constexpr std::array<Blinker, 2> kBlinkers{{{0xF8, 0xF9}, {0xFA, 0xFB}}};
constexpr std::uint8_t kLocationMask = 0x3F;
constexpr std::uint8_t kHoldLow = 0x01;

// Half a period, by bits 2 and 1 of a control register: 4 Hz, 1 Hz, 1/4 Hz, 1/8 Hz.
constexpr std::array<Microseconds, 4> kHalf_us{125'000, 500'000, 2'000'000, 4'000'000};

Microseconds HalfPeriod(std::uint8_t control) { return kHalf_us[(control >> 1U) & 3U]; }

}  // namespace

std::uint8_t IteSuperIo::ReadRegister(std::uint8_t address) const {
  return address == kConfigureControl ? std::uint8_t{0} : SuperIo::ReadRegister(address);  // it is write-only
}

void IteSuperIo::WriteRegister(std::uint8_t address, std::uint8_t value) {
  if (address == kConfigureControl) {
    if ((value & kReturnToWaitForKey) != 0) {
      LeaveConfigurationMode();
    }
    return;
  }
  const bool isFunction = address >= kFirstFunction && address <= kLastFunction;
  if (!isFunction || SelectedDevice() == Setup().gpioDevice) {
    SuperIo::WriteRegister(address, value);
  }
}

bool IteSuperIo::LineBit(std::uint8_t firstRegister, std::size_t set, unsigned bit) const {
  const auto address = static_cast<std::uint8_t>(firstRegister + set);
  return ((DeviceRegister(Setup().gpioDevice, address) >> bit) & 1U) != 0;
}

bool IteSuperIo::LineLevel(std::size_t set, unsigned bit) const {
  const bool isGpio = ((Global(static_cast<std::uint8_t>(kFirstFunction + set)) >> bit) & 1U) != 0;
  if (!isGpio || !LineBit(kFirstOutput, set, bit)) {
    return ((Setup().gpio[set].inputs >> bit) & 1U) != 0;
  }
  const bool level = LineBit(kFirstSimpleIo, set, bit) ? ((Latch(set) >> bit) & 1U) != 0 : BlinkerLevel(set, bit);
  return level != LineBit(kFirstPolarity, set, bit);
}

bool IteSuperIo::BlinkerLevel(std::size_t set, unsigned bit) const {
  const std::uint8_t device = Setup().gpioDevice;
  for (const Blinker& blinker : kBlinkers) {
    const unsigned location = DeviceRegister(device, blinker.location) & kLocationMask;
    const std::uint8_t control = DeviceRegister(device, blinker.control);
    if (location == (set + 1) * 8 + bit) {
      return (control & kHoldLow) == 0 && BlinkLevel(Time().Now(), HalfPeriod(control));
    }
  }
  return false;  // no alternate function of the line drives it
}

std::optional<Microseconds> IteSuperIo::NextEvent() const {
  std::optional<Microseconds> next;
  for (const Blinker& blinker : kBlinkers) {
    const std::uint8_t control = DeviceRegister(Setup().gpioDevice, blinker.control);
    if ((DeviceRegister(Setup().gpioDevice, blinker.location) & kLocationMask) != 0 && (control & kHoldLow) == 0) {
      const Microseconds edge = NextBlinkEdge(Time().Now(), HalfPeriod(control));
      next = std::min(next.value_or(edge), edge);
    }
  }
  return next;
}

}  // namespace panelglow::platform::sim
