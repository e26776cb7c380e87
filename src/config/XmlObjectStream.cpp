// XmlObject in object streams.
#include <algorithm>
#include <utility>

#include "config/ClassRegistration.h"
#include "config/XmlObject.h"
#include "config/iptstream.h"
#include "config/optstream.h"

namespace panelglow {

namespace {

[[maybe_unused]] const bool kIsRegistered = RegisterClass<XmlObject>("XmlObject");

template <class Item>
void WriteItems(optstream& out, XmlList<Item>& items) {
  out.WriteUnsigned(static_cast<std::uint32_t>(items.size()));
  for (Item& item : items) {
    out.WriteValue(item);
  }
}

// A list of so many items has its room at once; a longer one only as its items come in.
constexpr std::size_t kFirstRoom = 64;

// Reads `count` items behind those of the list. Where the list outgrows its room the stream is told where each of
// them has gone: it may refer to them later.
template <class Item, class Prepare>
void ReadItems(iptstream& in, std::uint32_t count, XmlList<Item>& items, Prepare prepare) {
  const std::size_t before = items.size();
  std::vector<std::uint32_t> numbers;  // of those that are read now
  const auto makeRoom = [&](std::size_t room) {
    XmlList<Item> larger;
    larger.reserve(room);
    for (std::size_t place = 0; place < items.size(); ++place) {
      larger.push_back(std::move(items[place]));
      if (place >= before) {
        in.Moved(numbers[place - before], &items[place], &larger.back());
      } else {
        in.Moved(&items[place], &larger.back());  // of an earlier value, or not of this stream
      }
    }
    items = std::move(larger);
  };
  const std::size_t wanted = before + std::min<std::size_t>(count, kFirstRoom);
  if (wanted > items.capacity()) {
    makeRoom(wanted);
  }
  for (std::uint32_t i = 0; i < count; ++i) {
    if (items.size() == items.capacity()) {
      makeRoom(std::min<std::size_t>(before + count, 2 * items.size()));
    }
    Item& item = items.emplace_back();
    prepare(item);
    const std::uint32_t number = in.ReadValue(item);
    if (count > kFirstRoom) {
      numbers.push_back(number);
    }
  }
}

}  // namespace

void XmlObject::ReadAndWrite(ptstream& stream, Direction direction, unsigned int /*version*/) {
  if (direction == Direction::kWrite) {
    WriteTo(static_cast<optstream&>(stream));
  } else {
    ReadFrom(static_cast<iptstream&>(stream));
  }
}

void XmlObject::WriteTo(optstream& out) {
  out.WriteString(name);
  out.WriteString(value);
  out.WritePointerIfSeen(parent);
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
  name = in.ReadText();
  value = in.ReadText();
  in.LookAtPointer();  // parent and depth are those of the place that this element is read into
  in.ReadInteger();
  const auto asItIs = [](XmlAttribute& /*attribute*/) {};
  ReadItems(in, in.ReadUnsigned(), attributes, asItIs);
  if (const std::uint32_t count = in.ReadUnsigned(); count > 0) {
    ReadItems(in, count, GetProlog().declaration, asItIs);
  }
  for (std::uint32_t count = in.ReadUnsigned(); count > 0; --count) {
    GetProlog().instructions.emplace_back(in.ReadText());
  }
  ReadItems(in, in.ReadUnsigned(), children, [this](XmlObject& child) {
    child.parent = this;
    child.depth = depth + 1;
  });
  LinkChildren();
}

}  // namespace panelglow
