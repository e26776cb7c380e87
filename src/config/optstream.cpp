#include "config/optstream.h"

#include <algorithm>
#include <stdexcept>
#include <utility>

namespace panelglow {

namespace {

constexpr std::size_t kPiece = std::size_t{1} << 16U;
constexpr std::size_t kFirstSlots = 64;  // a power of two

// Neighbours in memory are neighbours in the table: they are written one behind the other. No two objects are closer
// together than a pointer's size, and most are twice that.
std::size_t HashOf(const Persistent* object) { return reinterpret_cast<std::uintptr_t>(object) / 16; }

// Little-endian.
void PutNumber(char* room, std::uint32_t value) {
  for (std::size_t i = 0; i < sizeof(value); ++i) {
    room[i] = static_cast<char>(value >> (8 * i));
  }
}

const Persistent* IdentityOf(const Persistent& object) { return &object; }
const Persistent* IdentityOf(const PersistentByProxy& object) { return &object.GetProxy(); }

}  // namespace

// ---- bytes: gathered, and handed on in pieces and at the end of each call from outside

// Room for a few bytes behind those that wait.
inline char* optstream::RoomFor(std::size_t size) {
  if (size > waiting.size() - filled) {
    HandOn();
  }
  return waiting.data() + std::exchange(filled, filled + size);
}

inline void optstream::Append(std::uint8_t value) { *RoomFor(1) = static_cast<char>(value); }

inline void optstream::Append(std::uint32_t value) { PutNumber(RoomFor(sizeof(value)), value); }

inline void optstream::EndCall() {
  if (depth == 0) {
    HandOn();
  }
}

void optstream::HandOn() {
  if (waiting.empty()) {
    waiting.resize(kPiece + sizeof(std::uint32_t));  // a text of a piece, behind its length
  }
  Put(std::string_view(waiting.data(), std::exchange(filled, 0)));
}

void optstream::Put(std::string_view text) {
  const auto length = static_cast<std::streamsize>(text.size());
  if (!bytes.good() || bytes.rdbuf()->sputn(text.data(), length) != length) {
    bytes.setstate(std::ios::badbit);
    throw std::runtime_error("The stream cannot be written");
  }
}

void optstream::WriteUnsigned(std::uint32_t value) {
  Append(value);
  EndCall();
}

void optstream::WriteString(std::string_view text) {
  const auto length = static_cast<std::uint32_t>(text.size());
  if (length != text.size()) {
    throw std::runtime_error("A text of more than 4 GB");
  }
  if (text.size() > kPiece) {
    Append(length);
    HandOn();
    Put(text);
  } else {
    char* const room = RoomFor(sizeof(length) + text.size());
    PutNumber(room, length);
    std::copy(text.begin(), text.end(), room + sizeof(length));
  }
  EndCall();
}

// ---- objects

void optstream::WriteValue(Persistent& object) { WriteObject(kValue, object); }
void optstream::WriteValue(PersistentByProxy& object) { WriteObject(kValue, object); }

void optstream::WritePointer(Persistent* object) { object == nullptr ? WriteNull() : WriteObject(kPointer, *object); }

void optstream::WritePointer(PersistentByProxy* object) {
  object == nullptr ? WriteNull() : WriteObject(kPointer, *object);
}

void optstream::WritePointerIfSeen(const Persistent* object) {
  const std::uint32_t slot = object == nullptr || slots.empty() ? 0 : slots[SlotOf(object)];
  slot == 0 ? WriteNull() : WriteReference(slot - 1);
}

void optstream::WriteReference(std::uint32_t number) {
  Append(kReference);
  Append(number);
  EndCall();
}

void optstream::WriteNull() {
  Append(kNull);
  EndCall();
}

template <class Object>
void optstream::WriteObject(std::uint8_t tag, Object& object) {
  MakeRoom();
  std::uint32_t& slot = slots[SlotOf(IdentityOf(object))];
  if (slot != 0) {
    WriteReference(slot - 1);
    return;
  }
  if (depth >= kDeepestObject) {
    throw std::runtime_error("Objects are nested deeper than " + std::to_string(kDeepestObject) + " levels");
  }
  const auto number = static_cast<std::uint32_t>(objects.size());
  objects.push_back(IdentityOf(object));
  slot = number + 1;
  Append(tag);
  Append(number);
  ++depth;
  if (tag == kPointer) {
    WriteString(object.GetRealClassName());
  }
  Append(object.Version());
  object.ReadAndWrite(*this, Persistent::Direction::kWrite, 0);
  --depth;
  EndCall();
}

// ---- the table of objects

// The slot that holds the object, or the free one where it would go.
std::size_t optstream::SlotOf(const Persistent* object) const {
  const std::size_t mask = slots.size() - 1;
  std::size_t slot = HashOf(object) & mask;
  while (slots[slot] != 0 && objects[slots[slot] - 1] != object) {
    slot = (slot + 1) & mask;
  }
  return slot;
}

// Keeps half of the slots free.
void optstream::MakeRoom() {
  if (2 * (objects.size() + 1) <= slots.size()) {
    return;
  }
  slots.assign(std::max(kFirstSlots, 4 * slots.size()), 0);
  for (std::size_t number = 0; number < objects.size(); ++number) {
    slots[SlotOf(objects[number])] = static_cast<std::uint32_t>(number + 1);
  }
}

}  // namespace panelglow
