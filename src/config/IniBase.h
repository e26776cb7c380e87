// A whole INI file parsed into memory by the system's own rules: names with letter case, a comment marker that counts
// wherever it stands. Comments and the file's order are not kept.
#pragma once

#include <map>
#include <memory>
#include <string>
#include <string_view>

#include "config/Section.h"

namespace panelglow {

class IniBase {
 public:
  IniBase() = default;

  /// Parses the file. One that cannot be opened leaves the object empty.
  explicit IniBase(const std::string& filePath);
  virtual ~IniBase() = default;

  /// Adds what `text` holds; a repeated section or key replaces the former one.
  void Parse(std::string_view text);

  /// Null when there is none of that name (compared with letter case). Owned by this object.
  [[nodiscard]] const Section* GetSection(const std::string& name) const;
  [[nodiscard]] Section* GetSection(const std::string& name);

  /// Replaces a section of the same name.
  void AddSection(std::unique_ptr<Section> section);

  [[nodiscard]] std::string ToText() const;

  /// Writes ToText() to a file. False when that failed.
  [[nodiscard]] bool Save(const std::string& filePath) const;

  /// The comment marker of all objects of the process, ";" at first; an empty one means no comments. To be set before
  /// other threads parse.
  static void SetComment(const std::string& marker);

 private:
  void ParseLine(std::string_view line);

  std::string path;
  std::map<std::string, std::unique_ptr<Section>> sections;
  Section* current = nullptr;  // the section being filled; null before the first header
};

}  // namespace panelglow
