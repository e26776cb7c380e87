// The part of XmlParser that reads start tags.
#include <algorithm>
#include <utility>

#include "config/XmlParser.h"
#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {

constexpr std::size_t kManyAttributes = 32;  // from here on a repeated name is looked up in a table

constexpr bool IsQuote(char c) { return c == '"' || c == '\''; }

}  // namespace

// From behind the "<" to behind the ">". True when the element has ended with its start tag.
bool XmlParser::ParseStartTag() {
  ParseName();
  const bool withAttributes = keep_ || open_.size() == 1;
  for (char c = *here_; c != '>'; c = *here_) {
    if (AtEnd()) {
      Fail("Missing end tag: " + std::string(Innermost().name));
    }
    if (IsXmlSpace(c) || c == '/') {
      ++here_;
    } else if (SkipComment()) {
      continue;
    } else if (withAttributes) {
      ParseAttribute();
    } else {
      ++here_;
    }
  }
  StoreAttributes();
  ++here_;
  return here_[-2] == '/';
}

// A tag spelled "xml" is a name like any other.
void XmlParser::ParseName() {
  SkipBlanks();
  const char* const begin = here_;
  for (;; ++here_) {
    here_ = FindXmlClass(here_, kStopsTagName);
    const char c = *here_;
    const bool goesOn = c == '/' ? !At("/>") : (c == '<' || c == '-') && !AtCommentMark();
    if (!goesOn) {
      break;
    }
  }
  const std::string_view name(begin, here_);
  if (AtEnd()) {
    Fail("Missing end tag: " + std::string(name));
  }
  if (name.empty() || HasXmlClass(name.front(), kNoNameStart)) {
    Fail(IsXmlSpace(*here_) ? "Invalid tag name: " + std::string(name) : "Invalid tag name");
  }
  Innermost().name.Set(name, IfLarge(otherBlocks_));
}

inline XmlParser::Attribute* XmlParser::FindRepeated(std::string_view name) {
  if (tag_.size() >= kManyAttributes) {
    return FindAmongMany(name);
  }
  for (Attribute& known : tag_) {
    if (known.name.size() == name.size() && CDMUtil::EqualIgnoreCase(known.name, name)) {
      return &known;
    }
  }
  return nullptr;
}

// A repeated name (without regard to case) overwrites the first one's value.
inline void XmlParser::AddAttribute(std::string_view name, std::string_view value, bool encoded) {
  if (Attribute* first = FindRepeated(name)) {
    first->value = value;
    first->encoded = encoded;
  } else {
    Attribute& added = tag_.emplace_back();
    added.name = name;
    added.value = value;
    added.encoded = encoded;
  }
}

// One attribute. When the tag's ">" or the text's end comes before it is complete, it is dropped.
void XmlParser::ParseAttribute() {
  const char* const nameBegin = here_;
  for (;; ++here_) {
    here_ = FindXmlClass(here_, kStopsAttributeName);
    if ((*here_ != '<' && *here_ != '-') || AtCommentMark()) {
      break;
    }
  }
  if (AtTagEnd()) {
    return;
  }
  const std::string_view name(nameBegin, here_);
  if (!lenient_ && (name.empty() || HasXmlClass(name.front(), kNoNameStart))) {
    Fail("Invalid attribute name: " + std::string(name));
  }
  if (*here_ != '=') {
    SkipBlanks();
    if (AtTagEnd()) {
      return;
    }
    if (*here_ != '=') {
      Fail("Equal chracter expected: " + std::string(1, *here_) + " attribute value: " + std::string(name) +
           " tag value: " + std::string(Innermost().name));
    }
  }
  ++here_;
  if (!IsQuote(*here_)) {
    SkipBlanks();
    if (AtTagEnd()) {
      return;
    }
    if (!IsQuote(*here_)) {
      Fail("Single or double quote expected: " + std::string(1, *here_) + " attribute: " + std::string(name) +
           " tag value: " + std::string(Innermost().name) + "\n\n\n");
    }
  }
  const char quote = *here_;
  const char* const valueBegin = ++here_;
  bool encoded = false;
  bool hasBadBytes = false;
  bool hasComments = false;
  int commentDepth = 0;  // where the value begins
  for (;;) {
    here_ = FindXmlClass(here_, kStopsValue);
    if (*here_ == quote) {
      break;
    }
    if (*here_ == '&') {
      encoded = true;
    } else if (AtTagEnd()) {
      return;
    } else if (AtCommentMark()) {
      commentDepth = hasComments ? commentDepth : open_.back().commentDepth;
      hasComments = true;
      PassComment();
      continue;
    } else if (!HasXmlClass(*here_, kXmlCharacter)) {
      hasBadBytes = true;
    }
    ++here_;
  }
  std::string_view value(valueBegin, here_);
  ++here_;
  if (hasComments) {
    value = cleaned_.emplace_back(WithoutComments(value, commentDepth));
  }
  // Where the value is cut does not depend on whether it is decoded yet: no entity holds a bad byte or stands for
  // one.
  AddAttribute(name, hasBadBytes ? XmlCharactersOf(value) : value, encoded);
}

XmlParser::Attribute* XmlParser::FindAmongMany(std::string_view name) {
  if (manyNames_.empty()) {
    for (std::size_t i = 0; i < tag_.size(); ++i) {
      manyNames_.emplace(CDMUtil::ToLower(tag_[i].name), i);
    }
  }
  const auto [place, isNew] = manyNames_.emplace(CDMUtil::ToLower(name), tag_.size());
  return isNew ? nullptr : &tag_[place->second];
}

// Moves the gathered attributes into the element.
void XmlParser::StoreAttributes() {
  XmlBlocks* const blocks = IfLarge(otherBlocks_);
  XmlList<XmlAttribute>& attributes = Innermost().attributes;
  attributes.reserve(tag_.size(), blocks);
  for (const Attribute& attribute : tag_) {
    attributes.emplace_back(attribute.name, attribute.encoded ? entities_.Decode(attribute.value) : attribute.value,
                            blocks);
  }
  tag_.clear();
  cleaned_.clear();
  if (!manyNames_.empty()) {
    manyNames_.clear();  // clears its buckets even when they are empty
  }
}

}  // namespace panelglow
