// XmlObject in object streams.
#include <deque>
#include <utility>

#include "config/ClassRegistration.h"
#include "config/XmlObject.h"
#include "config/iptstream.h"
#include "config/optstream.h"

namespace panelglow {

namespace {

[[maybe_unused]] const bool kIsRegistered = RegisterClass<XmlObject>("XmlObject");

template <class Item>
void WriteItems(optstream& out, std::vector<Item>& items) {
  out.WriteUnsigned(static_cast<std::uint32_t>(items.size()));
  for (Item& item : items) {
    out.WriteValue(item);
  }
}

// Reads `count` items behind those of the list. They are read where they can stay until all are there, and the stream
// is told where each of them has gone: it may refer to them later.
template <class Item, class Prepare>
void ReadItems(iptstream& in, std::uint32_t count, std::vector<Item>& items, Prepare prepare) {
  if (count == 0) {
    return;
  }
  std::deque<std::pair<std::uint32_t, Item>> read;
  for (std::uint32_t i = 0; i < count; ++i) {
    auto& [number, item] = read.emplace_back();
    prepare(item);
    number = in.ReadValue(item);
  }
  items.reserve(items.size() + read.size());
  for (auto& [number, item] : read) {
    items.push_back(std::move(item));
    in.Moved(number, &item, &items.back());
  }
}

}  // namespace

void XmlObject::ReadAndWrite(ptstream& stream, Direction direction, unsigned int /*version*/) {
  if (direction == Direction::kWrite) {
    WriteTo(dynamic_cast<optstream&>(stream));
  } else {
    ReadFrom(dynamic_cast<iptstream&>(stream));
  }
}

void XmlObject::WriteTo(optstream& out) {
  out.WriteString(name);
  out.WriteString(value);
  out.WritePointer(out.HasSeen(parent) ? parent : nullptr);
  out.WriteInteger(depth);
  WriteItems(out, attributes);
  Prolog nothing;
  Prolog& ahead = prolog == nullptr ? nothing : *prolog;
  WriteItems(out, ahead.declaration);
  out.WriteUnsigned(static_cast<std::uint32_t>(ahead.instructions.size()));
  for (const std::string& instruction : ahead.instructions) {
    out.WriteString(instruction);
  }
  WriteItems(out, children);
}

void XmlObject::ReadFrom(iptstream& in) {
  std::string text;
  in.ReadString(text);
  name = text;
  in.ReadString(text);
  value = text;
  in.LookAtPointer();  // parent and depth are those of the place that this element is read into
  in.ReadInteger();
  const auto asItIs = [](XmlAttribute& /*attribute*/) {};
  ReadItems(in, in.ReadUnsigned(), attributes, asItIs);
  if (const std::uint32_t count = in.ReadUnsigned(); count > 0) {
    ReadItems(in, count, GetProlog().declaration, asItIs);
  }
  for (std::uint32_t count = in.ReadUnsigned(); count > 0; --count) {
    in.ReadString(text);
    GetProlog().instructions.push_back(text);
  }
  ReadItems(in, in.ReadUnsigned(), children, [this](XmlObject& child) {
    child.parent = this;
    child.depth = depth + 1;
  });
  LinkChildren();
}

}  // namespace panelglow
