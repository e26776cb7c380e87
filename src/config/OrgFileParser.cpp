#include "config/OrgFileParser.h"

#include "harness/base/CDMUtil.h"
#include "platform/Host.h"

namespace panelglow {

int OrgFileParser::ReadSection(const std::string& section) {
  if (lines.empty()) {
    lines = ReadList(
        [&](std::span<char> room) { return platform::TheHost().profiles.GetSection(section, room, path); }, false);
    lineIndex = 0;
  }
  return static_cast<int>(lines.size());
}

bool OrgFileParser::NextLine() {
  if (lineIndex >= lines.size()) {
    return false;
  }
  SplitLine(lines[lineIndex++]);
  return true;
}

void OrgFileParser::AppendLines(const std::string& section) {
  std::vector<platform::ProfileEntry> entries;
  entries.reserve(lines.size());
  for (const std::string& line : lines) {
    entries.emplace_back(prefix + CDMUtil::ToString(nextEntry + static_cast<int>(entries.size())), line);
  }
  if (!platform::TheHost().profiles.SetValues(section, entries, targetPath)) {
    throw kCannotRead;
  }
  nextEntry += static_cast<int>(entries.size());
}

void OrgFileParser::Reset() {
  lines.clear();
  lineIndex = 0;
}

}  // namespace panelglow
