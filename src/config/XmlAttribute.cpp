#include "config/XmlAttribute.h"

#include "config/ClassRegistration.h"
#include "config/iptstream.h"
#include "config/optstream.h"

namespace panelglow {

namespace {

[[maybe_unused]] const bool kIsRegistered = RegisterClass<XmlAttribute>("XmlAttribute");

}  // namespace

void XmlAttribute::ReadAndWrite(ptstream& stream, Direction direction, unsigned int /*version*/) {
  if (direction == Direction::kWrite) {
    auto& out = static_cast<optstream&>(stream);
    out.WriteString(name);
    out.WriteString(value);
    return;
  }
  auto& in = static_cast<iptstream&>(stream);
  name = in.ReadText();
  value = in.ReadText();
}

void XmlAttribute::CopyFrom(const Persistent* other) {
  const auto* source = dynamic_cast<const XmlAttribute*>(other);
  if (source != nullptr && source != this) {
    *this = *source;
  }
}

}  // namespace panelglow
