#include "boardtool/MessageChecks.h"

#include <algorithm>
#include <optional>

namespace panelglow::boardtool {

namespace {

constexpr const char* kMediaSection = "all multimedia";
constexpr const char* kFallback = "en_US";

bool IsLetter(char c) { return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z'); }

// A text takes at most one text of the program.
void CheckFormats(const IniOutline& file, Findings& findings) {
  for (const IniEntry& entry : file.entries) {
    if (LoweredName(entry.section) == kMediaSection) {
      continue;
    }
    std::size_t taken = 0;
    for (std::size_t at = entry.value.find('%'); at != std::string::npos && at + 1 <= entry.value.size();
         at = entry.value.find('%', at + 2)) {
      const char kind = at + 1 < entry.value.size() ? entry.value[at + 1] : '\0';
      taken += kind == 's' ? 1 : 0;
      if (kind != 's' && kind != '%') {
        findings.Add("message-format", file.path, entry.line, entry.valueColumn + at,
                     "\"%\" begins the place of a text, \"%s\"; a percent sign is \"%%\"");
      }
    }
    if (taken > 1) {
      findings.Add("message-format", file.path, entry.line, entry.valueColumn,
                   "the program gives one text, and this one has places for " + std::to_string(taken));
    }
  }
}

// Where the first character of several bytes stands, when all characters of a text are those of UTF-8. No text of a
// code page looks like that by chance.
std::optional<std::size_t> FirstOfUtf8(std::string_view text) {
  std::optional<std::size_t> first;
  for (std::size_t at = 0; at < text.size();) {
    const auto lead = static_cast<unsigned char>(text[at]);
    const std::size_t length = lead < 0x80                   ? 1
                               : lead >= 0xC2 && lead < 0xE0 ? 2
                               : lead >= 0xE0 && lead < 0xF0 ? 3
                               : lead >= 0xF0 && lead < 0xF5 ? 4
                                                             : 0;
    const std::string_view rest = text.substr(at + 1, length == 0 ? 0 : length - 1);
    if (length == 0 || rest.size() + 1 < length || !std::all_of(rest.begin(), rest.end(), [](char c) {
          return (static_cast<unsigned char>(c) & 0xC0U) == 0x80;
        })) {
      return std::nullopt;
    }
    if (length > 1 && !first) {
      first = at;
    }
    at += length;
  }
  return first;
}

void CheckEncoding(const IniOutline& file, Findings& findings) {
  constexpr std::string_view kWideMark = "\xFF\xFE";
  constexpr std::size_t kMark = 3;  // bytes of a UTF-8 mark, which is told by a rule of its own
  const std::string_view text =
      std::string_view(file.bytes).substr(file.bytes.starts_with("\xEF\xBB\xBF") ? kMark : 0);
  if (text.starts_with(kWideMark)) {
    return;
  }
  if (const std::optional<std::size_t> first = FirstOfUtf8(text)) {
    const auto line = 1 + std::count(text.begin(), text.begin() + static_cast<std::ptrdiff_t>(*first), '\n');
    findings.Add("message-texts", file.path, static_cast<std::size_t>(line), 1,
                 "the texts are UTF-8, and each of their bytes is shown as a character: save the file as UTF-16 with "
                 "the low byte first");
  }
}

void CheckLanguages(const IniOutline& file, bool isWhole, Findings& findings) {
  for (const IniSection& section : file.sections) {
    if (LoweredName(section.name) == kMediaSection || IsLanguage(section.name)) {
      continue;
    }
    std::string meant = section.name;
    std::replace(meant.begin(), meant.end(), '-', '_');
    findings.Add("message-texts", file.path, section.line, section.column,
                 "no run finds [" + section.name + "]: a language is called as \"de_DE\"" +
                     (IsLanguage(meant) ? "; is [" + meant + "] meant?" : ""));
  }
  if (isWhole && !file.HasSection(kFallback)) {
    findings.Add("message-texts", file.path, 1, 1,
                 file.sections.empty() ? std::string("the file has no texts, so that numbers stand for them")
                                       : "the file has no section [" + std::string(kFallback) +
                                             "], from which every text comes that a language lacks");
  }
}

}  // namespace

bool IsLanguage(std::string_view section) {
  const std::size_t line = section.find('_');
  return (line == 2 || line == 3) && section.size() == line + 3 &&
         std::all_of(section.begin(), section.end(), [](char c) { return c == '_' || IsLetter(c); });
}

void CheckMessages(const IniOutline& file, bool isWhole, Findings& findings) {
  CheckFormats(file, findings);
  CheckEncoding(file, findings);
  CheckLanguages(file, isWhole, findings);
}

}  // namespace panelglow::boardtool
