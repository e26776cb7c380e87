// Writes objects to a byte stream.
#pragma once

#include <cstdint>
#include <ostream>
#include <string>
#include <string_view>
#include <unordered_map>

#include "config/PersistentByProxy.h"
#include "config/ptstream.h"

namespace panelglow {

/// An object is known by its address: what was written has to stay where it is as long as the stream is used.
/// Failures are thrown as std::runtime_error; the stream is of no use then. For one thread.
class optstream final : public ptstream {
 public:
  /// The byte stream belongs to the caller and outlives this object.
  explicit optstream(std::ostream& output) : bytes(output) {}

  void WriteUnsigned(std::uint32_t value);
  void WriteInteger(std::int32_t value) { WriteUnsigned(static_cast<std::uint32_t>(value)); }
  void WriteString(std::string_view text);

  /// Null counts as the empty text.
  void WriteCString(const char* text) { WriteString(text == nullptr ? "" : text); }

  // As a value: the reader has an object to read into. Through a pointer, which may be null: the reader makes one.
  void WriteValue(Persistent& object);
  void WriteValue(PersistentByProxy& object);
  void WritePointer(Persistent* object);
  void WritePointer(PersistentByProxy* object);

  /// True when the object has been written, or is being written.
  [[nodiscard]] bool HasSeen(const Persistent* object) const { return numbers.contains(object); }

 private:
  template <class Object>
  void WriteObject(std::uint8_t tag, Object& object);
  void WriteByte(std::uint8_t value) { Write(&value, 1); }
  void Write(const void* data, std::size_t size);

  std::ostream& bytes;
  std::unordered_map<const Persistent*, std::uint32_t> numbers;  // by identity
  std::size_t depth = 0;                                         // of the objects being written
};

}  // namespace panelglow
