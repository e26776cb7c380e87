#include "platform/sim/silicon/SuperIo.h"

#include <charconv>
#include <cstdio>

namespace panelglow::platform::sim {

namespace {

constexpr std::uint8_t kDeviceSelect = 0x07;
constexpr std::uint8_t kChipId = 0x20;
constexpr std::uint8_t kFirstDeviceRegister = 0x30;
constexpr std::uint8_t kActivate = 0x30;
constexpr std::uint8_t kFirstBase = 0x60;
constexpr std::uint8_t kSecondBase = 0x62;

// Sixteen registers in a line.
template <std::size_t Count>
void AppendRows(std::string& text, const char* name, const std::array<std::uint8_t, Count>& registers,
                std::size_t from, std::size_t to) {
  for (std::size_t row = from; row < to; row += 16) {
    char part[64];
    std::snprintf(part, sizeof part, "%s registers %02X =", name, static_cast<unsigned>(row));
    text += part;
    for (std::size_t i = row; i < row + 16; ++i) {
      std::snprintf(part, sizeof part, " %02X", registers[i]);
      text += part;
    }
    text += "\n";
  }
}

}  // namespace

bool BlinkLevel(Microseconds now, Microseconds half_us) { return now / half_us % 2 == 0; }

Microseconds NextBlinkEdge(Microseconds now, Microseconds half_us) { return (now / half_us + 1) * half_us; }

SuperIo::SuperIo(const SuperIoSetup& setup, const Scheduler& time)
    : setup_(setup), time_(time), configuration_(setup.enterKeys.empty()) {
  for (const auto& [address, value] : setup_.globals) {
    globals_[address] = value;
  }
  for (std::size_t i = 0; i < setup_.chipId.size(); ++i) {
    globals_[kChipId + i] = setup_.chipId[i];
  }
  for (const auto& [device, values] : setup_.devices) {
    Registers& registers = devices_[device];
    registers.fill(0);
    for (const auto& [address, value] : values) {
      registers[address] = value;
    }
  }
  for (const GpioSet& set : setup_.gpio) {
    latches_.push_back(set.latch);
  }
  if (setup_.environment) {
    environment_.emplace(*setup_.environment, time_);
  }
}

// ---- ports

std::vector<AddressRange> SuperIo::PortRanges() const {
  std::vector<AddressRange> ranges{{setup_.indexPort, 2}};
  if (environment_ && IsActive(setup_.environment->device)) {
    if (const std::uint64_t base = Base(setup_.environment->device, kFirstBase); base != 0) {
      ranges.push_back({base + setup_.environment->indexOffset, 1});
      ranges.push_back({base + setup_.environment->dataOffset, 1});
    }
  }
  if (HasLevelPorts() && !latches_.empty() && IsActive(setup_.gpioDevice)) {
    if (const std::uint64_t base = Base(setup_.gpioDevice, kSecondBase); base != 0) {
      ranges.push_back({base, latches_.size()});
    }
  }
  return ranges;
}

std::uint8_t SuperIo::ReadPort(std::uint16_t port) {
  if (port == setup_.indexPort) {
    return configuration_ ? index_ : std::uint8_t{0xFF};
  }
  if (port == setup_.indexPort + 1) {
    return configuration_ ? ReadRegister(index_) : std::uint8_t{0xFF};
  }
  if (environment_) {
    const int offset = port - Base(setup_.environment->device, kFirstBase);
    if (offset == setup_.environment->indexOffset) {
      return environment_->Selected();
    }
    if (offset == setup_.environment->dataOffset) {
      return environment_->Read();
    }
  }
  const auto set = static_cast<std::size_t>(port - Base(setup_.gpioDevice, kSecondBase));
  return Levels(set);
}

void SuperIo::WritePort(std::uint16_t port, std::uint8_t value) {
  if (port == setup_.indexPort) {
    WriteIndex(value);
    return;
  }
  if (port == setup_.indexPort + 1) {
    keysSeen_ = 0;  // the keys count in a row only
    if (configuration_) {
      WriteRegister(index_, value);
    }
    return;
  }
  if (environment_) {
    const int offset = port - Base(setup_.environment->device, kFirstBase);
    if (offset == setup_.environment->indexOffset) {
      environment_->Select(value);
      return;
    }
    if (offset == setup_.environment->dataOffset) {
      environment_->Write(value);
      return;
    }
  }
  latches_[static_cast<std::size_t>(port - Base(setup_.gpioDevice, kSecondBase))] = value;
}

void SuperIo::WriteIndex(std::uint8_t value) {
  if (configuration_) {
    if (value == setup_.exitKey) {
      configuration_ = false;
      return;
    }
    index_ = value;
    return;
  }
  if (value != setup_.enterKeys[keysSeen_]) {
    keysSeen_ = 0;
  }
  if (value == setup_.enterKeys[keysSeen_] && ++keysSeen_ == setup_.enterKeys.size()) {
    keysSeen_ = 0;
    configuration_ = true;
  }
}

// ---- registers

std::uint8_t SuperIo::DeviceRegister(std::uint8_t device, std::uint8_t address) const {
  const auto found = devices_.find(device);
  return found == devices_.end() ? std::uint8_t{0} : found->second[address];
}

std::uint16_t SuperIo::Base(std::uint8_t device, std::uint8_t highRegister) const {
  return static_cast<std::uint16_t>(DeviceRegister(device, highRegister) << 8U |
                                    DeviceRegister(device, static_cast<std::uint8_t>(highRegister + 1)));
}

bool SuperIo::IsActive(std::uint8_t device) const { return (DeviceRegister(device, kActivate) & 1U) != 0; }

std::uint8_t SuperIo::ReadRegister(std::uint8_t address) const {
  if (address == kDeviceSelect) {
    return selected_;
  }
  if (address < kFirstDeviceRegister) {
    return globals_[address];
  }
  return devices_.count(selected_) == 0 ? std::uint8_t{0xFF} : DeviceRegister(selected_, address);
}

void SuperIo::WriteRegister(std::uint8_t address, std::uint8_t value) {
  if (address == kDeviceSelect) {
    selected_ = value;
  } else if (address < kFirstDeviceRegister) {
    const bool isChipId = address >= kChipId && address < kChipId + setup_.chipId.size();
    if (!isChipId) {
      globals_[address] = value;
    }
  } else if (const auto found = devices_.find(selected_); found != devices_.end()) {
    found->second[address] = value;
  }
}

// ---- lines

bool SuperIo::LineLevel(std::size_t set, unsigned bit) const {
  const GpioSet& lines = setup_.gpio[set];
  const unsigned levels = (latches_[set] & lines.outputs) | (lines.inputs & ~unsigned{lines.outputs});
  return ((levels >> bit) & 1U) != 0;
}

std::uint8_t SuperIo::Levels(std::size_t set) const {
  unsigned levels = 0;
  for (unsigned bit = 0; bit < 8; ++bit) {
    levels |= LineLevel(set, bit) ? 1U << bit : 0U;
  }
  return static_cast<std::uint8_t>(levels);
}

std::optional<std::pair<std::size_t, unsigned>> SuperIo::Locate(std::string_view pin) const {
  unsigned line = 0;
  const char* end = pin.data() + pin.size();
  if (pin.size() < 3 || pin.substr(0, 2) != "GP" || std::from_chars(pin.data() + 2, end, line).ptr != end) {
    return std::nullopt;
  }
  const std::size_t tens = line / 10;
  if (tens < FirstSet() || tens - FirstSet() >= latches_.size() || line % 10 > 7) {
    return std::nullopt;
  }
  return std::pair{tens - FirstSet(), line % 10};
}

std::optional<bool> SuperIo::Signal(std::string_view pin) const {
  const auto line = Locate(pin);
  return line ? std::optional<bool>(LineLevel(line->first, line->second)) : std::nullopt;
}

std::optional<std::uint64_t> SuperIo::RegisterOf(std::string_view pin) const {
  // Of lines that nothing but a level port moves that port; all others move by configuration registers.
  const auto line = Locate(pin);
  if (setup_.family == SuperIoFamily::kPlain && line) {
    return Base(setup_.gpioDevice, kSecondBase) + line->first;
  }
  return setup_.indexPort + 1U;
}

std::string SuperIo::State() const {
  std::string text = "super-io configuration mode = ";
  text += configuration_ ? "open\n" : "closed\n";
  std::array<std::uint8_t, 256> globals = globals_;
  globals[kDeviceSelect] = 0;
  AppendRows(text, "super-io", globals, 0, kFirstDeviceRegister);
  for (const auto& [device, registers] : devices_) {
    char name[32];
    std::snprintf(name, sizeof name, "super-io device %02X", device);
    AppendRows(text, name, registers, kFirstDeviceRegister, registers.size());
  }
  for (std::size_t set = 0; set < latches_.size(); ++set) {
    char line[48];
    std::snprintf(line, sizeof line, "super-io gpio set %u = %02X\n", static_cast<unsigned>(set + FirstSet()),
                  latches_[set]);
    text += line;
  }
  return environment_ ? text + environment_->State() : text;
}

}  // namespace panelglow::platform::sim
