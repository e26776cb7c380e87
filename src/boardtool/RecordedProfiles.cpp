#include "boardtool/RecordedProfiles.h"

#include "platform/profile/ProfileText.h"

namespace panelglow::boardtool {

using platform::profile::CopyList;
using platform::profile::CopyText;

void RecordedProfiles::Replace(const IniEntry* entry, std::string value) {
  replaced_ = entry;
  replacement_ = std::move(value);
  isRecording_ = entry == nullptr;
}

void RecordedProfiles::Forget() {
  lookUps_.clear();
  found_.clear();
}

const IniOutline* RecordedProfiles::File(std::string_view path) const {
  for (const IniOutline& file : files_) {
    if (file.path == path) {
      return &file;
    }
  }
  return nullptr;
}

std::size_t RecordedProfiles::GetValue(std::optional<std::string_view> section, std::optional<std::string_view> key,
                                       std::string_view fallback, std::span<char> buffer, std::string_view path) {
  const IniOutline* const file = File(path);
  if (!section || !key || file == nullptr) {
    return CopyText<char>(fallback, buffer);  // the board library asks for no lists
  }
  const IniEntry* const entry = file->Find(*section, *key);
  if (isRecording_) {
    lookUps_.insert({file->path, LoweredName(*section), LoweredName(*key)});
    if (entry != nullptr) {
      found_.insert(entry);
    }
  }
  if (entry != nullptr) {
    return CopyText<char>(entry == replaced_ ? replacement_ : entry->value, buffer);
  }
  while (!fallback.empty() && fallback.back() == ' ') {
    fallback.remove_suffix(1);
  }
  return CopyText<char>(fallback, buffer);
}

std::size_t RecordedProfiles::GetValue(std::optional<std::u16string_view> /*section*/,
                                       std::optional<std::u16string_view> /*key*/, std::u16string_view fallback,
                                       std::span<char16_t> buffer, std::u16string_view /*path*/) {
  return CopyText<char16_t>(fallback, buffer);  // the board library reads narrow texts
}

std::size_t RecordedProfiles::GetSection(std::string_view section, std::span<char> buffer, std::string_view path) {
  const IniOutline* const file = File(path);
  const std::string lines = file == nullptr ? std::string() : file->LinesOf(section);
  return CopyList<char>(lines, buffer);
}

}  // namespace panelglow::boardtool
