// Reads a section of a list-shaped file line by line, and collects lines of several sections under one numbering.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "config/FileParser.h"

namespace panelglow {

class OrgFileParser : public FileParser {
 public:
  explicit OrgFileParser(const std::string& file) : FileParser(file) {}

  /// What the keys of AppendLines begin with.
  void SetPrefix(const std::string& text) { prefix = text; }

  /// Reads the section's lines, unless lines are there already; their number.
  int ReadSection(const std::string& section);

  /// Takes the next line and splits it into fields. False at the end.
  bool NextLine();

  /// Writes the lines to the target file under the prefix and rising numbers from 0. Throws -1 when that fails.
  void AppendLines(const std::string& section);

  /// Forgets the lines; the numbering goes on.
  void Reset();

  [[nodiscard]] const std::vector<std::string>& GetLines() const { return lines; }

 private:
  std::vector<std::string> lines;
  std::string prefix;
  int nextEntry = 0;
  std::size_t lineIndex = 0;
};

}  // namespace panelglow
