#include "config/XmlObject.h"

#include <algorithm>
#include <array>
#include <ostream>
#include <stdexcept>
#include <utility>

#include "config/XmlCharacters.h"
#include "config/XmlParser.h"
#include "harness/base/CDMUtil.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::string_view kWrapperName = "xmlIndex";

// The fixed key of the scrambled form. A scrambled byte of 0 would end the text. With "?" and "@" that could only
// come of the bytes 0xC1 and 0xC0, which UTF-8 never has, so that no such text is cut.
constexpr std::string_view kScramblingKey = "@?@@?@??@?@@@??@@?@?@??@@??@?@@??@?@@?@@@?@??@?@@?@??@@?@?@@??@?@@?";
static_assert(kScramblingKey.size() == 67);

// Adds (or, with `sign` -1, takes away) the repeating key, up to the first byte that is zero.
void ApplyKey(std::string& text, int sign) {
  for (std::size_t i = 0; i < text.size() && text[i] != '\0'; ++i) {
    const int key = static_cast<unsigned char>(kScramblingKey[i % kScramblingKey.size()]);
    text[i] = static_cast<char>(static_cast<unsigned char>(static_cast<unsigned char>(text[i]) + sign * key));
  }
}

// The escaped form of one character, empty when it stands for itself.
std::string_view Escape(char c, bool inAttribute) {
  switch (c) {
    case '<':
      return "&lt;";
    case '>':
      return "&gt;";
    case '&':
      return "&amp;";
    case '\t':
      return "&#09;";
    case '\n':
      return "&#10;";
    case '\r':
      return "&#13;";
    case '"':
      return inAttribute ? "&quot;" : "";
    default:
      return "";
  }
}

void AppendEscaped(std::string& out, std::string_view text, bool inAttribute) {
  std::size_t written = 0;
  for (std::size_t i = 0; i < text.size(); ++i) {
    const std::string_view escaped = Escape(text[i], inAttribute);
    if (!escaped.empty()) {
      out.append(text, written, i - written) += escaped;
      written = i + 1;
    }
  }
  out.append(text, written);
}

void AppendAttribute(std::string& out, const XmlAttribute& attribute) {
  out += ' ';
  out += attribute.name;
  out += "=\"";
  AppendEscaped(out, attribute.value, true);
  out += '"';
}

template <class Attributes>
auto FindIn(Attributes& attributes, std::string_view name) {
  return std::find_if(attributes.begin(), attributes.end(),
                      [&](const XmlAttribute& a) { return CDMUtil::EqualIgnoreCase(a.name, name); });
}

XmlAttribute* SetIn(XmlList<XmlAttribute>& attributes, std::string_view name, std::string_view value) {
  const std::string_view stored = XmlCharactersOf(value);
  const auto found = FindIn(attributes, name);
  if (found != attributes.end()) {
    found->value = stored;
    return &*found;
  }
  return &attributes.emplace_back(std::string(name), std::string(stored));
}

template <class Number>
std::string Streamed(Number number) {
  std::ostringstream text;
  text << number;
  return text.str();
}

}  // namespace

XmlObject::XmlObject(const std::string& text) { XmlParser(text).ParseElement(*this); }

XmlObject::XmlObject(const XmlObject& other) : Persistent(other) { CopyContent(other); }

XmlObject& XmlObject::operator=(const XmlObject& other) {
  if (this != &other) {
    *this = XmlObject(other);
  }
  return *this;
}

XmlObject& XmlObject::operator=(XmlObject&& other) noexcept {
  if (this != &other) {
    name = std::move(other.name);
    value = std::move(other.value);
    attributes = std::move(other.attributes);
    prolog = std::move(other.prolog);
    // `other` may be a descendant of this object: take its children before the old ones go.
    XmlList<XmlObject> taken = std::move(other.children);
    const bool sameDepth = depth == other.depth;
    children = std::move(taken);
    if (sameDepth) {
      LinkChildren();
    } else {
      Relink();
    }
  }
  return *this;
}

void XmlObject::CopyFrom(const Persistent* other) {
  const auto* source = dynamic_cast<const XmlObject*>(other);
  if (source != nullptr && source != this) {
    *this = *source;
  }
}

