// Finds and walks the firmware's structure table by itself, byte by byte through the driver: the fall-back where the
// management service does not know the table.
#pragma once

#include <cstdint>
#include <functional>
#include <span>
#include <string>
#include <vector>

namespace panelglow {

class SmbiosScanner {
 public:
  /// Where the bytes come from: a byte or a 16-bit word at a segment and offset.
  struct Source {
    std::function<std::uint8_t(std::uint16_t segment, std::uint16_t offset)> readByte;
    std::function<std::uint16_t(std::uint16_t segment, std::uint16_t offset)> readWord;
  };

  /// Looks for the entry point in segments 0xF000 to 0xFFFF and copies the table.
  void Scan(const Source& source);

  /// Position of the first structure of a type in the copied table, which Table() shows from there on; -1 when there
  /// is none.
  [[nodiscard]] std::ptrdiff_t Find(std::uint8_t type) const;

  /// The copied table from a structure's position to its end.
  [[nodiscard]] std::span<const std::uint8_t> At(std::ptrdiff_t structure) const;

  /// The string of a 1-based number in a structure; empty for number 0 and for numbers without a string.
  static std::string StringOf(std::span<const std::uint8_t> structure, std::uint8_t index);

  /// Word at offset 6 of the entry point: major version in the low byte, minor in the high byte.
  [[nodiscard]] std::uint16_t Version() const { return version_; }

 private:
  struct Structure {
    std::uint8_t type = 127;
    std::size_t start = 0;
  };

  void Walk(std::size_t count);

  std::vector<std::uint8_t> table_;
  std::vector<Structure> structures_;
  std::uint16_t version_ = 0;
};

}  // namespace panelglow
