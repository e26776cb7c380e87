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
  for (const std::string& line : lines) {
    if (!platform::TheHost().profiles.SetValue(section, prefix + CDMUtil::ToString(nextEntry), line, targetPath)) {
      throw kCannotRead;
    }
    ++nextEntry;
  }
}

void OrgFileParser::Reset() {
  lines.clear();
  lineIndex = 0;
}

}  // namespace panelglow