void XmlObject::MoveFrom(Persistent& other) {
  auto* source = dynamic_cast<XmlObject*>(&other);
  if (source != nullptr && source != this) {
    *this = std::move(*source);
  }
}

void XmlObject::Clear() {
  name.clear();
  value.clear();
  attributes.clear();
  prolog.reset();
  children.clear();
}

// All but the place in a tree; this object is empty.
void XmlObject::CopyContent(const XmlObject& other) {
  name = other.name;
  value = other.value;
  attributes = other.attributes;
  prolog = other.prolog == nullptr ? nullptr : std::make_unique<Prolog>(*other.prolog);
  children.reserve(other.children.size());
  for (const XmlObject& child : other.children) {
    XmlObject& copy = children.emplace_back();
    copy.parent = this;
    copy.depth = depth + 1;
    copy.CopyContent(child);
  }
}

// Sets parent pointers and depths again through the whole subtree.
void XmlObject::Relink() {
  for (XmlObject& child : children) {
    child.parent = this;
    child.depth = depth + 1;
    child.Relink();
  }
}

// ---- file and text

bool XmlObject::LoadFromFile(const std::string& path, bool scrambled, bool wrap, int index) {
  std::optional<std::string> content = platform::TheHost().files.ReadLocked(path);
  if (!content || content->empty() || content->front() == '\0') {
    return false;
  }
  Clear();
  parent = nullptr;
  depth = 0;
  if (scrambled) {
    ApplyKey(*content, -1);
  }
  content->resize(std::min(content->find('\0'), content->size()));
  while (!content->empty() && IsXmlSpace(content->back())) {
    content->pop_back();
  }
  XmlParser parser(*content);
  if (!wrap && index < 0) {
    parser.ParseElement(*this);
    return true;
  }
  if (!wrap) {
    for (int i = 0; i < index; ++i) {
      if (!parser.SkipElement()) {
        return false;
      }
    }
    return parser.ParseElement(*this);
  }
  name = kWrapperName;
  bool added = false;
  for (int i = 0;; ++i) {
    if (index >= 0 && i != index) {
      if (i > index || !parser.SkipElement()) {
        return added;
      }
      continue;
    }
    XmlObject element;
    if (!parser.ParseElement(element)) {
      return added;
    }
    AddChild(std::move(element));
    added = true;
  }
}

bool XmlObject::SaveToFile(const std::string& path, bool scrambled, bool compact) const {
  TrySaveToFile(path, scrambled, compact);
  return true;
}

bool XmlObject::TrySaveToFile(const std::string& path, bool scrambled, bool compact) const {
  std::string text = ToString(compact);
  if (scrambled) {
    ApplyKey(text, 1);
  }
  return platform::TheHost().files.WriteLocked(path, text);
}

std::string XmlObject::ToString(bool compact) const {
  std::string text;
  Write(text, compact);
  return text;
}

void XmlObject::Write(std::string& out, bool compact) const {
  const auto& [declaration, instructions] = GetProlog();
  if (parent == nullptr && !declaration.empty()) {
    // The version comes first, whatever order the pairs were set in.
    out += "<?xml";
    const bool versionFirst = CDMUtil::EqualIgnoreCase(declaration.front().name, "version");
    if (!versionFirst) {
      AppendAttribute(out, {"version", GetDeclarationValue("version", "1.0")});
    }
    for (const XmlAttribute& pair : declaration) {
      if (versionFirst || !CDMUtil::EqualIgnoreCase(pair.name, "version")) {
        AppendAttribute(out, pair);
      }
    }
    out += "?>\n";
  }
  const std::size_t indentation = compact ? 0 : 2 * static_cast<std::size_t>(depth);
  const std::string_view lineEnd = compact ? "" : "\n";
  for (const std::string& instruction : instructions) {
    if (!instruction.empty()) {
      out.append(indentation, ' ') += instruction;
      out += '\n';
    }
  }
  if (!name.empty()) {
    out.append(indentation, ' ') += '<';
    out += name;
    for (const XmlAttribute& attribute : attributes) {
      if (!attribute.name.empty()) {
        AppendAttribute(out, attribute);
      }
    }
    if (children.empty() && value.empty()) {
      out += "/>";
      out += lineEnd;
      return;
    }
    out += '>';
  }
  AppendEscaped(out, value, false);
  if (!children.empty() && value.empty()) {
    out += lineEnd;
  }
  for (const XmlObject& child : children) {
    child.Write(out, compact);
  }
  if (!name.empty()) {
    if (!children.empty()) {
      out.append(indentation, ' ');
    }
    out += "</";
    out += name;
    out += '>';
    out += lineEnd;
  }
}

