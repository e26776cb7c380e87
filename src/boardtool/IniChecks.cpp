#include "boardtool/IniChecks.h"

#include <algorithm>
#include <map>
#include <utility>

#include "board/ChipTable.h"
#include "harness/base/CDMUtil.h"

namespace panelglow::boardtool {

namespace {

constexpr std::string_view kUtf8Mark = "\xEF\xBB\xBF";
constexpr std::string_view kWideMark = "\xFF\xFE";
constexpr std::string_view kBigEndianMark = "\xFE\xFF";
constexpr std::size_t kLongestValue = 254;

std::size_t LineAt(const std::string& bytes, std::size_t at) {
  return 1 +
         static_cast<std::size_t>(std::count(bytes.begin(), bytes.begin() + static_cast<std::ptrdiff_t>(at), '\n'));
}

// Whether a list goes on behind the ";" that ends its value: a comment begins with a word.
bool GoesOnBehind(const IniEntry& entry, std::size_t comment) {
  const std::string key = LoweredName(entry.key);
  const bool hasChips = key == "chips";
  if (comment == std::string::npos || (!hasChips && !key.ends_with("sequence") && !key.ends_with(".regs"))) {
    return false;
  }
  const std::size_t begin = std::min(entry.value.find_first_not_of(" \t", comment + 1), entry.value.size());
  const std::string next = entry.value.substr(begin, entry.value.find_first_of(" \t,:;", begin) - begin);
  return hasChips ? ChipPlaceOf(LoweredName(next)) != kPlainChipPlace : CDMUtil::IsInteger(next);
}

}  // namespace

bool IsCheckableText(const std::string& path, const std::string& bytes, bool mayBeWide, Findings& findings) {
  if (bytes.size() > kLargestText_bytes) {
    findings.Add("file-too-large", path, 1, 1,
                 std::to_string(bytes.size()) + " bytes are too many for a file of an installation; it was not read");
    return false;
  }
  if (mayBeWide && bytes.starts_with(kWideMark)) {
    return true;
  }
  if (bytes.starts_with(kBigEndianMark)) {
    findings.Add("byte-order-mark", path, 1, 1,
                 "UTF-16 with the high byte first is read by nothing: save it as UTF-16 with the low byte first");
    return false;
  }
  const std::size_t nul = bytes.find('\0');
  if (nul != std::string::npos) {
    findings.Add("no-file-text", path, LineAt(bytes, nul), 1,
                 "a zero byte ends the value that it stands in: this is no text file, or one of another encoding");
    return false;
  }
  return true;
}

void CheckIniText(const IniOutline& file, bool keepsComments, Findings& findings) {
  if (file.bytes.starts_with(kUtf8Mark)) {
    findings.Add("byte-order-mark", file.path, 1, 1,
                 "the file begins with a UTF-8 mark, which becomes part of its first line: save it without");
  }
  std::map<std::string, std::size_t> sections;
  for (const IniSection& section : file.sections) {
    const auto [first, isNew] = sections.try_emplace(LoweredName(section.name), section.line);
    if (!isNew) {
      findings.Add("duplicate-section", file.path, section.line, section.column,
                   "section [" + section.name + "] stands in line " + std::to_string(first->second) +
                       " already; nothing of this one counts");
    }
  }
  for (const IniStrayLine& stray : file.strays) {
    findings.Add("stray-line", file.path, stray.line, stray.column,
                 stray.text.starts_with('[') ? "a section's name lacks its \"]\": the line counts for nothing"
                                             : "neither a section, nor \"key=value\", nor a comment behind \";\"");
  }
  std::map<std::pair<std::string, std::string>, std::size_t> keys;
  std::size_t section = 0;  // sections that begin above the entry
  for (const IniEntry& entry : file.entries) {
    while (section < file.sections.size() && file.sections[section].line < entry.line) {
      ++section;
    }
    if (section == 0) {
      findings.Add("stray-line", file.path, entry.line, entry.column,
                   "key \"" + entry.key + "\" stands in front of the first section and counts for nothing");
      continue;
    }
    if (entry.key.starts_with("//") || entry.key.starts_with('#')) {
      findings.Add("stray-line", file.path, entry.line, entry.column, "a comment begins with \";\"");
      continue;
    }
    // Within one section only: what stands in a repeated one is told with its header.
    const auto [first, isNew] = keys.try_emplace(
        {std::to_string(section) + " " + LoweredName(entry.section), LoweredName(entry.key)}, entry.line);
    if (!isNew) {
      findings.Add("duplicate-key", file.path, entry.line, entry.column,
                   "key \"" + entry.key + "\" stands in line " + std::to_string(first->second) +
                       " already; this one counts for nothing");
    }
    if (entry.value.size() > kLongestValue) {
      findings.Add("value-too-long", file.path, entry.line, entry.valueColumn,
                   "only the first 254 of " + std::to_string(entry.value.size()) + " characters count");
    }
    const std::size_t comment = entry.value.find(';');
    if (!keepsComments && GoesOnBehind(entry, comment)) {
      findings.Add("wrong-separator", file.path, entry.line, entry.valueColumn + comment,
                   "\";\" begins a comment, so that nothing behind it counts: a list has commas");
    } else if (!keepsComments && comment != std::string::npos && comment > 0 &&
               (entry.value[comment - 1] == ' ' || entry.value[comment - 1] == '\t')) {
      findings.Add("comment-in-value", file.path, entry.line, entry.valueColumn + comment,
                   "the blank in front of \";\" is a part of the value: put the comment on a line of its own");
    }
  }
}

}  // namespace panelglow::boardtool
