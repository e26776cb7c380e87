#include "config/XmlAttribute.h"

#include <stdexcept>

namespace panelglow {

void XmlAttribute::ReadAndWrite(ptstream& /*stream*/, Direction /*direction*/, unsigned int /*version*/) {
  throw std::logic_error("object streams are not available yet");
}

void XmlAttribute::CopyFrom(const Persistent* other) {
  const auto* source = dynamic_cast<const XmlAttribute*>(other);
  if (source != nullptr && source != this) {
    *this = *source;
  }
}

}  // namespace panelglow
