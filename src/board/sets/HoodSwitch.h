// The switch that tells whether the machine's hood is open: as a line, and as a latch that remembers.
#pragma once

#include <cstdint>
#include <string>
#include <utility>

#include "board/sets/ChipFinder.h"
#include "board/sets/ReadSettings.h"

namespace panelglow {

class HoodSwitch {
 public:
  explicit HoodSwitch(ChipFinder finder) : chipOf(std::move(finder)) {}

  bool Load();

  /// What the line says, turned over where the files say so. False, and `value` stays, without a line that can be
  /// read.
  bool Read(bool& value);

  /// Whether the hood was opened; `clearFirst` makes the chip forget what was before. False, and `value` stays, when
  /// the files name no latch or the chip cannot tell.
  bool ReadLatch(bool clearFirst, bool& value);

 private:
  // How it is looked for.
  struct Line {
    std::string chip;
    LineSetting gpio;
    bool useOffset = false;  // offset and bit in place of the line
    std::uint32_t offset = 0;
    std::string bit;
    std::string clearBit;
    bool reversed = false;
  };

  // What remembers: a configuration bit, or a line.
  struct Latch {
    std::string chip;
    bool isConfigBit = false;
    std::uint8_t ldn = 0;
    std::uint8_t reg = 0;
    int bit = 0;
    LineSetting gpio;
    bool reversed = false;
  };

  ChipFinder chipOf;
  Line line;
  Latch latch;
};

}  // namespace panelglow
