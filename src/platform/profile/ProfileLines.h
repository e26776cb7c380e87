// The lines of an INI file's text, by the rules of the platform's profile services; shared by what looks values up
// and what outlines a text.
#pragma once

#include <algorithm>
#include <cstddef>
#include <optional>
#include <string_view>

namespace panelglow::platform::profile::lines {

template <class Char>
using View = std::basic_string_view<Char>;

template <class Char>
constexpr Char kBlanks[] = {Char(' '), Char('\t'), Char(0)};

template <class Char>
constexpr bool IsBlank(Char c) {
  return c == Char(' ') || c == Char('\t');
}

template <class Char>
constexpr bool IsLineEnd(Char c) {
  return c == Char('\n') || c == Char('\r');
}

template <class Char>
constexpr Char Lower(Char c) {
  return c >= Char('A') && c <= Char('Z') ? static_cast<Char>(c + 32) : c;
}

template <class Char>
bool SameName(View<Char> a, View<Char> b) {
  return a.size() == b.size() &&
         std::equal(a.begin(), a.end(), b.begin(), [](Char x, Char y) { return Lower(x) == Lower(y); });
}

template <class Char>
View<Char> TrimBlanks(View<Char> text) {
  while (!text.empty() && IsBlank(text.front())) {
    text.remove_prefix(1);
  }
  while (!text.empty() && IsBlank(text.back())) {
    text.remove_suffix(1);
  }
  return text;
}

// What stands before the first NUL.
template <class Char>
View<Char> BeforeNul(View<Char> text) {
  return text.substr(0, text.find(Char(0)));
}

// End of the line that contains `at`: the position of its line end, or the text's end.
template <class Char>
std::size_t LineEnd(View<Char> text, std::size_t at) {
  const std::size_t feed = std::min(text.find(Char('\n'), at), text.size());
  const std::size_t carriage = text.substr(at, feed - at).find(Char('\r'));
  return carriage == View<Char>::npos ? feed : at + carriage;
}

// Begin of the line behind the line end at `end`; CR LF is one line end.
template <class Char>
std::size_t NextLine(View<Char> text, std::size_t end) {
  if (end < text.size() && text[end] == Char('\r') && end + 1 < text.size() && text[end + 1] == Char('\n')) {
    return end + 2;
  }
  return std::min(end + 1, text.size());
}

template <class Char>
struct Header {
  std::size_t line = 0;  // where the header's line begins
  std::size_t body = 0;  // where the line behind it begins
  View<Char> name;
};

// The first section header at or behind `from`, which is the begin of a line.
template <class Char>
std::optional<Header<Char>> NextHeader(View<Char> text, std::size_t from) {
  for (std::size_t bracket = text.find(Char('['), from); bracket != View<Char>::npos;
       bracket = text.find(Char('['), bracket + 1)) {
    std::size_t line = bracket;
    while (line > from && IsBlank(text[line - 1])) {
      --line;
    }
    if (line > from && !IsLineEnd(text[line - 1])) {
      continue;  // not the first character of its line
    }
    const std::size_t end = LineEnd(text, bracket);
    const std::size_t close = text.substr(0, end).find(Char(']'), bracket);
    if (close != View<Char>::npos) {
      return Header<Char>{line, NextLine(text, end),
                          TrimBlanks(BeforeNul(text.substr(bracket + 1, close - bracket - 1)))};
    }
  }
  return std::nullopt;
}

template <class Char>
struct Section {
  std::size_t header = 0;
  std::size_t body = 0;
  std::size_t end = 0;  // begin of the next header's line, or the text's end
};

template <class Char>
std::optional<Section<Char>> FindSection(View<Char> text, View<Char> name) {
  const View<Char> wanted = TrimBlanks(name);
  for (std::optional<Header<Char>> header = NextHeader(text, 0); header; header = NextHeader(text, header->body)) {
    if (SameName(header->name, wanted)) {
      const std::optional<Header<Char>> next = NextHeader(text, header->body);
      return Section<Char>{header->line, header->body, next ? next->line : text.size()};
    }
  }
  return std::nullopt;
}

template <class Char>
struct Line {
  std::size_t begin = 0;
  std::size_t end = 0;                    // position of the line end
  std::size_t next = 0;                   // begin of the next line
  View<Char> content;                     // up to a NUL, without blanks around it
  std::size_t equals = View<Char>::npos;  // in content

  [[nodiscard]] View<Char> Key() const { return TrimBlanks(content.substr(0, equals)); }
  [[nodiscard]] View<Char> Value() const { return TrimBlanks(content.substr(equals + 1)); }
  [[nodiscard]] bool IsEntry() const { return equals != View<Char>::npos; }
};

// Calls `use` with each line of [begin, end) that is neither blank nor a comment, until it returns true.
template <class Char, class Use>
void EachLine(View<Char> text, std::size_t begin, std::size_t end, Use use) {
  for (std::size_t at = begin; at < end;) {
    Line<Char> line;
    line.begin = at;
    line.end = std::min(LineEnd(text, at), end);
    line.next = NextLine(text, line.end);
    line.content = TrimBlanks(BeforeNul(text.substr(at, line.end - at)));
    at = line.next;
    if (line.content.empty() || line.content.front() == Char(';')) {
      continue;
    }
    line.equals = line.content.find(Char('='));
    if (use(line)) {
      return;
    }
  }
}

}  // namespace panelglow::platform::profile::lines
