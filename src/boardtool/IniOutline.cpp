#include "boardtool/IniOutline.h"

#include <algorithm>

#include "platform/Text.h"
#include "platform/profile/ProfileText.h"

namespace panelglow::boardtool {

namespace {

constexpr std::string_view kWideMark = "\xFF\xFE";
constexpr std::string_view kSilence = "check: off ";

std::string Narrowed(const std::string& bytes) {
  if (!bytes.starts_with(kWideMark)) {
    return bytes;
  }
  wstring wide;
  for (std::size_t i = kWideMark.size(); i + 1 < bytes.size(); i += 2) {
    wide.push_back(
        static_cast<char16_t>(static_cast<unsigned char>(bytes[i]) | static_cast<unsigned char>(bytes[i + 1]) << 8U));
  }
  return platform::CodePageFromWide(wide);
}

std::string Unquoted(std::string_view value) {
  const bool isQuoted =
      value.size() >= 2 && value.front() == value.back() && (value.front() == '"' || value.front() == '\'');
  return std::string(isQuoted ? value.substr(1, value.size() - 2) : value);
}

// The text of a line by its number, from 1.
std::string_view LineOf(std::string_view text, std::size_t line) {
  for (; line > 1; --line) {
    const std::size_t end = text.find('\n');
    if (end == std::string_view::npos) {
      return {};
    }
    text.remove_prefix(end + 1);
  }
  return text.substr(0, text.find('\n'));
}

bool Silences(std::string_view comment, std::string_view rule) {
  for (std::size_t at = comment.find(kSilence); at != std::string_view::npos; at = comment.find(kSilence, at + 1)) {
    std::string_view rest = comment.substr(at + kSilence.size());
    rest = rest.substr(0, rest.find_first_of(" \t\r,;"));
    if (rest == rule || rest == "all") {
      return true;
    }
  }
  return false;
}

}  // namespace

std::string LoweredName(std::string_view name) {
  std::string lowered(name);
  std::transform(lowered.begin(), lowered.end(), lowered.begin(),
                 [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c; });
  return lowered;
}

IniOutline::IniOutline(std::string filePath, std::string fileBytes)
    : path(std::move(filePath)), bytes(std::move(fileBytes)) {
  std::string section;
  std::vector<std::size_t>* ofSection = nullptr;  // entries of the line's section; null where it does not count
  const std::string text = Narrowed(bytes);
  platform::profile::VisitLines(text, [&](const platform::profile::OutlineLine& line) {
    if (line.isHeader) {
      section = std::string(line.name);
      const auto [first, isFirstOfName] = firstSection_.try_emplace(LoweredName(section));
      ofSection = isFirstOfName ? &first->second : nullptr;
      sections.push_back({section, line.number, line.column});
    } else if (line.isEntry) {
      IniEntry entry{
          section, std::string(line.name), Unquoted(line.value), line.number, line.column, line.valueColumn, false};
      if (ofSection != nullptr) {
        ofSection->push_back(entries.size());
      }
      entry.isFirst = ofSection != nullptr &&
                      first_.try_emplace({LoweredName(section), LoweredName(entry.key)}, entries.size()).second;
      entries.push_back(std::move(entry));
    } else {
      strays.push_back({std::string(line.name), line.number, line.column});
    }
  });
}

const IniEntry* IniOutline::Find(std::string_view section, std::string_view key) const {
  const auto found = first_.find({LoweredName(section), LoweredName(key)});
  return found == first_.end() ? nullptr : &entries[found->second];
}

bool IniOutline::HasSection(std::string_view section) const { return firstSection_.contains(LoweredName(section)); }

std::string IniOutline::LinesOf(std::string_view section) const {
  std::string lines;
  if (const auto found = firstSection_.find(LoweredName(section)); found != firstSection_.end()) {
    for (const std::size_t at : found->second) {
      lines += entries[at].key + "=" + entries[at].value + '\0';
    }
  }
  return lines;
}

bool IniOutline::IsSilenced(std::size_t line, std::string_view rule) const {
  const std::string_view own = LineOf(bytes, line);
  if (const std::size_t comment = own.find(';');
      comment != std::string_view::npos && Silences(own.substr(comment), rule)) {
    return true;
  }
  if (line < 2) {
    return false;
  }
  const std::string_view above = LineOf(bytes, line - 1);
  const std::size_t first = above.find_first_not_of(" \t");
  return first != std::string_view::npos && above[first] == ';' && Silences(above, rule);
}

}  // namespace panelglow::boardtool
