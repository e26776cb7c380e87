#include "harness/base/CDMUtil.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <iomanip>
#include <limits>
#include <sstream>

#include "platform/Host.h"

namespace panelglow::CDMUtil {

namespace {

constexpr std::string_view kBlanks = " \b\f\n\r\t\v";
constexpr std::size_t kLongestPath = 260;

template <class Char>
constexpr Char LowerOf(Char c) {
  return c >= 'A' && c <= 'Z' ? static_cast<Char>(c + ('a' - 'A')) : c;
}

template <class Char>
constexpr Char UpperOf(Char c) {
  return c >= 'a' && c <= 'z' ? static_cast<Char>(c - ('a' - 'A')) : c;
}

constexpr bool IsDigit(char c) { return c >= '0' && c <= '9'; }

constexpr bool IsHexDigit(char c) { return IsDigit(c) || (LowerOf(c) >= 'a' && LowerOf(c) <= 'f'); }

template <class Value>
std::string Streamed(Value value) {
  std::ostringstream stream;
  stream.imbue(std::locale::classic());
  stream << value;
  return stream.str();
}

// The number of a text of either form. A value out of range becomes the nearest one of the type, as a stream gives
// it; a negative text read into an unsigned type wraps, as a stream does it.
template <class Value>
Value NumberOf(std::string_view text) {
  const bool hexadecimal = IsHexadecimal(text);
  if (!hexadecimal && !IsDecimal(text)) {
    return 0;
  }
  const bool negative = text.front() == '-';
  std::string_view digits = text.substr(negative ? 1 : 0);
  digits.remove_prefix(hexadecimal ? 2 : 0);
  std::uint64_t magnitude = 0;
  const auto [end, error] =
      std::from_chars(digits.data(), digits.data() + digits.size(), magnitude, hexadecimal ? 16 : 10);
  if (error == std::errc::result_out_of_range) {
    magnitude = std::numeric_limits<std::uint64_t>::max();
  }
  using Limits = std::numeric_limits<Value>;
  if constexpr (std::is_signed_v<Value>) {
    const auto largest = static_cast<std::uint64_t>(Limits::max());
    if (negative) {
      return magnitude > largest ? Limits::min() : static_cast<Value>(-static_cast<std::int64_t>(magnitude));
    }
    return magnitude > largest ? Limits::max() : static_cast<Value>(magnitude);
  } else {
    if (magnitude > Limits::max()) {
      return Limits::max();
    }
    const auto value = static_cast<Value>(magnitude);
    return negative ? static_cast<Value>(0 - value) : value;
  }
}

}  // namespace

std::string ToUpper(std::string_view text) {
  std::string result(text);
  std::transform(result.begin(), result.end(), result.begin(), UpperOf<char>);
  return result;
}

std::string ToLower(std::string_view text) {
  std::string result(text);
  std::transform(result.begin(), result.end(), result.begin(), LowerOf<char>);
  return result;
}

wstring ToUpper(std::u16string_view text) {
  wstring result(text);
  std::transform(result.begin(), result.end(), result.begin(), UpperOf<char16_t>);
  return result;
}

wstring ToLower(std::u16string_view text) {
  wstring result(text);
  std::transform(result.begin(), result.end(), result.begin(), LowerOf<char16_t>);
  return result;
}

bool EqualIgnoreCase(std::string_view left, std::string_view right) {
  return std::equal(left.begin(), left.end(), right.begin(), right.end(),
                    [](char a, char b) { return LowerOf(a) == LowerOf(b); });
}

std::string Trim(std::string_view text) {
  const std::size_t first = text.find_first_not_of(kBlanks);
  if (first == std::string_view::npos) {
    return {};
  }
  return std::string(text.substr(first, text.find_last_not_of(kBlanks) - first + 1));
}

void ReplaceAll(std::string& text, std::string_view from, std::string_view to) {
  if (from.empty()) {
    return;
  }
  const bool bringsItBack = to.find(from) != std::string_view::npos;
  for (std::size_t at = text.find(from); at != std::string::npos;) {
    text.replace(at, from.size(), to);
    at = text.find(from, bringsItBack ? at + to.size() : 0);
  }
}

void Split(std::string_view text, std::vector<std::string>& out, std::string_view separators) {
  std::size_t at = text.find_first_not_of(separators);
  while (at != std::string_view::npos) {
    const std::size_t end = std::min(text.find_first_of(separators, at), text.size());
    out.emplace_back(text.substr(at, end - at));
    at = text.find_first_not_of(separators, end);
  }
}

std::string OnOneLine(std::string_view text) {
  std::string line;
  line.reserve(text.size());
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '\r' && i + 1 < text.size() && text[i + 1] == '\n') {
      ++i;
    }
    line += text[i] == '\r' || text[i] == '\n' ? ' ' : text[i];
  }
  return line;
}

wstring ToWString(std::string_view text) {
  wstring wide;
  wide.reserve(text.size());
  for (const char c : text) {
    wide.push_back(static_cast<unsigned char>(c));
  }
  return wide;
}

