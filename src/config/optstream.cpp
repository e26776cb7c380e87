#include "config/optstream.h"

#include <array>
#include <limits>
#include <stdexcept>

namespace panelglow {

namespace {

const Persistent* IdentityOf(const Persistent& object) { return &object; }
const Persistent* IdentityOf(const PersistentByProxy& object) { return &object.GetProxy(); }

}  // namespace

void optstream::WriteUnsigned(std::uint32_t value) {
  std::array<unsigned char, 4> raw{};
  for (std::size_t i = 0; i < raw.size(); ++i) {
    raw[i] = static_cast<unsigned char>(value >> (8 * i));
  }
  Write(raw.data(), raw.size());
}

void optstream::WriteString(std::string_view text) {
  const auto length = static_cast<std::uint32_t>(text.size());
  if (length != text.size()) {
    throw std::runtime_error("A text of more than 4 GB");
  }
  WriteUnsigned(length);
  Write(text.data(), text.size());
}

void optstream::WriteValue(Persistent& object) { WriteObject(kValue, object); }
void optstream::WriteValue(PersistentByProxy& object) { WriteObject(kValue, object); }

void optstream::WritePointer(Persistent* object) {
  object == nullptr ? WriteByte(kNull) : WriteObject(kPointer, *object);
}

void optstream::WritePointer(PersistentByProxy* object) {
  object == nullptr ? WriteByte(kNull) : WriteObject(kPointer, *object);
}

template <class Object>
void optstream::WriteObject(std::uint8_t tag, Object& object) {
  const auto number = static_cast<std::uint32_t>(numbers.size());
  const auto [known, isNew] = numbers.emplace(IdentityOf(object), number);
  if (!isNew) {
    WriteByte(kReference);
    WriteUnsigned(known->second);
    return;
  }
  if (depth >= kDeepestObject) {
    throw std::runtime_error("Objects are nested deeper than " + std::to_string(kDeepestObject) + " levels");
  }
  WriteByte(tag);
  WriteUnsigned(number);
  if (tag == kPointer) {
    WriteString(object.GetRealClassName());
  }
  WriteUnsigned(object.Version());
  ++depth;
  object.ReadAndWrite(*this, Persistent::Direction::kWrite, 0);
  --depth;
}

void optstream::Write(const void* data, std::size_t size) {
  const auto length = static_cast<std::streamsize>(size);
  if (!bytes.good() || bytes.rdbuf()->sputn(static_cast<const char*>(data), length) != length) {
    bytes.setstate(std::ios::badbit);
    throw std::runtime_error("The stream cannot be written");
  }
}

}  // namespace panelglow
