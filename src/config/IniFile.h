// A thin reader over the platform's profile services with a language fallback: a value that a section lacks is looked
// for in "en_US". Each call reads the file anew.
#pragma once

#include <string>

namespace panelglow {

class IniFile {
 public:
  IniFile() = default;
  explicit IniFile(const std::string& filePath);
  virtual ~IniFile() = default;
  IniFile(const IniFile&) = default;
  IniFile& operator=(const IniFile&) = default;

  /// True when the file existed at construction, or after a successful section read or a write.
  [[nodiscard]] const std::string& GetPath() const { return path; }
  [[nodiscard]] bool Exists() const { return exists; }

  /// The value, at most 254 characters of it. Without the file: empty, whatever the default. Otherwise the section's
  /// value, or the default; when both are empty, the value of the section "en_US".
  [[nodiscard]] std::string GetValue(const std::string& section, const std::string& key,
                                     const std::string& defaultValue = {}) const;

  /// The section's lines, each ended by a line feed; the default when there is no such section.
  std::string GetSection(const std::string& section, const std::string& defaultValue);

  /// False when the file could not be written.
  bool SetValue(const std::string& section, const std::string& key, const std::string& value);

 private:
  std::string path;
  bool exists = false;
};

}  // namespace panelglow
