#include "config/iptstream.h"

#include <algorithm>
#include <array>
#include <stdexcept>
#include <type_traits>
#include <utility>

#include "config/ClassRegistration.h"

namespace panelglow {

namespace {

// A text's length is not believed before its bytes are there.
constexpr std::uint32_t kLargestStep = 1U << 16U;

Persistent* IdentityOf(Persistent& object) { return &object; }
Persistent* IdentityOf(PersistentByProxy& object) { return &object.GetProxy(); }

}  // namespace

// ---- bytes, integers and texts

void iptstream::Read(char* data, std::size_t size) {
  if (broken) {
    throw std::runtime_error("The stream has failed before");
  }
  const auto length = static_cast<std::streamsize>(size);
  if (!bytes.good() || bytes.rdbuf()->sgetn(data, length) != length) {
    bytes.setstate(std::ios::eofbit | std::ios::failbit);
    Fail("The stream ends too early");
  }
}

inline std::uint8_t iptstream::ReadByte() {
  char value = 0;
  Read(&value, 1);
  return static_cast<std::uint8_t>(value);
}

std::uint32_t iptstream::ReadUnsigned() {
  std::array<char, 4> raw{};
  Read(raw.data(), raw.size());
  const auto byte = [&](std::size_t i) { return std::uint32_t{static_cast<std::uint8_t>(raw[i])} << (8 * i); };
  return byte(0) | byte(1) | byte(2) | byte(3);
}

std::string_view iptstream::ReadText() {
  // Piece by piece: a length that lies takes no more memory than the stream has bytes.
  text.clear();
  for (std::uint32_t left = ReadUnsigned(); left > 0;) {
    const std::uint32_t step = std::min(left, kLargestStep);
    const std::size_t had = text.size();
    text.resize(had + step);
    Read(text.data() + had, step);
    left -= step;
  }
  return text;
}

// What failed leaves objects half read and on their way out: nothing may follow it, and no pointer may lead to them.
void iptstream::Fail(const std::string& message) {
  Break();
  throw std::runtime_error(message);
}

void iptstream::Break() {
  broken = true;
  for (auto& [number, linked] : links) {
    for (const Location& location : linked.locations) {
      std::visit([](auto* pointer) { *pointer = nullptr; }, location);
    }
    linked.locations.clear();
  }
}

// Runs a call from outside. What a class throws breaks the stream as well.
template <class Call>
auto iptstream::Guarded(Call call) {
  if (depth > 0) {
    return call();
  }
  try {
    return call();
  } catch (...) {
    Break();
    throw;
  }
}

// ---- values

std::uint32_t iptstream::ReadValue(Persistent& target) {
  return Guarded([&] { return ReadValueRecord(target); });
}
std::uint32_t iptstream::ReadValue(PersistentByProxy& target) {
  return Guarded([&] { return ReadValueRecord(target); });
}

template <class Object>
std::uint32_t iptstream::ReadValueRecord(Object& target) {
  const std::uint8_t tag = ReadByte();
  if (tag == kReference) {
    const std::uint32_t number = ReadUnsigned();
    PlaceAt(target, number);
    return number;
  }
  if (tag != kValue) {
    Fail("Invalid byte value");
  }
  const std::uint32_t number = ReadNewNumber();
  indexed_pointer& entry = table.emplace_back();
  entry.object = IdentityOf(target);
  entry.isPart = depth > 0;
  ReadPayload(target, number);
  return number;
}

// The object of this number lives, for the writer, where `target` is. A part can be the place of an object once: no
// stream makes copies of copies.
template <class Object>
void iptstream::PlaceAt(Object& target, std::uint32_t number) {
  indexed_pointer& entry = EntryOf(number);
  Object* const object = ObjectOf<Object>(entry);
  if (object == &target) {
    return;
  }
  if (!entry.complete) {
    Fail("Indexed object is still being read.");
  }
  // A part is new when it is read into; what a caller hands in may have parts already that pointers of the stream go
  // to.
  if (depth == 0 && std::any_of(table.begin(), table.end(),
                                [&](const indexed_pointer& known) { return known.object == IdentityOf(target); })) {
    Fail("The object that is read into has been read from this stream before.");
  }
  if (object->GetRealClassName() != target.GetRealClassName()) {
    Fail("Indexed object is of another class: " + object->GetRealClassName());
  }
  if (depth > 0) {
    if (std::exchange(entry.isPart, true)) {
      Fail("Indexed object has another place already.");
    }
    const std::uint32_t reached = depth + 1 + entry.height;
    CheckDepth(reached);
    deepest = std::max(deepest, reached);
  }
  const auto linked = links.find(number);
  if (linked == links.end() || OwnedOf<Object>(linked->second) == nullptr) {
    target.CopyFrom(object);
    return;
  }
  target.MoveFrom(*object);
  PutAt(number, IdentityOf(target));
  OwnedOf<Object>(linked->second).reset();
}

// The object is at another place now; the pointers that were filled with it follow.
void iptstream::PutAt(std::uint32_t number, Persistent* place) {
  table[number].object = place;
  const auto linked = links.find(number);
  if (linked == links.end()) {
    return;
  }
  for (const Location& location : linked->second.locations) {
    if (Persistent** const* pointer = std::get_if<Persistent**>(&location)) {
      **pointer = place;
    } else {
      *std::get<PersistentByProxy**>(location) = ObjectOf<PersistentByProxy>(table[number]);
    }
  }
}

template <class Object>
void iptstream::ReadPayload(Object& object, std::uint32_t number) {
  const std::uint32_t version = ReadUnsigned();
  const std::uint32_t deepestBefore = std::exchange(deepest, depth + 1);
  CheckDepth(++depth);
  object.ReadAndWrite(*this, Persistent::Direction::kRead, version);
  indexed_pointer& entry = table[number];
  entry.height = static_cast<std::uint16_t>(deepest - depth);  // no more than kDeepestObject
  entry.complete = true;
  deepest = std::max(deepest, deepestBefore);
  --depth;
}

void iptstream::CheckDepth(std::uint32_t level) {
  if (level > kDeepestObject) {
    Fail("Objects are nested deeper than " + std::to_string(kDeepestObject) + " levels");
  }
}

// ---- pointers

void iptstream::ReadPointer(Persistent*& pointer) { FillPointer(pointer); }
void iptstream::ReadPointer(PersistentByProxy*& pointer) { FillPointer(pointer); }

Persistent* iptstream::LookAtPointer() {
  return Guarded([this] {
    std::uint32_t number = 0;
    return ReadPointerRecord<Persistent>(number);
  });
}

template <class Object>
void iptstream::FillPointer(Object*& pointer) {
  Guarded([&] {
    std::uint32_t number = 0;
    pointer = ReadPointerRecord<Object>(number);
    if (pointer != nullptr) {
      links[number].locations.emplace_back(&pointer);
    }
  });
}

template <class Object>
Object* iptstream::ReadPointerRecord(std::uint32_t& number) {
  switch (ReadByte()) {
    case kNull:
      return nullptr;
    case kReference:
      number = ReadUnsigned();
      return ObjectOf<Object>(EntryOf(number));
    case kPointer: {
      number = ReadNewNumber();
      std::string className;
      ReadString(className);
      Object* const object = Make<Object>(className, number);
      ReadPayload(*object, number);
      return object;
    }
    default:
      Fail("Invalid byte value");
  }
}

template <class Object>
Object* iptstream::Make(const std::string& className, std::uint32_t number) {
  const ClassRegistration* registration = FindClass(className);
  std::unique_ptr<Object> object;
  if constexpr (std::is_same_v<Object, Persistent>) {
    object = registration == nullptr || registration->create == nullptr ? nullptr : registration->create();
  } else {
    object =
        registration == nullptr || registration->createByProxy == nullptr ? nullptr : registration->createByProxy();
  }
  if (object == nullptr) {
    Fail("Attempting to stream ungegistered class: " + className);
  }
  table.emplace_back().object = IdentityOf(*object);
  std::unique_ptr<Object>& owned = OwnedOf<Object>(links[number]);
  owned = std::move(object);
  return owned.get();
}

// ---- the table

std::uint32_t iptstream::ReadNewNumber() {
  const std::uint32_t number = ReadUnsigned();
  if (number != table.size()) {
    Fail("Object number " + std::to_string(number) + " where " + std::to_string(table.size()) + " is next");
  }
  return number;
}

iptstream::indexed_pointer& iptstream::EntryOf(std::uint32_t number) {
  if (number >= table.size()) {
    Fail("Indexed object not found.");
  }
  return table[number];
}

template <class Object>
Object* iptstream::ObjectOf(const indexed_pointer& entry) {
  if constexpr (std::is_same_v<Object, Persistent>) {
    return entry.object;
  } else {
    const auto* proxy = dynamic_cast<const StreamProxy*>(entry.object);
    if (proxy == nullptr) {
      Fail("Indexed object pointer NULL");
    }
    if (proxy->GetOwner() == nullptr) {
      Fail("PersistentByProxy proxyOwner is NULL");
    }
    return proxy->GetOwner();
  }
}

template <class Object>
std::unique_ptr<Object>& iptstream::OwnedOf(Links& linked) {
  if constexpr (std::is_same_v<Object, Persistent>) {
    return linked.owned;
  } else {
    return linked.ownedByProxy;
  }
}

std::unique_ptr<Persistent> iptstream::Take(const Persistent* object) { return TakeOwned(object); }
std::unique_ptr<PersistentByProxy> iptstream::Take(const PersistentByProxy* object) { return TakeOwned(object); }

template <class Object>
std::unique_ptr<Object> iptstream::TakeOwned(const Object* object) {
  for (auto& [number, linked] : links) {
    if (object != nullptr && OwnedOf<Object>(linked).get() == object) {
      return std::move(OwnedOf<Object>(linked));
    }
  }
  return nullptr;
}

void iptstream::Moved(std::uint32_t number, const Persistent* from, Persistent* to) {
  if (EntryOf(number).object == from) {
    PutAt(number, to);
  }
}

void iptstream::Moved(const Persistent* from, Persistent* to) {
  for (std::uint32_t number = 0; number < table.size(); ++number) {
    if (table[number].object == from) {
      PutAt(number, to);
    }
  }
}

}  // namespace panelglow
