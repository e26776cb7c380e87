// What the XML parser has to know of a byte.
#pragma once

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <string_view>

namespace panelglow {

// Classes of the 256 byte values. Each of the last five is what a run of that kind cannot simply go over; NUL, which
// stands behind the text, ends all of them.
inline constexpr std::uint8_t kXmlCharacter = 1;  // 0x09, 0x0A, 0x0D, 0x20 to 0xFE
inline constexpr std::uint8_t kNoNameStart = 2;   // a digit or a punctuation character
inline constexpr std::uint8_t kStopsValue = 4;
inline constexpr std::uint8_t kStopsText = 8;
inline constexpr std::uint8_t kStopsTagName = 16;
inline constexpr std::uint8_t kStopsAttributeName = 32;
inline constexpr std::uint8_t kStopsBlanks = 64;  // all but white space

constexpr std::array<std::uint8_t, 256> MakeXmlClasses() {
  std::array<std::uint8_t, 256> classes{};
  for (unsigned c = 0; c < 256; ++c) {
    const auto isOneOf = [&](std::string_view set) {
      return set.find(static_cast<char>(c)) != std::string_view::npos;
    };
    const bool letter = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
    const bool xmlCharacter = isOneOf("\t\n\r") || (c >= 0x20 && c <= 0xFE);
    const auto add = [&](std::uint8_t bit, bool wanted) {
      classes[c] = static_cast<std::uint8_t>(classes[c] | (wanted ? bit : 0U));
    };
    add(kXmlCharacter, xmlCharacter);
    add(kNoNameStart, c > 0x20 && c < 0x7F && !letter);
    add(kStopsValue, isOneOf("<>-&\"'") || !xmlCharacter);
    add(kStopsText, isOneOf("<>-") || c == 0);
    add(kStopsTagName, isOneOf("<>-/ \t\n\r") || c == 0);
    add(kStopsAttributeName, isOneOf("<>-= \t\n\r") || c == 0);
    add(kStopsBlanks, !isOneOf(" \t\n\r"));
  }
  return classes;
}
inline constexpr std::array<std::uint8_t, 256> kXmlClasses = MakeXmlClasses();

constexpr bool HasXmlClass(char c, std::uint8_t wanted) {
  return (kXmlClasses[static_cast<std::uint8_t>(c)] & wanted) != 0;
}

/// The first character from `here` on that is of one of the classes `stops`, which NUL is in.
inline const char* FindXmlClass(const char* here, std::uint8_t stops) {
  // Four characters a step: nearly all of a text is gone over here.
  for (;; here += 4) {
    for (int i = 0; i < 4; ++i) {
      if (HasXmlClass(here[i], stops)) {
        return here + i;
      }
    }
  }
}

/// White space in the parser's sense.
constexpr bool IsXmlSpace(char c) { return !HasXmlClass(c, kStopsBlanks); }

/// The part of `text` before its first byte that is no XML character.
inline std::string_view XmlCharactersOf(std::string_view text) {
  const auto bad = std::find_if(text.begin(), text.end(), [](char c) { return !HasXmlClass(c, kXmlCharacter); });
  return text.substr(0, static_cast<std::size_t>(bad - text.begin()));
}

}  // namespace panelglow
