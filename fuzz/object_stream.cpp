// Object streams: the first byte says how many records are read, and which of them through pointers.
#include <sstream>
#include <stdexcept>

#include "FuzzTarget.h"
#include "config/XmlObject.h"
#include "config/iptstream.h"
#include "config/optstream.h"

namespace panelglow::fuzz {
namespace {

constexpr std::size_t kMostRecords = 4;

// A tree that was read is written, and reads the same.
void RoundTrip(XmlObject& tree) {
  std::stringstream bytes;
  optstream(bytes).WriteValue(tree);
  XmlObject again;
  iptstream(bytes).ReadValue(again);
  Check(again.ToString(false) == tree.ToString(false), "a tree comes back as it was written");
}

void Run(std::string_view bytes) {
  if (bytes.empty()) {
    return;
  }
  const auto how = static_cast<unsigned char>(bytes.front());
  std::istringstream stream{std::string(bytes.substr(1))};
  iptstream in(stream);
  XmlObject values[kMostRecords];
  Persistent* pointers[kMostRecords]{};
  try {
    for (std::size_t i = 0; i < kMostRecords; ++i) {
      if ((how >> i & 1U) != 0) {
        in.ReadPointer(pointers[i]);
      } else {
        in.ReadValue(values[i]);
      }
    }
  } catch (const std::runtime_error&) {
  }
  for (XmlObject& value : values) {
    RoundTrip(value);
  }
  for (Persistent* pointer : pointers) {
    if (auto* tree = dynamic_cast<XmlObject*>(pointer)) {
      Check(!tree->ToString(false).empty() || tree->name.empty(), "an object that was made is whole");
    }
  }
}

const Registered kTarget("object_stream", Run);

}  // namespace
}  // namespace panelglow::fuzz
