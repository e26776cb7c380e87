// Texts from message files used as formats, with one string as their only argument. No text of a file can read or
// write memory, whatever it holds.
#pragma once

#include <string>
#include <string_view>

#include "platform/Text.h"

namespace panelglow {

/// The longest result, in characters.
inline constexpr std::size_t kLongestMessage = 1023;

/// Replaces the first string conversion (%s, %S, with flags, width and precision) by `argument`. Further conversions
/// of any known kind print nothing, "%%" prints a percent sign, any other letter behind a percent sign prints itself.
std::string FormatMessageText(std::string_view format, std::string_view argument);
wstring FormatMessageText(std::u16string_view format, std::u16string_view argument);

}  // namespace panelglow
