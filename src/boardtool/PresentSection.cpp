#include "boardtool/PresentSection.h"

#include <set>
#include <utility>

#include "boardtool/Installation.h"
#include "harness/base/CDMUtil.h"

namespace panelglow::boardtool {

PresentSection::PresentSection(const std::string& path, std::string systemId)
    : file_(path, ReadFile(path).value_or("")), systemId_(std::move(systemId)) {}

std::string PresentSection::Value(const std::string& key) const {
  const IniEntry* const entry = file_.Find(systemId_, key);
  return entry == nullptr ? std::string() : CDMUtil::Trim(entry->value.substr(0, entry->value.find(';')));
}

std::string PresentSection::With(std::vector<std::string> lines, const std::string& fileName) const {
  std::set<std::string> keys;
  for (const std::string& line : lines) {
    keys.insert(LoweredName(line.substr(0, line.find('='))));
  }
  for (const IniEntry& entry : file_.entries) {
    if (entry.isFirst && LoweredName(entry.section) == LoweredName(systemId_) &&
        !keys.contains(LoweredName(entry.key))) {
      lines.push_back(entry.key + "=" + entry.value);
    }
  }
  std::string text = "; " + fileName;
  text += file_.HasSection(systemId_) ? ", in place of its section [" + systemId_ + "]" : "";
  text += "\n[" + systemId_ + "]\n";
  for (const std::string& line : lines) {
    text += line + "\n";
  }
  return text;
}

}  // namespace panelglow::boardtool
