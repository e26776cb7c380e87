// XML text: what was parsed is written, and parses again.
#include <stdexcept>

#include "FuzzTarget.h"
#include "config/XmlObject.h"

namespace panelglow::fuzz {
namespace {

// A name that ends in "--" or "/" makes another mark of the bracket behind it.
bool CanBeReadAgain(const XmlObject& object) {
  const std::string_view name = object.name;
  if (name.find("--") != std::string_view::npos || name.ends_with('/')) {
    return false;
  }
  for (const XmlObject& child : object.children) {
    if (!CanBeReadAgain(child)) {
      return false;
    }
  }
  return true;
}

void Run(std::string_view bytes) {
  XmlObject tree;
  try {
    tree = XmlObject(std::string(bytes));
  } catch (const std::runtime_error&) {
    return;
  }
  const std::string text = tree.ToString(true);
  if (CanBeReadAgain(tree)) {
    Check(XmlObject(text).ToString(true) == text, "a tree that is read again is written the same");
    XmlObject(tree.ToString(false));  // indentation goes into texts, but does no harm
  }
}

const Registered kTarget("xml_text", Run);

}  // namespace
}  // namespace panelglow::fuzz
