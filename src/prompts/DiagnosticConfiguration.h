// The look of the prompts that a field integrator can change: an INI file whose mere existence selects the
// configurable window family.
#pragma once

#include <cstdint>
#include <string>

#include "config/IniBase.h"
#include "platform/Desktop.h"

namespace panelglow {

class DiagnosticConfiguration {
 public:
  /// No file: every look-up gives its default.
  DiagnosticConfiguration() = default;

  /// Reads section "WindowSettings". A missing file, section or key is no error.
  explicit DiagnosticConfiguration(const std::string& path);
  virtual ~DiagnosticConfiguration() = default;

  /// The value of a key; the default when it is missing or empty.
  [[nodiscard]] std::string GetString(const std::string& key, const std::string& defaultValue) const;
  [[nodiscard]] int GetInt(const std::string& key, int defaultValue) const;
  [[nodiscard]] std::uint32_t GetUnsignedLong(const std::string& key, std::uint32_t defaultValue) const;

  /// The windows' background; the system's dialog colour when the file gives none.
  [[nodiscard]] platform::Color GetBackgroundBrush() const { return backgroundBrush; }

 private:
  std::string section = "WindowSettings";
  platform::Color backgroundBrush = platform::kButtonFaceColor;
  IniBase file;
};

}  // namespace panelglow
