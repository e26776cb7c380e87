#include "platform/sim/silicon/PortRegisters.h"

#include <algorithm>
#include <charconv>
#include <cstdio>

#include "platform/sim/silicon/GpioBlock.h"

namespace panelglow::platform::sim {

namespace {

constexpr std::uint16_t kLineBytes = 4;

std::uint8_t MaskAt(const std::map<std::uint16_t, std::uint8_t>& masks, std::uint16_t offset) {
  const auto found = masks.find(offset);
  return found == masks.end() ? std::uint8_t{0} : found->second;
}

std::optional<std::pair<std::uint16_t, unsigned>> Place(std::string_view pin) {
  const std::size_t dot = pin.find('.');
  if (dot == std::string_view::npos) {
    return std::nullopt;
  }
  const std::optional<unsigned> bit = PinNumber(pin.substr(dot + 1));
  std::uint16_t offset = 0;
  const auto [end, error] = std::from_chars(pin.data(), pin.data() + dot, offset, 16);
  return bit && error == std::errc() && end == pin.data() + dot ? std::optional(std::pair{offset, *bit})
                                                                : std::nullopt;
}

}  // namespace

std::vector<AddressRange> PortRegisters::PortRanges() const {
  std::vector<AddressRange> ranges;
  for (const auto& [offset, value] : setup_.registers) {
    ranges.push_back({static_cast<std::uint64_t>(setup_.base) + offset, 1});
  }
  return ranges;
}

std::uint8_t PortRegisters::Latch(std::uint16_t offset) const { return MaskAt(setup_.registers, offset); }

const PortLines* PortRegisters::LinesAt(std::uint16_t offset) const {
  const auto found = std::find_if(setup_.lines.begin(), setup_.lines.end(), [&](const PortLines& lines) {
    return offset >= lines.level && offset - lines.level < kLineBytes;
  });
  return found == setup_.lines.end() ? nullptr : &*found;
}

std::uint8_t PortRegisters::Outputs(const PortLines& lines, unsigned byte) const {
  const auto at = [&](std::uint16_t first) { return Latch(static_cast<std::uint16_t>(first + byte)); };
  const unsigned gpio = lines.select ? at(*lines.select) : 0xFFU;
  return static_cast<std::uint8_t>(gpio & ~(lines.direction ? unsigned{at(*lines.direction)} : 0U));
}

std::uint8_t PortRegisters::Read(std::uint16_t offset) const {
  const PortLines* const lines = LinesAt(offset);
  if (lines == nullptr) {
    return Latch(offset);
  }
  const auto byte = static_cast<unsigned>(offset - lines->level);
  const unsigned outputs = Outputs(*lines, byte);
  return static_cast<std::uint8_t>((Latch(offset) & outputs) | ((lines->outside >> (8U * byte)) & ~outputs));
}

void PortRegisters::WritePort(std::uint16_t port, std::uint8_t value) {
  const auto offset = static_cast<std::uint16_t>(port - setup_.base);
  const unsigned before = Latch(offset);
  const unsigned events = MaskAt(setup_.clearByOne, offset);
  unsigned kept = events | MaskAt(setup_.readOnly, offset);
  if (const PortLines* const lines = LinesAt(offset)) {
    kept |= ~unsigned{Outputs(*lines, static_cast<unsigned>(offset - lines->level))};
  }
  setup_.registers[offset] = static_cast<std::uint8_t>((value & ~kept) | (before & kept & ~(value & events)));
}

std::optional<bool> PortRegisters::Signal(std::string_view pin) const {
  const auto place = Place(pin);
  if (!place || setup_.registers.count(place->first) == 0) {
    return std::nullopt;
  }
  return ((Read(place->first) >> place->second) & 1U) != 0;
}

std::optional<std::uint64_t> PortRegisters::RegisterOf(std::string_view pin) const {
  const auto place = Place(pin);
  return place ? std::optional<std::uint64_t>(std::uint64_t{setup_.base} + place->first) : std::nullopt;
}

std::string PortRegisters::State() const {
  std::string text;
  for (const auto& [offset, value] : setup_.registers) {
    char line[32];
    std::snprintf(line, sizeof line, "port %04X = %02X\n", static_cast<unsigned>(setup_.base) + offset, value);
    text += line;
  }
  return text;
}

}  // namespace panelglow::platform::sim
