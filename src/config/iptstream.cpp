#include "config/iptstream.h"

#include <algorithm>
#include <array>
#include <limits>
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

// ---- integers and texts

std::uint32_t iptstream::ReadUnsigned() {
  std::array<unsigned char, 4> raw{};
  Read(raw.data(), raw.size());
  std::uint32_t value = 0;
  for (std::size_t i = 0; i < raw.size(); ++i) {
    value |= static_cast<std::uint32_t>(raw[i]) << (8 * i);
  }
  return value;
}

void iptstream::ReadString(std::string& text) {
  text.clear();
  for (std::uint32_t left = ReadUnsigned(); left > 0;) {
    const std::uint32_t step = std::min(left, kLargestStep);
    const std::size_t had = text.size();
    text.resize(had + step);
    Read(text.data() + had, step);
    left -= step;
  }
}

std::uint8_t iptstream::ReadByte() {
  std::uint8_t value = 0;
  Read(&value, 1);
  return value;
}

void iptstream::Read(void* data, std::size_t size) {
  if (broken) {
    throw std::runtime_error("The stream has failed before");
  }
  const auto length = static_cast<std::streamsize>(size);
  if (!bytes.good() || bytes.rdbuf()->sgetn(static_cast<char*>(data), length) != length) {
    bytes.setstate(std::ios::eofbit | std::ios::failbit);
    Fail("The stream ends too early");
  }
}

// What failed leaves objects half read and on their way out: nothing may follow it, and no pointer may lead to them.
void iptstream::Fail(const std::string& message) {
  Break();
  throw std::runtime_error(message);
}

void iptstream::Break() {
  broken = true;
  for (const indexed_pointer& entry : table) {
    if (entry.links == nullptr) {
      continue;
    }
    for (const Location& location : entry.links->locations) {
      std::visit([](auto* pointer) { *pointer = nullptr; }, location);
    }
    entry.links->locations.clear();
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
  if (entry.links == nullptr || OwnedOf<Object>(*entry.links) == nullptr) {
    target.CopyFrom(object);
    return;
  }
  target.MoveFrom(*object);
  PutAt(entry, IdentityOf(target));
  OwnedOf<Object>(*entry.links).reset();
}

// The object of the entry is at another place now; the pointers that were filled with it follow.
void iptstream::PutAt(indexed_pointer& entry, Persistent* place) {
  entry.object = place;
  if (entry.links == nullptr) {
    return;
  }
  for (const Location& location : entry.links->locations) {
    if (Persistent** const* pointer = std::get_if<Persistent**>(&location)) {
      **pointer = place;
    } else {
      *std::get<PersistentByProxy**>(location) = ObjectOf<PersistentByProxy>(entry);
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
  entry.height = deepest - depth;
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
      LinksOf(number).locations.emplace_back(&pointer);
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
  std::unique_ptr<Object>& owned = OwnedOf<Object>(LinksOf(number));
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

iptstream::Links& iptstream::LinksOf(std::uint32_t number) {
  std::unique_ptr<Links>& links = table[number].links;
  if (links == nullptr) {
    links = std::make_unique<Links>();
  }
  return *links;
}

template <class Object>
std::unique_ptr<Object>& iptstream::OwnedOf(Links& links) {
  if constexpr (std::is_same_v<Object, Persistent>) {
    return links.owned;
  } else {
    return links.ownedByProxy;
  }
}

std::unique_ptr<Persistent> iptstream::Take(const Persistent* object) { return TakeOwned(object); }
std::unique_ptr<PersistentByProxy> iptstream::Take(const PersistentByProxy* object) { return TakeOwned(object); }

template <class Object>
std::unique_ptr<Object> iptstream::TakeOwned(const Object* object) {
  for (indexed_pointer& entry : table) {
    if (object != nullptr && entry.links != nullptr && OwnedOf<Object>(*entry.links).get() == object) {
      return std::move(OwnedOf<Object>(*entry.links));
    }
  }
  return nullptr;
}

void iptstream::Moved(std::uint32_t number, const Persistent* from, Persistent* to) {
  indexed_pointer& entry = EntryOf(number);
  if (entry.object == from) {
    PutAt(entry, to);
  }
}

}  // namespace panelglow
