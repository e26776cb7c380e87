// Writes objects to a byte stream.
#pragma once

#include <cstdint>
#include <ostream>
#include <string>
#include <string_view>
#include <vector>

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
  [[nodiscard]] bool HasSeen(const Persistent* object) const;

 private:
  template <class Object>
  void WriteObject(std::uint8_t tag, Object& object);
  void WriteNull();
  void Append(std::uint32_t value);
  void Flush();
  [[nodiscard]] std::size_t SlotOf(const Persistent* object) const;
  void MakeRoom();

  // A place of the table of objects, which is open-addressed: a stream of a large tree is mostly look-ups.
  struct Slot {
    const Persistent* object = nullptr;  // by identity; null: free
    std::uint32_t number = 0;
  };

  std::ostream& bytes;
  std::string waiting;  // bytes of the record being written
  std::vector<Slot> slots;
  std::uint32_t count = 0;  // of objects in the table
  std::size_t depth = 0;    // of the objects being written
};

}  // namespace panelglow
