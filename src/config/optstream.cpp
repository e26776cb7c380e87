#include "config/optstream.h"

#include <algorithm>
#include <array>
#include <stdexcept>

namespace panelglow {

namespace {

constexpr std::size_t kLargePiece = std::size_t{1} << 16U;
constexpr std::size_t kFirstSlots = 64;  // a power of two

// Neighbours in memory are neighbours in the table, page by page, since they are written one behind the other; the
// pages are scattered.
std::size_t HashOf(const Persistent* object) {
  const std::uint64_t address = reinterpret_cast<std::uintptr_t>(object);
  const std::uint64_t page = (address >> 12U) * 0x9E3779B97F4A7C15U >> 32U;
  return static_cast<std::size_t>(page << 9U | (address >> 3U & 0x1FFU));
}

const Persistent* IdentityOf(const Persistent& object) { return &object; }
const Persistent* IdentityOf(const PersistentByProxy& object) { return &object.GetProxy(); }

}  // namespace

// ---- bytes: gathered, and handed on in large pieces and at the end of each call from outside

void optstream::Append(std::uint32_t value) {
  const std::array<char, sizeof(value)> raw{static_cast<char>(value), static_cast<char>(value >> 8U),
                                            static_cast<char>(value >> 16U), static_cast<char>(value >> 24U)};
  waiting.append(raw.data(), raw.size());
}

void optstream::Flush() {
  if (depth > 0 && waiting.size() < kLargePiece) {
    return;
  }
  const auto length = static_cast<std::streamsize>(waiting.size());
  const bool written = bytes.good() && bytes.rdbuf()->sputn(waiting.data(), length) == length;
  waiting.clear();
  if (!written) {
    bytes.setstate(std::ios::badbit);
    throw std::runtime_error("The stream cannot be written");
  }
}

void optstream::WriteUnsigned(std::uint32_t value) {
  Append(value);
  Flush();
}

void optstream::WriteString(std::string_view text) {
  const auto length = static_cast<std::uint32_t>(text.size());
  if (length != text.size()) {
    throw std::runtime_error("A text of more than 4 GB");
  }
  Append(length);
  waiting += text;
  Flush();
}

// ---- objects

void optstream::WriteValue(Persistent& object) { WriteObject(kValue, object); }
void optstream::WriteValue(PersistentByProxy& object) { WriteObject(kValue, object); }

void optstream::WritePointer(Persistent* object) { object == nullptr ? WriteNull() : WriteObject(kPointer, *object); }

void optstream::WritePointer(PersistentByProxy* object) {
  object == nullptr ? WriteNull() : WriteObject(kPointer, *object);
}

void optstream::WriteNull() {
  waiting += static_cast<char>(kNull);
  Flush();
}

template <class Object>
void optstream::WriteObject(std::uint8_t tag, Object& object) {
  MakeRoom();
  Slot& slot = slots[SlotOf(IdentityOf(object))];
  if (slot.object != nullptr) {
    waiting += static_cast<char>(kReference);
    Append(slot.number);
    Flush();
    return;
  }
  if (depth >= kDeepestObject) {
    throw std::runtime_error("Objects are nested deeper than " + std::to_string(kDeepestObject) + " levels");
  }
  slot = {IdentityOf(object), count++};
  waiting += static_cast<char>(tag);
  Append(slot.number);
  ++depth;
  if (tag == kPointer) {
    WriteString(object.GetRealClassName());
  }
  Append(object.Version());
  object.ReadAndWrite(*this, Persistent::Direction::kWrite, 0);
  --depth;
  Flush();
}

// ---- the table of objects

bool optstream::HasSeen(const Persistent* object) const {
  return object != nullptr && !slots.empty() && slots[SlotOf(object)].object != nullptr;
}

// The slot that holds the object, or the free one where it would go.
std::size_t optstream::SlotOf(const Persistent* object) const {
  const std::size_t mask = slots.size() - 1;
  std::size_t slot = HashOf(object) & mask;
  while (slots[slot].object != nullptr && slots[slot].object != object) {
    slot = (slot + 1) & mask;
  }
  return slot;
}

// Keeps half of the slots free.
void optstream::MakeRoom() {
  if (2 * (std::size_t{count} + 1) <= slots.size()) {
    return;
  }
  std::vector<Slot> before(std::max(kFirstSlots, 2 * slots.size()));
  before.swap(slots);
  for (const Slot& slot : before) {
    if (slot.object != nullptr) {
      slots[SlotOf(slot.object)] = slot;
    }
  }
}

}  // namespace panelglow
