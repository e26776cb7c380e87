// What a chip's fans are, as registers of its hardware monitor. Fans count from `firstFan`.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "board/parts/Step.h"

namespace panelglow {

/// Two registers that make a word, in the order in which they are read.
struct RegisterPair {
  RegisterId first;
  RegisterId second;
};

/// `count` pairs of neighbours, from the register `first` on, one every `stride` registers.
inline std::vector<RegisterPair> RegisterPairs(std::uint8_t place, std::uint8_t first, std::size_t count,
                                               std::size_t stride = 2) {
  std::vector<RegisterPair> pairs;
  for (std::size_t i = 0; i < count; ++i) {
    const auto reg = static_cast<std::uint8_t>(first + stride * i);
    pairs.push_back({{place, reg}, {place, static_cast<std::uint8_t>(reg + 1)}});
  }
  return pairs;
}

/// Which of a pair's registers comes first.
enum class PairOrder : std::uint8_t { kLowFirst, kHighFirst };

struct FanTable {
  int firstFan = 1;
  std::vector<RegisterPair> tachs = {};
  PairOrder tachOrder = PairOrder::kLowFirst;
  std::uint32_t tachOverflow = 0xFFFF;         // a count from here on is given as 0xFFFF: the fan stands
  std::string badTachText = {};                // to standard output for a fan without a row; "%d" is its number
  std::vector<RegisterId> duties = {};         // duty cycle, 0 to 255
  std::string badDutyText = {};                // as badTachText
  std::optional<std::uint8_t> fullSpeed = {};  // duty; nothing: the class has no full speed
  std::vector<RegisterId> saved = {};
  std::vector<RegisterId> restored = {};  // in this order; empty: as saved
  Steps manual = {};                      // takes the fans over
  std::uint32_t restoreWait_ms = 0;       // behind a restore, for the part to take its fans back
};

}  // namespace panelglow
