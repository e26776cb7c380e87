#include "config/WIniFile.h"

#include <array>

#include "harness/base/CDMUtil.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::size_t kValueBuffer = 255;  // characters, the final NUL among them
constexpr const char16_t* kFallbackSection = u"en_US";

}  // namespace

WIniFile::WIniFile(const wstring& filePath)
    : path(filePath), exists(CDMUtil::FileExists(platform::Utf8FromWide(filePath))) {}

wstring WIniFile::GetValue(const wstring& section, const wstring& key) const {
  if (!exists) {
    return {};
  }
  std::array<char16_t, kValueBuffer> buffer{};
  platform::ProfileFiles& profiles = platform::TheHost().profiles;
  if (profiles.GetValue(section, key, u"", buffer, path) == 0) {
    profiles.GetValue(kFallbackSection, key, u"", buffer, path);
  }
  return buffer.data();
}

bool WIniFile::SetValue(const wstring& section, const wstring& key, const wstring& value) {
  const bool written = platform::TheHost().profiles.SetValue(section, key, value, path);
  exists = exists || written;
  return written;
}

}  // namespace panelglow
