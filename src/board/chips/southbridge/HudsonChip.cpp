#include "board/chips/southbridge/HudsonChip.h"

#include <optional>

#include "board/base/IniReader.h"
#include "board/parts/BitName.h"
#include "board/parts/Bits.h"
#include "board/parts/ConfigMode.h"
#include "board/parts/IndexedPorts.h"
#include "board/parts/Pulse.h"
#include "board/parts/RpmOf.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

// Offsets from the GPIO base.
constexpr std::uint32_t kFans = 0x300;
constexpr std::uint32_t kPinFunctions = 0xC00;  // a byte for each line

// Tachometers, from the base of the fans; the next fan's are 5 bytes on.
constexpr int kMostFans = 5;
constexpr std::uint32_t kFanSpacing = 5;
constexpr std::uint32_t kTachControl = 0x66;
constexpr std::uint32_t kTachLow = 0x69;
constexpr std::uint32_t kTachHigh = 0x6A;
constexpr int kTachClock = 681'600;
constexpr std::uint32_t kTachSettle_ms = 100;

// Lines.
constexpr int kMostLines = 256;
constexpr std::uint8_t kLineIsHigh = 0x80;
constexpr std::uint32_t kLastSharedLine =
    35;                                     // up to here the pins are the PCI bus's, unless they are told to be lines
constexpr std::uint8_t kPinSharing = 0xEA;  // register of the power management block
constexpr std::uint8_t kAreLines = 0x01;    // of it, and of a pin's function

constexpr int kLatchLine = 238;
constexpr std::uint32_t kLatch = 0xFED8005A;  // physical address, whatever the GPIO base
constexpr std::uint8_t kLatched = 0x04;
constexpr std::uint8_t kClear = 0x02;

// Makes a shared pin a line; for the life of a ConfigMode.
class SharedPin {
 public:
  SharedPin(const IndexedPorts& powerManagement, const PhysicalRegisters& memory, std::uint32_t address)
      : power(powerManagement), registers(memory), function(address) {}

  void EnterConfigMode() {
    savedSharing = power.Read(kPinSharing);
    power.Write(kPinSharing, *savedSharing | kAreLines);
    savedFunction = registers.ReadByte(function);
    if (savedFunction) {
      registers.WriteByte(function, *savedFunction | kAreLines);
    }
  }

  void ExitConfigMode() const {
    if (savedFunction) {
      registers.WriteByte(function, *savedFunction);
    }
    if (savedSharing) {
      power.Write(kPinSharing, *savedSharing);
    }
  }

 private:
  IndexedPorts power;
  PhysicalRegisters registers;
  std::uint32_t function;
  std::optional<std::uint8_t> savedSharing;
  std::optional<std::uint8_t> savedFunction;
};

}  // namespace

HudsonChip::HudsonChip()
    : IchChip("hudson", ReadIniWordUnlessZero("chip.hudson.pmbar", 0x800)),
      gpiobar(ReadIniUnsignedUnlessZero("chip.hudson.gpiobar", 0xFED80100)),
      indirectioaddr(ReadIniWordUnlessZero("chip.hudson.indirectioaddr", 0xCD6)),
      memory(devio) {}

// ---- fans

std::uint32_t HudsonChip::ReadFanTach(int fan, int /*arg*/) {
  if (fan < 0 || fan >= kMostFans) {
    return 0;
  }
  const PhysicalRegisters tach(devio, gpiobar + kFans + kFanSpacing * static_cast<std::uint32_t>(fan));
  // Written as it reads: that takes a new count.
  if (const std::optional<std::uint8_t> control = tach.ReadByte(kTachControl); control) {
    tach.WriteByte(kTachControl, *control);
  }
  platform::TheHost().clock.Sleep(kTachSettle_ms);
  const std::optional<std::uint8_t> low = tach.ReadByte(kTachLow);
  const std::optional<std::uint8_t> high = tach.ReadByte(kTachHigh);
  return low && high ? WordOf(*high, *low) : 0;
}

int HudsonChip::TachToRpm(std::uint32_t raw, int /*multiplier*/) { return RpmOf(kTachClock, raw); }

// ---- lines

int HudsonChip::ReadLatch() {
  const std::optional<std::uint8_t> status = memory.ReadByte(kLatch);
  if (!status || (*status & kLatched) == 0) {
    return kNotAsserted;
  }
  const auto write = [this](std::uint8_t value) { memory.WriteByte(kLatch, value); };
  SendPulse(write, *status & kClear, LowByte(*status & ~std::uint32_t{kClear}));
  return kAsserted;
}

int HudsonChip::ReadLevel(std::uint32_t line) const {
  const std::optional<std::uint8_t> level = memory.ReadByte(gpiobar + line);
  return level ? LineState((*level & kLineIsHigh) != 0) : kNoSuchLine;
}

bool HudsonChip::HasLine(int line) const { return line >= 0 && line < kMostLines; }

int HudsonChip::ReadLine(int line) {
  if (line == kLatchLine) {
    return ReadLatch();
  }
  if (!HasLine(line)) {
    return kNoSuchLine;
  }
  const auto number = static_cast<std::uint32_t>(line);
  if (number > kLastSharedLine) {
    return ReadLevel(number);
  }
  SharedPin pin(IndexedPorts(devio, indirectioaddr), memory, gpiobar + kPinFunctions + number);
  const ConfigMode mode(pin);
  return ReadLevel(number);
}

int HudsonChip::ReadLineByNames(std::uint32_t reg, const std::string& bitName, const std::string& clearBitName) {
  const IndexedPorts power(devio, indirectioaddr);
  const std::uint8_t index = LowByte(reg);
  if (!clearBitName.empty()) {
    const std::uint32_t clear = MaskOfBitName(clearBitName, 8);
    const std::uint8_t value = power.Read(index);
    const auto write = [&](std::uint8_t pulse) { power.Write(index, pulse); };
    SendPulse(write, LowByte(value | clear), LowByte(value & ~clear));
  }
  return LineState((power.Read(index) & MaskOfBitName(bitName, 8)) != 0);
}

}  // namespace panelglow
