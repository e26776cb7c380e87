// The base of the two object streams. A stream holds a graph of objects: each object once, later occurrences as
// references to its number, with class names and a version for each object.
//
//   integer         4 bytes, little-endian
//   string          4 bytes length, then the bytes
//   object record   1 byte tag, then by tag:
//     0  null pointer
//     1  an object that was there before: its number
//     2  an object written as a value: number, version, payload
//     3  an object written through a pointer: number, class name, version, payload
//
// Numbers are given from 0 in the order of first occurrence; an object has its number before its payload begins, so
// that its parts can refer to it. There is no header, no end mark and no checksum.
#pragma once

#include <cstddef>
#include <cstdint>

namespace panelglow {

class ptstream {
 public:
  /// Objects nested deeper than this are refused: somewhat more than the deepest XML tree needs with its attributes.
  static constexpr std::size_t kDeepestObject = 1100;

  ptstream() = default;
  virtual ~ptstream() = default;
  ptstream(const ptstream&) = delete;
  ptstream& operator=(const ptstream&) = delete;

 protected:
  static constexpr std::uint8_t kNull = 0;
  static constexpr std::uint8_t kReference = 1;
  static constexpr std::uint8_t kValue = 2;
  static constexpr std::uint8_t kPointer = 3;
};

}  // namespace panelglow
