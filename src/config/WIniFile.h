// IniFile with wide strings, for texts that people read.
#pragma once

#include "platform/Text.h"

namespace panelglow {

class WIniFile {
 public:
  WIniFile() = default;
  explicit WIniFile(const wstring& filePath);
  virtual ~WIniFile() = default;
  WIniFile(const WIniFile&) = default;
  WIniFile& operator=(const WIniFile&) = default;

  /// True when the file existed at construction, or after a write.
  [[nodiscard]] bool Exists() const { return exists; }

  /// The value, at most 254 characters of it: of the section, or when that is empty of the section "en_US".
  [[nodiscard]] wstring GetValue(const wstring& section, const wstring& key) const;

  /// False when the file could not be written.
  bool SetValue(const wstring& section, const wstring& key, const wstring& value);

  [[nodiscard]] const wstring& GetPath() const { return path; }

 private:
  wstring path;
  bool exists = false;
};

}  // namespace panelglow
