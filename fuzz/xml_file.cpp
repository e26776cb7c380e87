// XML files in every way that a file is loaded: the first byte says which.
#include <stdexcept>

#include "FuzzTarget.h"
#include "config/XmlObject.h"

namespace panelglow::fuzz {
namespace {

// What comes back of a tree that is saved, be it a failure.
std::string Reloaded(const XmlObject& tree, bool scrambled) {
  tree.SaveToFile("f.xml", scrambled, false);
  XmlObject again;
  try {
    return again.LoadFromFile("f.xml", scrambled, false, -1) ? again.ToString(true) : "nothing";
  } catch (const std::runtime_error& failure) {
    return failure.what();
  }
}

void Run(std::string_view bytes) {
  if (bytes.empty()) {
    return;
  }
  const auto how = static_cast<unsigned char>(bytes.front());
  const bool scrambled = (how & 1U) != 0;
  const bool wrap = (how & 2U) != 0;
  const int index = static_cast<int>(how >> 2U & 7U) - 1;
  XmlObject tree;
  try {
    if (!tree.LoadFromFile(PutFile("f.xml", bytes.substr(1)), scrambled, wrap, index)) {
      return;
    }
  } catch (const std::runtime_error&) {
    return;
  }
  // Two bytes, which no UTF-8 text has, end the scrambled form.
  if (tree.ToString(false).find_first_of("\xC0\xC1") == std::string::npos) {
    Check(Reloaded(tree, true) == Reloaded(tree, false), "the scrambled form holds the same tree");
  }
}

const Registered kTarget("xml_file", Run);

}  // namespace
}  // namespace panelglow::fuzz
