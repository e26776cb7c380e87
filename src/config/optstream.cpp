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

void optstream::Append(std::string_view text) {
  if (text.size() > kPiece) {
    HandOn();
    Put(text);
  } else {
    std::copy(text.begin(), text.end(), RoomFor(text.size()));
  }
}

inline void optstream::Append(std::uint8_t value) { *RoomFor(1) = static_cast<char>(value); }

inline void optstream::Append(std::uint32_t value) {
  char* const room = RoomFor(sizeof(value));
  for (std::size_t i = 0; i < sizeof(value); ++i) {
    room[i] = static_cast<char>(value >> (8 * i));
  }
}

inline void optstream::EndCall() {
  if (depth == 0) {
    HandOn();
  }
}

void optstream::HandOn() {
  if (waiting.empty()) {
    waiting.resize(kPiece);
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
  Append(length);
  Append(text);
  EndCall();
}

// ---- objects

void optstream::WriteValue(Persistent& object) { WriteObject(kValue, object); }
void optstream::WriteValue(PersistentByProxy& object) { WriteObject(kValue, object); }

void optstream::WritePointer(Persistent* object) { object == nullptr ? WriteNull() : WriteObject(kPointer, *object); }

void optstream::WritePointer(PersistentByProxy* object) {
  object == nullptr ? WriteNull() : WriteObject(kPointer, *object);
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
    Append(kReference);
    Append(slot - 1);
    EndCall();
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

bool optstream::HasSeen(const Persistent* object) const {
  return object != nullptr && !slots.empty() && slots[SlotOf(object)] != 0;
}

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
