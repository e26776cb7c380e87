// GPIO lines: which register and bit a line's number stands for, and what its level is called.
#pragma once

#include <cstdint>
#include <optional>
#include <span>

namespace panelglow {

// States of a line.
constexpr int kLineAsserted = 3;
constexpr int kLineNotAsserted = 4;
constexpr int kNoSuchLineState = -1;

constexpr int LineState(bool isSet) { return isSet ? kLineAsserted : kLineNotAsserted; }

/// Lines `first` to `last`, one bit each from `firstBit` on.
struct LineRange {
  int first;
  int last;
  std::uint16_t place;  // register, port or offset, as the part has it
  unsigned firstBit = 0;
};

struct LinePlace {
  std::uint16_t place;
  std::uint32_t mask;
  bool operator==(const LinePlace&) const = default;
};

/// Nothing for a line that the part does not have.
constexpr std::optional<LinePlace> FindLine(std::span<const LineRange> ranges, int line) {
  for (const LineRange& range : ranges) {
    if (line >= range.first && line <= range.last) {
      return LinePlace{range.place, 1U << (range.firstBit + static_cast<unsigned>(line - range.first))};
    }
  }
  return std::nullopt;
}

}  // namespace panelglow
