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

  /// A pointer to an object that has been written, or is being written; the null pointer for any other.
  void WritePointerIfSeen(const Persistent* object);

 private:
  template <class Object>
  void WriteObject(std::uint8_t tag, Object& object);
  void WriteNull();
  void WriteReference(std::uint32_t number);
  char* RoomFor(std::size_t size);
  void Append(std::uint8_t value);
  void Append(std::uint32_t value);
  void EndCall();
  void HandOn();
  void Put(std::string_view text);
  [[nodiscard]] std::size_t SlotOf(const Persistent* object) const;
  void MakeRoom();

  std::ios& bytes;            // buffer and state of the byte stream
  std::vector<char> waiting;  // room for a piece, of which so much is filled
  std::size_t filled = 0;
  std::vector<const Persistent*> objects;  // by number; those of proxies by their identity

  // Finds them: an open-addressed table, since a stream of a large tree is mostly look-ups. Number and 1; 0: free.
  std::vector<std::uint32_t> slots;
  std::size_t depth = 0;  // of the objects being written
};

}  // namespace panelglow
