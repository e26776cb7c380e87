#include "config/IniFile.h"

#include <algorithm>
#include <array>

#include "harness/base/CDMUtil.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::size_t kValueBuffer = 255;  // characters, the final NUL among them
constexpr std::size_t kSectionBuffer = 0x2004;
constexpr const char* kFallbackSection = "en_US";

}  // namespace

IniFile::IniFile(const std::string& filePath) : path(filePath), exists(CDMUtil::FileExists(filePath)) {}

std::string IniFile::GetValue(const std::string& section, const std::string& key,
                              const std::string& defaultValue) const {
  if (!exists) {
    return {};
  }
  std::array<char, kValueBuffer> buffer{};
  platform::ProfileFiles& profiles = platform::TheHost().profiles;
  if (profiles.GetValue(section, key, defaultValue, buffer, path) == 0) {
    profiles.GetValue(kFallbackSection, key, defaultValue, buffer, path);
  }
  return buffer.data();
}

std::string IniFile::GetSection(const std::string& section, const std::string& defaultValue) {
  std::string lines(kSectionBuffer, '\0');
  const std::size_t length = platform::TheHost().profiles.GetSection(section, lines, path);
  if (length == 0) {
    return defaultValue;
  }
  lines.resize(length);
  std::replace(lines.begin(), lines.end(), '\0', '\n');
  exists = true;
  return lines;
}

bool IniFile::SetValue(const std::string& section, const std::string& key, const std::string& value) {
  const bool written = platform::TheHost().profiles.SetValue(section, key, value, path);
  exists = exists || written;
  return written;
}

}  // namespace panelglow
