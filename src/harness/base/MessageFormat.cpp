#include "harness/base/MessageFormat.h"

#include <algorithm>
#include <optional>
#include <type_traits>

namespace panelglow {

namespace {

template <class Char>
using View = std::basic_string_view<Char>;

template <class Char>
bool IsOneOf(Char c, std::string_view set) {
  return static_cast<std::make_unsigned_t<Char>>(c) < 0x80U &&
         set.find(static_cast<char>(c)) != std::string_view::npos;
}

// A conversion behind its percent sign.
struct Conversion {
  bool left = false;
  bool zero = false;
  std::size_t width = 0;
  std::optional<std::size_t> precision;
};

// Reads a number; whatever its digits say, it is no larger than the longest result.
template <class Char>
std::size_t ReadNumber(View<Char> format, std::size_t& at) {
  std::size_t number = 0;
  while (at < format.size() && IsOneOf(format[at], "0123456789")) {
    number = std::min(kLongestMessage, number * 10 + static_cast<std::size_t>(format[at] - Char('0')));
    ++at;
  }
  return number;
}

template <class Char>
Conversion ReadConversion(View<Char> format, std::size_t& at) {
  Conversion conversion;
  while (at < format.size() && IsOneOf(format[at], "-#0")) {
    conversion.left = conversion.left || format[at] == Char('-');
    conversion.zero = conversion.zero || format[at] == Char('0');
    ++at;
  }
  conversion.width = ReadNumber(format, at);
  if (at < format.size() && format[at] == Char('.')) {
    ++at;
    conversion.precision = ReadNumber(format, at);
  }
  while (at < format.size() && IsOneOf(format[at], "hlw")) {
    ++at;
  }
  return conversion;
}

template <class Char>
void AppendPadded(std::basic_string<Char>& out, View<Char> text, const Conversion& conversion) {
  text = text.substr(0, conversion.precision.value_or(text.size()));
  const std::size_t missing = conversion.width > text.size() ? conversion.width - text.size() : 0;
  const std::basic_string<Char> padding(missing, conversion.zero && !conversion.left ? Char('0') : Char(' '));
  if (!conversion.left) {
    out += padding;
  }
  out += text;
  if (conversion.left) {
    out += padding;
  }
}

template <class Char>
std::basic_string<Char> Format(View<Char> format, View<Char> argument) {
  std::basic_string<Char> out;
  bool used = false;
  for (std::size_t at = 0; at < format.size() && out.size() < kLongestMessage;) {
    if (format[at] != Char('%')) {
      out += format[at++];
      continue;
    }
    const std::size_t percent = at++;
    const Conversion conversion = ReadConversion(format, at);
    if (at >= format.size()) {
      out += format.substr(percent);  // an unfinished conversion stands for itself
      break;
    }
    const Char letter = format[at++];
    if (IsOneOf(letter, "sS")) {
      if (!used) {
        AppendPadded(out, argument, conversion);
        used = true;
      }
    } else if (!IsOneOf(letter, "diuxXcCp")) {
      out += letter;  // "%%", and letters that are no conversion here
    }
  }
  out.resize(std::min(out.size(), kLongestMessage));
  return out;
}

}  // namespace

std::string FormatMessageText(std::string_view format, std::string_view argument) {
  return Format<char>(format, argument);
}

wstring FormatMessageText(std::u16string_view format, std::u16string_view argument) {
  return Format<char16_t>(format, argument);
}

}  // namespace panelglow
