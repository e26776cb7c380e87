// Reads list-shaped configuration files: INI files whose sections hold lines that are no key=value pairs, or whose
// values are lists with quotes and comments. A parser holds a machine-wide mutex of its file for all of its life, so
// do not keep one across a wait for another process that needs the file; one thread may hold two parsers of one file.
//
// Failures are thrown as plain integers: -1 for what cannot be read or split, -3 for what cannot be written.
#pragma once

#include <cstddef>
#include <functional>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "config/FileLock.h"

namespace panelglow {

class FileParser {
 public:
  static constexpr int kCannotRead = -1;
  static constexpr int kCannotWrite = -3;

  explicit FileParser(const std::string& file);
  virtual ~FileParser() = default;
  FileParser(const FileParser&) = delete;
  FileParser& operator=(const FileParser&) = delete;

  /// The file that the conversion operations write to.
  void SetTargetPath(const std::string& file) { targetPath = file; }

  /// Reads one value and splits it into fields. False when there is none.
  bool ReadValue(const std::string& section, const std::string& key);

  /// The values of the keys "<prefix>0", "<prefix>1" and so on, for as many numbers as the section has keys, as
  /// ReadValue finds them: empty where there is none. One look at the file, however many they are.
  [[nodiscard]] std::vector<std::string> ReadNumberedValues(const std::string& section,
                                                            const std::string& prefix) const;

  /// A line as it comes back when it has been written as a key's value.
  [[nodiscard]] static std::string AsValue(std::string_view line);

  /// Makes `line` the current one and splits it. Throws -1 for a quote that is not closed.
  void SplitLine(const std::string& line);

  int CountSections();

  /// Without regard to ASCII case.
  bool HasSection(const std::string& name);

  /// Throws -1 when the section has no key or does not exist.
  int CountKeys(const std::string& section);

  // ---- the fields of the current line
  [[nodiscard]] std::string& GetField(std::size_t index) { return fields.at(index); }
  [[nodiscard]] int GetFieldCount() const { return static_cast<int>(fields.size()); }

  /// The text of the current line up to its comment, as a field.
  [[nodiscard]] const std::string& GetCurrentValue() const { return currentValue; }

  // Hand out the next field and move on; at the end they return false and leave `out` as it is.

  /// Leading digits of the base count; a number of more than 32 bits is the largest one.
  bool NextFieldNumber(unsigned int& out, int base);

  /// Ended by NUL, and cut to the room that there is.
  bool NextFieldText(std::span<char> out);
  bool NextFieldString(std::string& out);

  // ---- the target file

  /// Writes the current line under a key.
  bool WriteBuffer(const std::string& section, const std::string& key);
  bool EraseSection(const std::string& section);

  /// Copies a section's lines to the target file under the keys "<prefix><number>"; the number of lines. Throws on a
  /// section of 4094 bytes or more.
  int ConvertToIni(const std::string& section, const std::string& prefix, bool clear, int firstNumber);

 protected:
  /// A profile call that fills a buffer with a list and returns its length.
  using ListCall = std::function<std::size_t(std::span<char>)>;

  /// The entries of a list, read with growing buffers. Throws -1 for a list that is longer than the largest of them,
  /// and for an empty one when there must be some.
  static std::vector<std::string> ReadList(const ListCall& call, bool mustHaveContent);

  std::string buffer;  // the current line as read
  std::string currentValue;
  std::string path;
  std::string targetPath;
  std::vector<std::string> fields;
  std::size_t fieldIndex = 0;  // of the field to be handed out next

 private:
  const std::vector<std::string>& SectionNames();
  bool NextField(std::size_t& cursor, std::string& out) const;
  int Convert(const std::string& section, const std::string& prefix, bool clear, int firstNumber);

  std::optional<std::vector<std::string>> sectionNames;  // read at first need
  FileLock lock;
};

}  // namespace panelglow
