#include "platform/sim/silicon/MemoryRegisters.h"

#include <charconv>
#include <cstdio>

#include "platform/sim/silicon/GpioBlock.h"

namespace panelglow::platform::sim {

std::optional<std::pair<std::size_t, unsigned>> MemoryRegisters::Locate(std::string_view pin) const {
  const std::size_t dot = pin.find('.');
  if (dot == std::string_view::npos) {
    return std::nullopt;
  }
  const std::optional<unsigned> bit = PinNumber(pin.substr(dot + 1));
  std::size_t offset = 0;
  const auto [end, error] = std::from_chars(pin.data(), pin.data() + dot, offset, 16);
  if (!bit || error != std::errc() || end != pin.data() + dot || offset >= bytes_.size()) {
    return std::nullopt;
  }
  return std::pair{offset, *bit};
}

std::optional<bool> MemoryRegisters::Signal(std::string_view pin) const {
  const auto place = Locate(pin);
  return place ? std::optional<bool>(((bytes_[place->first] >> place->second) & 1U) != 0) : std::nullopt;
}

std::optional<std::uint64_t> MemoryRegisters::RegisterOf(std::string_view pin) const {
  const auto place = Locate(pin);
  return place ? std::optional<std::uint64_t>(base_ + place->first) : std::nullopt;
}

std::string MemoryRegisters::State() const {
  std::string text;
  for (std::size_t offset = 0; offset < bytes_.size(); ++offset) {
    char line[48];
    std::snprintf(line, sizeof line, "memory %08llX = %02X\n", static_cast<unsigned long long>(base_) + offset,
                  bytes_[offset]);
    text += line;
  }
  return text;
}

}  // namespace panelglow::platform::sim
