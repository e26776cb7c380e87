// Lists whose numbers count from 1 and come from files, and what the generic classes say of a number beyond them.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "board/base/mblib_exception.h"

namespace panelglow {

/// The entry of a list whose numbers count from 1. Throws mblib_exception with `textBefore`, the number, " (must be
/// 1..", the count and `textBehind` when there is none.
template <class Number>
Number EntryOf(const std::vector<Number>& list, int number, const std::string& textBefore, const char* textBehind) {
  if (number < 1 || static_cast<std::size_t>(number) > list.size()) {
    throw mblib_exception(textBefore + std::to_string(number) + " (must be 1.." + std::to_string(list.size()) +
                          textBehind);
  }
  return list[static_cast<std::size_t>(number) - 1];
}

// What the generic families say of a number that is out of range.
template <class Number>
Number FanTachEntry(const std::vector<Number>& list, int fan) {
  return EntryOf(list, fan, "read fan tach: invalid fan index ", " +1)");
}
template <class Number>
Number FanPwmEntry(const std::vector<Number>& list, int fan) {
  return EntryOf(list, fan, "set fan PWM: invalid pwm index ", ")");
}
template <class Number>
Number TemperatureEntry(const std::vector<Number>& list, int zone) {
  return EntryOf(list, zone, "read temperature: invalid zone ", " +1)");
}
template <class Number>
Number LowLimitEntry(const std::vector<Number>& list, int zone) {
  return EntryOf(list, zone, "read low limit temperature: invalid zone ", " +1)");
}

}  // namespace panelglow
