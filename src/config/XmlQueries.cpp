// Queries by path and filter, and properties.
#include <algorithm>
#include <stdexcept>
#include <utility>

#include "config/XmlObject.h"
#include "config/XmlParser.h"
#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {

constexpr std::string_view kProperty = "property";

bool ContainsIgnoringCase(std::string_view text, std::string_view part) {
  return CDMUtil::ToLower(text).find(CDMUtil::ToLower(part)) != std::string::npos;
}

}  // namespace

// ---- queries

std::list<XmlObject*> XmlObject::FindAll(const std::string& path, const std::string& filter) {
  const std::size_t slash = path.find('/');
  const std::string head = path.substr(0, slash);
  std::list<XmlObject*> found;
  const std::size_t open = head.find('[');
  const std::size_t close = open == std::string::npos ? open : head.find(']', open);
  if (head == ".") {
    found.push_back(this);
  } else if (head == "..") {
    if (parent != nullptr) {
      found.push_back(parent);
    }
  } else if (close != std::string::npos) {
    found = FindAll(head.substr(0, open), head.substr(open + 1, close - open - 1));
  } else {
    found = FindChildren(head);
  }
  if (slash == std::string::npos) {
    std::erase_if(found, [&](XmlObject* element) { return !element->Matches(filter); });
    return found;
  }
  const std::string rest = path.substr(slash + 1);
  std::list<XmlObject*> all;
  for (XmlObject* element : found) {
    all.splice(all.end(), element->FindAll(rest, filter));
  }
  return all;
}

XmlObject* XmlObject::FindFirstMatch(const std::string& path, const std::string& filter) {
  const std::list<XmlObject*> found = FindAll(path, filter);
  return found.empty() ? nullptr : found.front();
}

bool XmlObject::Matches(const std::string& filter) {
  if (filter.empty()) {
    return true;
  }
  if (filter.find('=') == std::string::npos) {
    return value == filter;
  }
  const std::string text = "<filter " + filter + "/>";
  XmlObject pairs;
  XmlParser(text, true).ParseElement(pairs);
  bool passed = true;
  for (const XmlAttribute& pair : pairs.attributes) {
    passed = PassesPair(pair.name, pair.value) && passed;
  }
  return passed;
}

bool XmlObject::PassesPair(std::string_view key, std::string_view wanted) const {
  const char kind = key.empty() ? '\0' : key.front();
  if (kind == '@' || kind == '$') {
    key.remove_prefix(1);
  }
  constexpr std::string_view kForms = "#!*";
  const char form = !key.empty() && kForms.find(key.front()) != std::string_view::npos ? key.front() : '=';
  key.remove_prefix(form == '=' ? 0 : 1);
  switch (kind) {
    case '@':
      return PassesAttribute(form, key, wanted);
    case '$':
      return PassesProperty(form, key, wanted);
    default:
      return PassesChild(form, key, wanted);
  }
}

bool XmlObject::PassesAttribute(char form, std::string_view attribute, std::string_view wanted) const {
  const XmlAttribute* found = FindAttribute(attribute);
  const std::string_view actual = found == nullptr ? std::string_view() : std::string_view(found->value);
  switch (form) {
    case '#':
      return ContainsIgnoringCase(actual, wanted);
    case '!':
      return !CDMUtil::EqualIgnoreCase(actual, wanted);
    case '*':
      return found != nullptr;
    default:
      return CDMUtil::EqualIgnoreCase(actual, wanted);
  }
}

bool XmlObject::PassesProperty(char form, std::string_view property, std::string_view wanted) const {
  return std::any_of(children.begin(), children.end(), [&](const XmlObject& child) {
    return child.name == kProperty && child.PassesAttribute('=', "name", property) &&
           (form == '*' || child.PassesAttribute(form, "value", wanted));
  });
}

bool XmlObject::PassesChild(char form, std::string_view child, std::string_view wanted) const {
  bool exists = false;
  bool passes = false;
  for (const XmlObject& candidate : children) {
    if (candidate.name != child) {
      continue;
    }
    exists = true;
    const bool contains = std::string_view(candidate.value).find(wanted) != std::string::npos;
    switch (form) {
      case '#':
        passes = passes || contains;
        break;
      case '!':
        passes = passes || !contains;
        break;
      case '*':
        passes = true;
        break;
      default:
        passes = passes || CDMUtil::EqualIgnoreCase(candidate.value, wanted);
        break;
    }
  }
  return passes || (form == '!' && !exists);
}

std::string XmlObject::GetValue(const std::string& path, const std::string& defaultValue) {
  const std::size_t slash = path.rfind('/');
  XmlObject* element = slash == std::string::npos ? this : FindFirstMatch(path.substr(0, slash), "");
  const std::string last = slash == std::string::npos ? path : path.substr(slash + 1);
  if (element == nullptr) {
    return defaultValue;
  }
  if (last.starts_with('@')) {
    return element->GetAttributeValue(last.substr(1), defaultValue);
  }
  const auto child = std::find_if(element->children.begin(), element->children.end(),
                                  [&](const XmlObject& candidate) { return candidate.name == last; });
  return child == element->children.end() ? defaultValue : std::string(child->value);
}

std::string XmlObject::GetValueFromFile(const std::string& path, const std::string& outerName,
                                        const std::string& innerName) {
  XmlObject tree;
  if (!tree.LoadFromFile(path, false, false, -1)) {
    return {};
  }
  for (const XmlObject& outer : tree.children) {
    if (!CDMUtil::EqualIgnoreCase(outer.name, outerName)) {
      continue;
    }
    for (const XmlObject& inner : outer.children) {
      if (CDMUtil::EqualIgnoreCase(inner.name, innerName)) {
        return inner.value;
      }
    }
  }
  return {};
}

// ---- properties

XmlObject* XmlObject::AddProperty(const std::string& property, const std::string& caption,
                                  const std::string& propertyValue, int kind) {
  XmlObject element;
  element.name = kProperty;
  element.SetAttribute("name", property);
  element.SetAttribute("caption", caption);
  element.SetAttribute("value", propertyValue);
  switch (kind) {
    case 1:
      element.SetAttribute("logical", "1");
      break;
    case 3:
      element.SetAttribute("techDetail", "1");
      break;
    case 4:
      element.SetAttribute("hexData", "1");
      break;
    default:
      break;
  }
  return AddChild(std::move(element));
}

}  // namespace panelglow