std::ostream& operator<<(std::ostream& stream, const XmlObject& object) { return stream << object.ToString(false); }

// ---- attributes

std::string XmlObject::GetAttributeValue(std::string_view attribute, std::string_view defaultValue) const {
  const XmlAttribute* found = FindAttribute(attribute);
  return found == nullptr ? std::string(defaultValue) : std::string(found->value);
}

XmlAttribute* XmlObject::FindAttribute(std::string_view attribute) {
  const auto found = FindIn(attributes, attribute);
  return found == attributes.end() ? nullptr : &*found;
}

const XmlAttribute* XmlObject::FindAttribute(std::string_view attribute) const {
  const auto found = FindIn(attributes, attribute);
  return found == attributes.end() ? nullptr : &*found;
}

XmlAttribute* XmlObject::SetAttribute(std::string_view attribute, const char* newValue) {
  return SetIn(attributes, attribute, newValue == nullptr ? "" : newValue);
}

XmlAttribute* XmlObject::SetAttribute(std::string_view attribute, const std::string& newValue) {
  return SetIn(attributes, attribute, newValue);
}

XmlAttribute* XmlObject::SetAttribute(std::string_view attribute, int newValue) {
  return SetIn(attributes, attribute, Streamed(newValue));
}

XmlAttribute* XmlObject::SetAttribute(std::string_view attribute, double newValue) {
  return SetIn(attributes, attribute, Streamed(newValue));
}

void XmlObject::RemoveAttribute(std::string_view attribute) {
  const std::string wanted(attribute);  // as above
  erase_if(attributes, [&](const XmlAttribute& a) { return CDMUtil::EqualIgnoreCase(a.name, wanted); });
}

const XmlObject::Prolog& XmlObject::GetProlog() const {
  static const Prolog nothing;
  return prolog == nullptr ? nothing : *prolog;
}

XmlObject::Prolog& XmlObject::GetProlog() {
  if (prolog == nullptr) {
    prolog = std::make_unique<Prolog>();
  }
  return *prolog;
}

std::string XmlObject::GetDeclarationValue(std::string_view attribute, std::string_view defaultValue) const {
  const auto found = FindIn(GetProlog().declaration, attribute);
  return found == GetProlog().declaration.end() ? std::string(defaultValue) : std::string(found->value);
}

XmlAttribute* XmlObject::FindDeclaration(std::string_view attribute) {
  const auto found = FindIn(GetProlog().declaration, attribute);
  return found == GetProlog().declaration.end() ? nullptr : &*found;
}

XmlAttribute* XmlObject::SetDeclaration(std::string_view attribute, const std::string& newValue) {
  return SetIn(GetProlog().declaration, attribute, newValue);
}

void XmlObject::RemoveDeclaration(std::string_view attribute) {
  erase_if(GetProlog().declaration,
           [&](const XmlAttribute& a) { return CDMUtil::EqualIgnoreCase(a.name, attribute); });
}

// ---- children

XmlObject* XmlObject::AddChild(const XmlObject& child) { return AddChild(XmlObject(child)); }

XmlObject* XmlObject::AddChild(XmlObject&& child) {
  // Sisters that move take the links of their own subtree along but lose the one to this object.
  const bool sistersMove = children.size() == children.capacity();
  XmlObject& added = children.emplace_back(std::move(child));
  added.parent = this;
  added.depth = depth + 1;
  added.Relink();
  if (sistersMove) {
    LinkChildren();
  }
  return &added;
}

void XmlObject::RemoveChildren(std::string_view childName) {
  const std::string wanted(childName);  // it may be the name of one that goes
  erase_if(children, [&](const XmlObject& child) { return child.name == wanted; });
  Relink();
}

std::list<XmlObject*> XmlObject::FindChildren(std::string_view childName) {
  std::list<XmlObject*> found;
  for (XmlObject& child : children) {
    if (child.name == childName) {
      found.push_back(&child);
    }
  }
  return found;
}

}  // namespace panelglow
