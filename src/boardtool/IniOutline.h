// An INI file as the look-ups see it, with the line and column of everything in it, so that whatever is said of a
// value can say where it stands.
#pragma once

#include <cstddef>
#include <map>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace panelglow::boardtool {

struct IniSection {
  std::string name;
  std::size_t line = 0;
  std::size_t column = 0;
};

struct IniEntry {
  std::string section;  // empty in front of the first header
  std::string key;
  std::string value;  // without its quotes
  std::size_t line = 0;
  std::size_t column = 0;       // of the key
  std::size_t valueColumn = 0;  // of the value
  bool isFirst = true;          // look-ups find this one: no earlier section or key has the name
};

/// A line of a section that is neither header, entry nor comment.
struct IniStrayLine {
  std::string text;
  std::size_t line = 0;
  std::size_t column = 0;
};

class IniOutline {
 public:
  /// `bytes` as the file holds them; one that begins with the UTF-16 mark is decoded as the look-ups do.
  IniOutline(std::string filePath, std::string fileBytes);

  /// The entry that a look-up finds; null when there is none. Names without regard to ASCII case.
  [[nodiscard]] const IniEntry* Find(std::string_view section, std::string_view key) const;
  [[nodiscard]] bool HasSection(std::string_view section) const;
  /// The lines of the section that look-ups find, each ended by NUL, as the look-ups list them.
  [[nodiscard]] std::string LinesOf(std::string_view section) const;

  /// Whether the comment behind ";" in `line`, or in the comment line above it, silences a rule: "check: off RULE".
  [[nodiscard]] bool IsSilenced(std::size_t line, std::string_view rule) const;

  std::string path;
  std::string bytes;
  std::vector<IniSection> sections;  // in order, repeated ones too
  std::vector<IniEntry> entries;
  std::vector<IniStrayLine> strays;

 private:
  std::map<std::pair<std::string, std::string>, std::size_t> first_;  // lowered section and key, index of the entry
  std::map<std::string, std::vector<std::size_t>> firstSection_;      // lowered name, indices of its entries
};

/// With ASCII letters lowered, as names are compared.
std::string LoweredName(std::string_view name);

}  // namespace panelglow::boardtool
