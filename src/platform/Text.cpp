#include "platform/Text.h"

#include <array>
#include <cstdint>

namespace panelglow::platform {

namespace {

constexpr char32_t kReplacement = 0xFFFD;

// Code page 1252, bytes 0x80 to 0x9F; the five unassigned bytes stand for themselves. All others are Latin-1.
constexpr std::array<char16_t, 32> kCodePageHigh{0x20AC, 0x0081, 0x201A, 0x0192, 0x201E, 0x2026, 0x2020, 0x2021,
                                                 0x02C6, 0x2030, 0x0160, 0x2039, 0x0152, 0x008D, 0x017D, 0x008F,
                                                 0x0090, 0x2018, 0x2019, 0x201C, 0x201D, 0x2022, 0x2013, 0x2014,
                                                 0x02DC, 0x2122, 0x0161, 0x203A, 0x0153, 0x009D, 0x017E, 0x0178};

// Reads one character at `at` and moves behind it.
char32_t DecodeUtf8(std::string_view text, std::size_t& at) {
  const auto lead = static_cast<std::uint8_t>(text[at++]);
  if (lead < 0x80) {
    return lead;
  }
  const int extra = lead >= 0xF0 && lead < 0xF5 ? 3 : lead >= 0xE0 ? 2 : lead >= 0xC2 ? 1 : 0;
  if (extra == 0 || lead >= 0xF5) {
    return kReplacement;
  }
  char32_t value = lead & (0x3FU >> static_cast<unsigned>(extra));
  std::size_t next = at;
  for (int i = 0; i < extra; ++i, ++next) {
    if (next >= text.size() || (static_cast<std::uint8_t>(text[next]) & 0xC0U) != 0x80) {
      return kReplacement;
    }
    value = value << 6U | (static_cast<std::uint8_t>(text[next]) & 0x3FU);
  }
  constexpr std::array<char32_t, 4> kSmallest{0, 0x80, 0x800, 0x10000};
  if (value < kSmallest[static_cast<std::size_t>(extra)] || value > 0x10FFFF || (value >= 0xD800 && value < 0xE000)) {
    return kReplacement;
  }
  at = next;
  return value;
}

void AppendUtf8(std::string& out, char32_t c) {
  const auto add = [&](char32_t byte) { out.push_back(static_cast<char>(static_cast<std::uint8_t>(byte))); };
  if (c < 0x80) {
    add(c);
  } else if (c < 0x800) {
    add(0xC0 | c >> 6U);
    add(0x80 | (c & 0x3F));
  } else if (c < 0x10000) {
    add(0xE0 | c >> 12U);
    add(0x80 | (c >> 6U & 0x3F));
    add(0x80 | (c & 0x3F));
  } else {
    add(0xF0 | c >> 18U);
    add(0x80 | (c >> 12U & 0x3F));
    add(0x80 | (c >> 6U & 0x3F));
    add(0x80 | (c & 0x3F));
  }
}

}  // namespace

wstring WideFromUtf8(std::string_view text) {
  wstring wide;
  wide.reserve(text.size());
  for (std::size_t at = 0; at < text.size();) {
    const char32_t c = DecodeUtf8(text, at);
    if (c < 0x10000) {
      wide.push_back(static_cast<char16_t>(c));
    } else {
      wide.push_back(static_cast<char16_t>(0xD800 + ((c - 0x10000) >> 10U)));
      wide.push_back(static_cast<char16_t>(0xDC00 + ((c - 0x10000) & 0x3FF)));
    }
  }
  return wide;
}

std::string Utf8FromWide(std::u16string_view text) {
  std::string narrow;
  narrow.reserve(text.size());
  for (std::size_t at = 0; at < text.size(); ++at) {
    char32_t c = text[at];
    if (c >= 0xD800 && c < 0xE000) {
      const bool pair = c < 0xDC00 && at + 1 < text.size() && text[at + 1] >= 0xDC00 && text[at + 1] < 0xE000;
      c = pair ? 0x10000 + ((c - 0xD800) << 10U) + (text[at + 1] - 0xDC00U) : kReplacement;
      at += pair ? 1 : 0;
    }
    AppendUtf8(narrow, c);
  }
  return narrow;
}

wstring WideFromCodePage(std::string_view bytes) {
  wstring wide;
  wide.reserve(bytes.size());
  for (const char c : bytes) {
    const auto byte = static_cast<std::uint8_t>(c);
    wide.push_back(byte >= 0x80 && byte < 0xA0 ? kCodePageHigh[byte - 0x80U] : static_cast<char16_t>(byte));
  }
  return wide;
}

std::string CodePageFromWide(std::u16string_view text) {
  std::string bytes;
  bytes.reserve(text.size());
  for (const char16_t c : text) {
    if (c < 0x80 || (c >= 0xA0 && c < 0x100)) {
      bytes.push_back(static_cast<char>(static_cast<std::uint8_t>(c)));
      continue;
    }
    char byte = '?';
    for (std::size_t i = 0; i < kCodePageHigh.size(); ++i) {
      if (kCodePageHigh[i] == c) {
        byte = static_cast<char>(static_cast<std::uint8_t>(0x80 + i));
      }
    }
    bytes.push_back(byte);
  }
  return bytes;
}

}  // namespace panelglow::platform
