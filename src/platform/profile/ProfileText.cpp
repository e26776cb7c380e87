#include "platform/profile/ProfileText.h"

#include <algorithm>
#include <set>

#include "platform/profile/ProfileLines.h"

namespace panelglow::platform::profile {

namespace {

using lines::BeforeNul;
using lines::EachLine;
using lines::FindSection;
using lines::Header;
using lines::IsLineEnd;
using lines::kBlanks;
using lines::Line;
using lines::LineEnd;
using lines::Lower;
using lines::NextHeader;
using lines::SameName;
using lines::Section;
using lines::TrimBlanks;
using lines::View;

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
