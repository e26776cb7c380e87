// The forms in which the files give the settings of fans, zones and devices.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "board/base/Setting.h"
#include "board/sets/ChipFinder.h"

namespace panelglow {

/// True for the word `word`, else false; people are told of a word that is neither it nor its opposite.
bool ReadWord(const std::string& key, const char* word, const char* opposite);

/// "yes" is true, "no" false; `otherwise` without the key, and for other words, of which people are told.
bool ReadYesNo(const std::string& key, bool otherwise);

/// Whether a key that switches something off says "no".
bool SaysNo(const std::string& key);

/// Whether a chip is one that the board has: neither the plain chip nor "none".
bool IsThere(const Chip& chip);

/// A chip's name; people are told when the board has no such chip, of the default one only when it `isNeeded`.
std::string ReadChipName(const std::string& key, const std::string& defaultName, const ChipFinder& chipOf,
                         bool isNeeded = false);

/// A duty of 0 to 100 percent; people are told of a number beyond them, which counts as the nearest.
int ReadPercent(const std::string& key, int defaultValue);

/// A wait that is given in seconds, in milliseconds; people are told of one that is none and counts as 0, or too
/// long.
std::uint32_t MillisecondsIn(std::int64_t seconds, const Setting& setting);

/// A line of a chip.
struct LineSetting {
  static constexpr int kNone = -1;

  int line = kNone;
  bool isSet = false;      // the key has a value, which is not kNone
  bool isSpecial = false;  // ... which is a word: "caseopen" or "intruder"
};
LineSetting ReadLineNumber(const std::string& key);

/// The numbers of a list, by commas and blanks; people are told of tokens that are none.
std::vector<int> NumbersIn(const Setting& list);

/// The wall clock's time for logs: "20260131 235959".
std::string TimeStamp();

}  // namespace panelglow
