#include "platform/profile/ProfileText.h"

#include <algorithm>
#include <set>

namespace panelglow::platform::profile {

namespace {

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

template <class Char>
View<Char> WithoutQuotes(View<Char> value) {
  const bool quoted = value.size() >= 2 && value.front() == value.back() &&
                      (value.front() == Char('"') || value.front() == Char('\''));
  return quoted ? value.substr(1, value.size() - 2) : value;
}

// An empty name would end the list.
template <class Char>
void AppendName(std::basic_string<Char>& list, View<Char> name) {
  if (!name.empty()) {
    list.append(name).push_back(Char(0));
  }
}

template <class Char>
std::basic_string<Char> LineBreakOf(View<Char> text) {
  const std::size_t end = LineEnd(text, 0);
  if (end < text.size() && text[end] == Char('\n')) {
    return {Char('\n')};
  }
  return {Char('\r'), Char('\n')};
}

template <class Char>
using Entry = std::pair<std::basic_string<Char>, std::basic_string<Char>>;

template <class Char>
std::basic_string<Char> Lowered(View<Char> name) {
  std::basic_string<Char> lowered(name);
  std::transform(lowered.begin(), lowered.end(), lowered.begin(), Lower<Char>);
  return lowered;
}

// Whether an entry is one line that is read back as this key with this value.
template <class Char>
bool IsOneLine(const Entry<Char>& entry) {
  constexpr Char kEnds[] = {Char('\n'), Char('\r'), Char(0)};
  const View<Char> ends(kEnds, std::size(kEnds));
  const View<Char> key = TrimBlanks(View<Char>(entry.first));
  return !key.empty() && key.front() != Char(';') && key.front() != Char('[') &&
         key.find(Char('=')) == View<Char>::npos && key.find_first_of(ends) == View<Char>::npos &&
         View<Char>(entry.second).find_first_of(ends) == View<Char>::npos;
}

// The text with `lines` behind the last line of the section, which is there.
template <class Char>
std::basic_string<Char> WithLines(View<Char> text, View<Char> section, View<Char> lines) {
  const Section<Char> found = FindSection(text, section).value();
  std::size_t behindLast = found.body;
  EachLine(text, found.body, found.end, [&](const Line<Char>& line) {
    behindLast = line.next;
    return false;
  });
  std::basic_string<Char> result(text.substr(0, behindLast));
  if (!result.empty() && !IsLineEnd(result.back())) {
    result += LineBreakOf(text);
  }
  return result.append(lines).append(text.substr(behindLast));
}

}  // namespace

template <class Char>
std::optional<View<Char>> FindValue(View<Char> text, View<Char> section, View<Char> key) {
  const std::optional<Section<Char>> found = FindSection(text, section);
  std::optional<View<Char>> value;
  if (found) {
    const View<Char> wanted = TrimBlanks(key);
    EachLine(text, found->body, found->end, [&](const Line<Char>& line) {
      if (line.IsEntry() && SameName(line.Key(), wanted)) {
        value = WithoutQuotes(line.Value());
      }
      return value.has_value();
    });
  }
  return value;
}

void VisitLines(std::string_view text, const std::function<void(const OutlineLine&)>& visit) {
  std::size_t number = 1;
  std::size_t counted = 0;  // lines up to here are in `number`
  const auto numberOf = [&](std::size_t line) {
    while (counted < line) {
      counted = NextLine(text, LineEnd(text, counted));
      ++number;
    }
    return number;
  };
  const auto columnOf = [](std::size_t line, const char* at, std::string_view all) {
    return static_cast<std::size_t>(at - all.data()) - line + 1;
  };
  const auto lines = [&](std::size_t begin, std::size_t end) {
    EachLine(text, begin, end, [&](const Line<char>& line) {
      OutlineLine outline;
      outline.number = numberOf(line.begin);
      outline.column = columnOf(line.begin, line.content.data(), text);
      outline.isEntry = line.IsEntry();
      outline.name = line.IsEntry() ? line.Key() : line.content;
      outline.line = text.substr(line.begin, line.end - line.begin);
      if (line.IsEntry()) {
        outline.value = line.Value();
        outline.valueColumn = outline.value.empty() ? outline.column + line.equals + 1
                                                    : columnOf(line.begin, outline.value.data(), text);
      }
      visit(outline);
      return false;
    });
  };
  std::size_t body = 0;
  for (std::optional<Header<char>> header = NextHeader(text, 0); header; header = NextHeader(text, body)) {
    lines(body, header->line);
    OutlineLine outline;
    outline.number = numberOf(header->line);
    outline.column = text.find('[', header->line) - header->line + 1;
    outline.isHeader = true;
    outline.name = header->name;
    outline.line = text.substr(header->line, LineEnd(text, header->line) - header->line);
    visit(outline);
    body = header->body;
  }
  lines(body, text.size());
}

template <class Char>
std::basic_string<Char> SectionNames(View<Char> text) {
  std::basic_string<Char> names;
  for (std::optional<Header<Char>> header = NextHeader(text, 0); header; header = NextHeader(text, header->body)) {
    AppendName(names, header->name);
  }
  return names;
}

template <class Char>
std::basic_string<Char> KeyNames(View<Char> text, View<Char> section) {
  std::basic_string<Char> names;
  if (const std::optional<Section<Char>> found = FindSection(text, section)) {
    EachLine(text, found->body, found->end, [&](const Line<Char>& line) {
      if (line.IsEntry()) {
        AppendName(names, line.Key());
      }
      return false;
    });
  }
  return names;
}

template <class Char>
std::basic_string<Char> SectionLines(View<Char> text, View<Char> section) {
  std::basic_string<Char> lines;
  if (const std::optional<Section<Char>> found = FindSection(text, section)) {
    EachLine(text, found->body, found->end, [&](const Line<Char>& line) {
      if (line.IsEntry()) {
        lines.append(line.Key());
        lines.push_back(Char('='));
        lines.append(line.Value());
      } else {
        lines.append(line.content);
      }
      lines.push_back(Char(0));
      return false;
    });
  }
  return lines;
}

template <class Char>
std::basic_string<Char> WithValue(View<Char> text, View<Char> section, std::optional<View<Char>> key,
                                  std::optional<View<Char>> value) {
  std::basic_string<Char> result(text);
  const std::basic_string<Char> lineBreak = LineBreakOf(text);
  const std::optional<Section<Char>> found = FindSection(text, section);
  if (!key) {
    return found ? result.erase(found->header, found->end - found->header) : result;
  }
  std::basic_string<Char> entry;
  if (value) {
    entry.append(TrimBlanks(*key)).push_back(Char('='));
    entry.append(*value);
  }
  if (!found) {
    if (value) {
      if (!result.empty() && !IsLineEnd(result.back())) {
        result += lineBreak;
      }
      result.push_back(Char('['));
      result.append(TrimBlanks(section));
      result.push_back(Char(']'));
      result += lineBreak + entry + lineBreak;
    }
    return result;
  }
  std::optional<Line<Char>> old;
  std::size_t behindLast = found->body;
  EachLine(text, found->body, found->end, [&](const Line<Char>& line) {
    behindLast = line.next;
    if (line.IsEntry() && SameName(line.Key(), TrimBlanks(*key))) {
      old = line;
    }
    return old.has_value();
  });
  if (old && value) {
    // The key keeps its spelling and the blanks around it.
    const View<Char> rest = text.substr(text.find(Char('='), old->begin) + 1);
    const std::size_t blanks = std::min(rest.find_first_not_of(kBlanks<Char>), rest.size());
    const std::size_t from = std::min(text.size() - rest.size() + blanks, old->end);
    return result.replace(from, old->end - from, *value);
  }
  if (old) {
    return result.erase(old->begin, old->next - old->begin);
  }
  if (value) {
    if (behindLast > 0 && !IsLineEnd(result[behindLast - 1])) {
      entry = lineBreak + entry;
    }
    result.insert(behindLast, entry + lineBreak);
  }
  return result;
}

// The keys that a section has.
template <class Char>
static std::set<std::basic_string<Char>> LoweredKeys(View<Char> text, View<Char> section) {
  std::set<std::basic_string<Char>> keys;
  const std::basic_string<Char> names = KeyNames(text, section);
  for (std::size_t at = 0; at < names.size();) {
    const View<Char> name = BeforeNul(View<Char>(names).substr(at));
    keys.insert(Lowered(name));
    at += name.size() + 1;
  }
  return keys;
}

// New keys are collected and go in together; whatever else there is, is set one by one.
template <class Char>
std::basic_string<Char> WithValues(View<Char> text, View<Char> section,
                                   std::type_identity_t<std::span<const Entry<Char>>> entries) {
  std::basic_string<Char> result(text);
  std::basic_string<Char> fresh;
  std::set<std::basic_string<Char>> keys = LoweredKeys(text, section);
  bool exists = FindSection(text, section).has_value();
  const auto flush = [&] {
    if (!fresh.empty()) {
      result = WithLines<Char>(result, section, fresh);
      fresh.clear();
    }
  };
  for (const Entry<Char>& entry : entries) {
    const View<Char> key = TrimBlanks(View<Char>(entry.first));
    const bool isNew = keys.insert(Lowered(key)).second;
    if (exists && isNew && IsOneLine(entry)) {
      fresh.append(key).push_back(Char('='));
      fresh.append(entry.second).append(LineBreakOf<Char>(result));
    } else {
      flush();
      result = WithValue<Char>(result, section, View<Char>(entry.first), View<Char>(entry.second));
      exists = FindSection<Char>(result, section).has_value();
      if (!IsOneLine(entry)) {
        keys = LoweredKeys<Char>(result, section);  // it may be read back as any
      }
    }
  }
  flush();
  return result;
}

template <class Char>
std::size_t CopyText(View<Char> text, std::span<Char> buffer) {
  if (buffer.empty()) {
    return 0;
  }
  const std::size_t length = std::min(text.size(), buffer.size() - 1);
  std::copy_n(text.begin(), length, buffer.begin());
  buffer[length] = Char(0);
  return length;
}

template <class Char>
std::size_t CopyList(View<Char> list, std::span<Char> buffer) {
  if (buffer.size() < 2) {
    return CopyText(View<Char>(), buffer);
  }
  const std::size_t length = list.size() + 1 >= buffer.size() ? buffer.size() - 2 : list.size();
  std::copy_n(list.begin(), length, buffer.begin());
  buffer[length] = Char(0);
  if (length + 1 < buffer.size()) {
    buffer[length + 1] = Char(0);
  }
  return length;
}

template std::optional<View<char>> FindValue(View<char>, View<char>, View<char>);
template std::optional<View<char16_t>> FindValue(View<char16_t>, View<char16_t>, View<char16_t>);
template std::string SectionNames(View<char>);
template std::u16string SectionNames(View<char16_t>);
template std::string KeyNames(View<char>, View<char>);
template std::u16string KeyNames(View<char16_t>, View<char16_t>);
template std::string SectionLines(View<char>, View<char>);
template std::u16string SectionLines(View<char16_t>, View<char16_t>);
template std::string WithValue(View<char>, View<char>, std::optional<View<char>>, std::optional<View<char>>);
template std::u16string WithValue(View<char16_t>, View<char16_t>, std::optional<View<char16_t>>,
                                  std::optional<View<char16_t>>);
template std::string WithValues(View<char>, View<char>, std::span<const Entry<char>>);
template std::u16string WithValues(View<char16_t>, View<char16_t>, std::span<const Entry<char16_t>>);
template std::size_t CopyText(View<char>, std::span<char>);
template std::size_t CopyText(View<char16_t>, std::span<char16_t>);
template std::size_t CopyList(View<char>, std::span<char>);
template std::size_t CopyList(View<char16_t>, std::span<char16_t>);

}  // namespace panelglow::platform::profile
