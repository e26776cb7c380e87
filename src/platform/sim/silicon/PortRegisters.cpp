#include "platform/sim/silicon/PortRegisters.h"

#include <algorithm>
#include <charconv>
#include <cstdio>

#include "platform/sim/silicon/GpioBlock.h"

namespace panelglow::platform::sim {

namespace {

constexpr std::uint16_t kLineBytes = 4;
constexpr Microseconds kEventReturns_us = 1000;

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
  unsigned value = Latch(offset);
  if (const PortLines* const lines = LinesAt(offset)) {
    const auto byte = static_cast<unsigned>(offset - lines->level);
    const unsigned outputs = Outputs(*lines, byte);
    value = (value & outputs) | ((lines->outside >> (8U * byte)) & ~outputs);
  }
  const unsigned events = MaskAt(setup_.clearByOne, offset);
  for (const PortPress& press : setup_.presses) {
    if (press.offset == offset && IsPressed(press)) {
      const unsigned levels = press.mask & ~events;  // an event is latched instead
      value = press.isLow ? value & ~levels : value | levels;
    }
  }
  const auto cleared = clearedAt_.find(offset);
  if (cleared == clearedAt_.end() || time_.Now() >= cleared->second + kEventReturns_us) {
    value |= MaskAt(setup_.lasting, offset);
  }
  return static_cast<std::uint8_t>(value);
}

std::uint8_t PortRegisters::ReadPort(std::uint16_t port) {
  Advance();
  return Read(static_cast<std::uint16_t>(port - setup_.base));
}

// ---- what happens by itself

void PortRegisters::Advance() {
  for (const PortPress& press : setup_.presses) {
    const unsigned event = press.mask & MaskAt(setup_.clearByOne, press.offset);
    if (time_.Now() >= press.from_us && latched_.insert(&press).second) {
      setup_.registers[press.offset] = static_cast<std::uint8_t>(Latch(press.offset) | event);
    }
  }
  for (std::size_t i = 0; i < setup_.bolts.size(); ++i) {
    const PortBolt& bolt = setup_.bolts[i];
    if (moving_[i] && time_.Now() >= moving_[i]->end) {
      std::uint8_t& level = setup_.registers[bolt.level];
      level = static_cast<std::uint8_t>(moving_[i]->unlocks ? level | bolt.unlocked : level & ~bolt.unlocked);
      std::uint8_t& command = setup_.registers[bolt.command];
      command = static_cast<std::uint8_t>(command & ~(bolt.lock | bolt.unlock));
      moving_[i].reset();
    }
  }
}

std::optional<Microseconds> PortRegisters::UnderWayUntil() const {
  std::optional<Microseconds> next;
  for (const std::optional<Move>& move : moving_) {
    if (move) {
      next = std::min(next.value_or(move->end), move->end);
    }
  }
  return next;
}

// A bolt that is told to go both ways, or is under way, stays with what it does.
void PortRegisters::StartBolts(std::uint16_t offset, std::uint8_t value) {
  for (std::size_t i = 0; i < setup_.bolts.size(); ++i) {
    const PortBolt& bolt = setup_.bolts[i];
    const bool locks = (value & bolt.lock) != 0;
    const bool unlocks = (value & bolt.unlock) != 0;
    if (offset == bolt.command && locks != unlocks && !moving_[i]) {
      moving_[i] = Move{time_.Now() + bolt.move_us, unlocks};
    }
  }
}

void PortRegisters::WritePort(std::uint16_t port, std::uint8_t value) {
  Advance();
  const auto offset = static_cast<std::uint16_t>(port - setup_.base);
  const unsigned before = Latch(offset);
  const unsigned events = MaskAt(setup_.clearByOne, offset);
  unsigned kept = events | MaskAt(setup_.readOnly, offset);
  if (const PortLines* const lines = LinesAt(offset)) {
    kept |= ~unsigned{Outputs(*lines, static_cast<unsigned>(offset - lines->level))};
  }
  setup_.registers[offset] = static_cast<std::uint8_t>((value & ~kept) | (before & kept & ~(value & events)));
  if ((value & MaskAt(setup_.lasting, offset)) != 0) {
    clearedAt_[offset] = time_.Now();
  }
  StartBolts(offset, value);
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
    unsigned own = MaskAt(setup_.lasting, offset);
    for (const PortPress& press : setup_.presses) {
      own |= press.offset == offset ? press.mask : 0U;
    }
    char line[32];
    std::snprintf(line, sizeof line, "port %04X = %02X\n", static_cast<unsigned>(setup_.base) + offset, value & ~own);
    text += line;
  }
  return text;
}

}  // namespace panelglow::platform::sim
