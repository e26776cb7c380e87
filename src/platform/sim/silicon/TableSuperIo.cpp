#include "platform/sim/silicon/TableSuperIo.h"

#include <algorithm>

namespace panelglow::platform::sim {

namespace {

constexpr std::uint8_t kFirstDeviceRegister = 0x30;
constexpr std::uint8_t kActivate = 0x30;
constexpr std::uint8_t kRuntimeBase = 0x60;

bool Bit(unsigned value, unsigned bit) { return ((value >> bit) & 1U) != 0; }

}  // namespace

TableSuperIo::TableSuperIo(const SuperIoSetup& setup, const Scheduler& time)
    : SuperIo(setup, time), runtime_(setup.tables.runtime) {
  for (const auto& [device, banks] : setup.tables.banks) {
    banked_.emplace(device, banks);
  }
}

// ---- ports

std::vector<AddressRange> TableSuperIo::PortRanges() const {
  std::vector<AddressRange> ranges = SuperIo::PortRanges();
  if (Tables().runtimeDevice && IsActive(*Tables().runtimeDevice)) {
    if (const std::uint64_t base = Base(*Tables().runtimeDevice, kRuntimeBase); base != 0) {
      for (const auto& [offset, value] : runtime_) {
        ranges.push_back({base + offset, 1});
      }
    }
  }
  return ranges;
}

std::map<std::uint8_t, std::uint8_t>::iterator TableSuperIo::AtPort(std::uint16_t port) {
  const bool answers = Tables().runtimeDevice && IsActive(*Tables().runtimeDevice);
  const int offset = answers ? port - Base(*Tables().runtimeDevice, kRuntimeBase) : -1;
  return offset < 0 || offset > 0xFF ? runtime_.end() : runtime_.find(static_cast<std::uint8_t>(offset));
}

std::uint8_t TableSuperIo::ReadPort(std::uint16_t port) {
  const auto found = AtPort(port);
  return found == runtime_.end() ? SuperIo::ReadPort(port) : found->second;
}

void TableSuperIo::WritePort(std::uint16_t port, std::uint8_t value) {
  const auto found = AtPort(port);
  if (found == runtime_.end()) {
    SuperIo::WritePort(port, value);
  } else if (!IsLocked(true, std::nullopt, found->first)) {
    found->second = value;
  }
}

// ---- registers

std::uint8_t TableSuperIo::Value(const SuperIoField& field) const {
  std::uint8_t value = 0;
  if (field.isRuntime) {
    const auto found = runtime_.find(field.address);
    value = found == runtime_.end() ? std::uint8_t{0} : found->second;
  } else if (!field.device) {
    value = Global(field.address);
  } else if (const auto banks = banked_.find(*field.device); field.bank && banks != banked_.end()) {
    value = banks->second.At(*field.bank, field.address);
  } else {
    value = DeviceRegister(*field.device, field.address);
  }
  return static_cast<std::uint8_t>(value & field.mask);
}

bool TableSuperIo::IsLocked(bool isRuntime, std::optional<std::uint8_t> device, std::uint8_t address) const {
  return std::any_of(Tables().locks.begin(), Tables().locks.end(), [&](const SuperIoLock& lock) {
    const SuperIoField& field = lock.condition.field;
    return field.isRuntime == isRuntime && field.device == device && lock.stops.count(address) != 0 &&
           Holds(lock.condition, Reader());
  });
}

std::uint8_t TableSuperIo::ReadRegister(std::uint8_t address) const {
  if (address >= kFirstDeviceRegister) {
    if (const auto banks = banked_.find(SelectedDevice()); banks != banked_.end() && banks->second.Has(address)) {
      return banks->second.Read(address);
    }
    for (const SuperIoLines& lines : Tables().lines) {
      if (lines.device != SelectedDevice() || (address != lines.data && address != lines.status)) {
        continue;
      }
      unsigned levels = 0;
      for (unsigned bit = 0; bit < 8; ++bit) {
        const bool inverted = lines.inversion && BitOf(lines, *lines.inversion, bit);
        const bool level = address == lines.status ? PinLevel(lines, bit)
                           : Drives(lines, bit)    ? BitOf(lines, lines.data, bit)
                                                   : PinLevel(lines, bit) != inverted;
        levels |= level ? 1U << bit : 0U;
      }
      return static_cast<std::uint8_t>(levels);
    }
  }
  return SuperIo::ReadRegister(address);
}

void TableSuperIo::WriteRegister(std::uint8_t address, std::uint8_t value) {
  const bool ofDevice = address >= kFirstDeviceRegister;
  if (IsLocked(false, ofDevice ? std::optional(SelectedDevice()) : std::nullopt, address)) {
    return;
  }
  if (ofDevice) {
    if (const auto banks = banked_.find(SelectedDevice()); banks != banked_.end() && banks->second.Has(address)) {
      banks->second.Write(address, value);
      return;
    }
    if (std::any_of(Tables().lines.begin(), Tables().lines.end(), [&](const SuperIoLines& lines) {
          return lines.device == SelectedDevice() && lines.status == address;
        })) {
      return;
    }
  }
  SuperIo::WriteRegister(address, value);
}

// ---- pins

bool TableSuperIo::BitOf(const SuperIoLines& lines, std::uint8_t address, unsigned bit) const {
  return Bit(DeviceRegister(lines.device, address), bit);
}

bool TableSuperIo::Drives(const SuperIoLines& lines, unsigned bit) const {
  return (!lines.enableBit || BitOf(lines, kActivate, *lines.enableBit)) &&
         (!lines.function || !BitOf(lines, *lines.function, bit)) &&
         BitOf(lines, lines.direction, bit) == lines.outputIsSet;
}

bool TableSuperIo::PinLevel(const SuperIoLines& lines, unsigned bit) const {
  const bool inverted = lines.inversion && BitOf(lines, *lines.inversion, bit);
  return Drives(lines, bit) ? BitOf(lines, lines.data, bit) != inverted : Bit(lines.inputs, bit);
}

const SuperIoLed* TableSuperIo::FindLed(std::string_view pin) const {
  const auto found = std::find_if(Tables().leds.begin(), Tables().leds.end(),
                                  [&](const SuperIoLed& led) { return led.name == pin; });
  return found == Tables().leds.end() ? nullptr : &*found;
}

std::optional<bool> TableSuperIo::Signal(std::string_view pin) const {
  if (const std::size_t gate = pin.find('&'); gate != std::string_view::npos) {
    const std::optional<bool> one = Signal(pin.substr(0, gate));
    const std::optional<bool> others = Signal(pin.substr(gate + 1));
    return one && others ? std::optional(*one && *others) : std::nullopt;
  }
  if (const SuperIoLed* led = FindLed(pin)) {
    return LedLevel(*led, Reader(), Time().Now());
  }
  if (pin.size() == 4 && pin.substr(0, 2) == "GP" && pin[3] >= '0' && pin[3] <= '7') {
    for (const SuperIoLines& lines : Tables().lines) {
      if (pin[2] == '0' + lines.number) {
        return PinLevel(lines, static_cast<unsigned>(pin[3] - '0'));
      }
    }
  }
  return SuperIo::Signal(pin);
}

std::optional<std::uint64_t> TableSuperIo::RegisterOf(std::string_view pin) const {
  const std::string_view first = pin.substr(0, pin.find('&'));
  if (const SuperIoLed* led = FindLed(first); led != nullptr && led->mode.isRuntime) {
    return Base(*Tables().runtimeDevice, kRuntimeBase) + std::uint64_t{led->mode.address};
  }
  const bool isTold = FindLed(first) != nullptr || !Tables().lines.empty();
  return isTold ? std::optional<std::uint64_t>(Setup().indexPort + 1U) : SuperIo::RegisterOf(first);
}

std::optional<Microseconds> TableSuperIo::NextEvent() const {
  return NextLedEdge(Tables().leds, Reader(), Time().Now());
}

std::string TableSuperIo::State() const {
  std::string text = SuperIo::State();
  if (!runtime_.empty()) {
    text += RegisterRow("super-io run-time", runtime_);
  }
  for (const auto& [device, banks] : banked_) {
    text += banks.State("super-io device " + std::to_string(device));
  }
  return text;
}

}  // namespace panelglow::platform::sim
