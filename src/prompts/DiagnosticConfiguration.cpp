#include "prompts/DiagnosticConfiguration.h"

#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {
constexpr std::uint32_t kNoColor = 0xFFFFFFFF;
}  // namespace

DiagnosticConfiguration::DiagnosticConfiguration(const std::string& path) : file(path) {
  const std::uint32_t color = GetUnsignedLong("BackgroundColor", kNoColor);
  if (color < kNoColor) {
    backgroundBrush = color & 0x00FFFFFFU;
  }
}

std::string DiagnosticConfiguration::GetString(const std::string& key, const std::string& defaultValue) const {
  const Section* found = file.GetSection(section);
  const Record* record = found == nullptr ? nullptr : found->GetRecord(key);
  return record == nullptr || record->GetValue().empty() ? defaultValue : record->GetValue();
}

int DiagnosticConfiguration::GetInt(const std::string& key, int defaultValue) const {
  const std::string text = GetString(key, "");
  return text.empty() ? defaultValue : CDMUtil::ToInt(text);
}

std::uint32_t DiagnosticConfiguration::GetUnsignedLong(const std::string& key, std::uint32_t defaultValue) const {
  const std::string text = GetString(key, "");
  return text.empty() ? defaultValue : CDMUtil::ToUnsignedLong(text);
}

}  // namespace panelglow
