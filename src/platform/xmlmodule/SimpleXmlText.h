// A libxml2 document as text for a simple reader.
#pragma once

#include <libxml/tree.h>

#include <optional>
#include <string>

#include "platform/XmlDocuments.h"

namespace panelglow::platform {

/// See XmlDocument::SimpleText.
std::optional<std::string> SimpleXmlText(const xmlDoc& document, XmlProblem& problem);

}  // namespace panelglow::platform