std::string ToString(std::u16string_view text) {
  std::string narrow;
  for (const char16_t c : text) {
    if (c == 0 || c > 0xFF) {
      break;
    }
    narrow.push_back(static_cast<char>(static_cast<unsigned char>(c)));
  }
  return narrow;
}

std::string ToString(int value) { return std::to_string(value); }
std::string ToString(unsigned int value) { return std::to_string(value); }
std::string ToString(unsigned long value) { return std::to_string(value); }
std::string ToString(long value) { return std::to_string(value); }
std::string ToString(long long value) { return std::to_string(value); }
std::string ToString(unsigned long long value) { return std::to_string(value); }
std::string ToString(double value) { return Streamed(value); }
std::string ToString(bool value) { return value ? "true" : "false"; }

std::string ToHexString(int value) {
  std::array<char, 16> digits{};
  const auto [end, error] =
      std::to_chars(digits.data(), digits.data() + digits.size(), static_cast<unsigned int>(value), 16);
  return {digits.data(), end};
}

bool IsDecimal(std::string_view text) {
  if (text.empty()) {
    return false;
  }
  return std::all_of(text.begin() + (text.front() == '-' ? 1 : 0), text.end(), IsDigit);
}

bool IsHexadecimal(std::string_view text) {
  if (text.starts_with('-')) {
    text.remove_prefix(1);
  }
  return text.size() > 2 && text[0] == '0' && (text[1] == 'x' || text[1] == 'X') &&
         std::all_of(text.begin() + 2, text.end(), IsHexDigit);
}

bool IsInteger(std::string_view text) { return IsDecimal(text) || IsHexadecimal(text); }

bool IsBoolean(std::string_view text) { return EqualIgnoreCase(text, "true") || EqualIgnoreCase(text, "false"); }

bool IsDouble(std::string_view text) {
  if (!text.empty() && (text.front() == '-' || text.front() == '+')) {
    text.remove_prefix(1);
    if (text.empty() || !IsDigit(text.front())) {
      return false;
    }
  }
  const std::size_t point = text.find('.');
  const std::string_view whole = text.substr(0, point);
  const std::string_view fraction = point == std::string_view::npos ? "0" : text.substr(point + 1);
  return (!whole.empty() || point != std::string_view::npos) && !fraction.empty() &&
         std::all_of(whole.begin(), whole.end(), IsDigit) && std::all_of(fraction.begin(), fraction.end(), IsDigit);
}

int ToInt(std::string_view text) { return NumberOf<std::int32_t>(text); }
long ToLong(std::string_view text) { return NumberOf<std::int32_t>(text); }
std::uint32_t ToUnsignedLong(std::string_view text) { return NumberOf<std::uint32_t>(text); }

// Hexadecimal digits are the bits of the number: 0xFFFFFFFFFFFFFFFF is -1.
std::int64_t ToInt64(std::string_view text) {
  return IsHexadecimal(text) ? static_cast<std::int64_t>(NumberOf<std::uint64_t>(text))
                             : NumberOf<std::int64_t>(text);
}

std::string EscapeXml(std::string_view text) {
  std::string escaped;
  escaped.reserve(text.size());
  for (const char c : text) {
    switch (static_cast<unsigned char>(c)) {
      case '\'':
      case '`':
      case 146:
        escaped += "&apos;";
        break;
      case '"':
      case 147:
      case 148:
        escaped += "&quot;";
        break;
      case '>':
        escaped += "&gt;";
        break;
      case '<':
        escaped += "&lt;";
        break;
      case '&':
        escaped += "&amp;";
        break;
      default:
        escaped += c;
        break;
    }
  }
  return escaped;
}

std::string EscapeXmlStrict(std::string_view text) {
  constexpr std::string_view kKeptControls = "\b\f\n\r\t\v";
  std::string printable(text);
  for (char& c : printable) {
    const auto byte = static_cast<unsigned char>(c);
    const bool control = byte < 0x20 || byte == 0x7F;
    if (byte >= 0x80 || (control && kKeptControls.find(c) == std::string_view::npos)) {
      c = '.';
    }
  }
  return Trim(EscapeXml(printable));
}

bool FileExists(std::string_view path) { return !path.empty() && platform::TheHost().files.CanRead(path); }

bool ReadFile(std::string_view path, std::string& text) {
  std::optional<std::string> content = path.empty() ? std::nullopt : platform::TheHost().files.Read(path);
  if (!content) {
    return false;
  }
  content->resize(std::min(content->find('\0'), content->size()));
  text = std::move(*content);
  return true;
}

std::string CurrentDirectoryPath() {
  std::string path = platform::TheHost().files.CurrentDirectory();
  return path.size() > kLongestPath ? std::string() : path;
}

std::string FormatTime(std::time_t seconds) {
  const std::tm parts = platform::TheHost().clock.LocalTime(seconds);
  std::ostringstream text;
  text << std::put_time(&parts, "%m/%d/%Y %H:%M:%S");
  return text.str();
}

}  // namespace panelglow::CDMUtil
