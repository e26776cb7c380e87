#include "config/XmlParser.h"

#include <algorithm>
#include <array>
#include <iterator>
#include <stdexcept>
#include <utility>

#include "config/XmlCharacters.h"
#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {

constexpr char kCommentStart[] = "<!--";
constexpr char kCommentEnd[] = "-->";
constexpr std::size_t kCommentStartSize = sizeof(kCommentStart) - 1;
constexpr std::size_t kCommentEndSize = sizeof(kCommentEnd) - 1;
constexpr std::size_t kManyAttributes = 32;  // from here on a repeated name is looked up in a table

// An element with more children takes them in portions, so that the stack stays small.
constexpr std::size_t kMostWaitingChildren = 256;

struct Entity {
  std::string_view text;
  char character;
};
constexpr std::array<Entity, 8> kEntities{{{"&lt;", '<'},
                                           {"&gt;", '>'},
                                           {"&amp;", '&'},
                                           {"&quot;", '"'},
                                           {"&apos;", '\''},
                                           {"&#09;", '\t'},
                                           {"&#10;", '\n'},
                                           {"&#13;", '\r'}}};

constexpr bool MayBeCommentMark(char c) { return c == '<' || c == '-'; }

// `commentDepth` is the element's where `raw` begins.
std::string WithoutComments(std::string_view raw, int commentDepth) {
  std::string kept;
  while (!raw.empty()) {
    if (raw.starts_with(kCommentStart)) {
      ++commentDepth;
      raw.remove_prefix(kCommentStartSize);
    } else if (raw.starts_with(kCommentEnd)) {
      --commentDepth;
      raw.remove_prefix(kCommentEndSize);
    } else {
      kept.append(raw, 0, commentDepth > 0 ? 0 : 1);
      raw.remove_prefix(1);
    }
  }
  return kept;
}

}  // namespace

std::string DecodeXmlEntities(std::string_view text) {
  std::string decoded;
  decoded.reserve(text.size());
  std::size_t at = 0;
  for (std::size_t ampersand = text.find('&'); ampersand != std::string_view::npos; ampersand = text.find('&', at)) {
    decoded += text.substr(at, ampersand - at);
    const std::string_view rest = text.substr(ampersand);
    const auto entity =
        std::find_if(kEntities.begin(), kEntities.end(), [&](const Entity& e) { return rest.starts_with(e.text); });
    decoded += entity == kEntities.end() ? '&' : entity->character;
    at = ampersand + (entity == kEntities.end() ? 1 : entity->text.size());
  }
  decoded += text.substr(at);
  return decoded;
}

XmlParser::XmlParser(const std::string& text, bool lenient) : text_(text.c_str()), lenient_(lenient) {}

bool XmlParser::ParseElement(XmlObject& object) {
  const bool found = Parse(true);
  object = std::move(stack_.front());
  return found;
}

bool XmlParser::SkipElement() { return Parse(false); }

inline void XmlParser::RunTo(std::uint8_t stops) {
  const char* here = text_.data() + position_;
  while (!HasXmlClass(*here, stops)) {
    ++here;
  }
  position_ = static_cast<std::size_t>(here - text_.data());
}

// The element stands complete at the bottom of the stack afterwards.
bool XmlParser::Parse(bool keep) {
  keep_ = keep;
  begin_ = position_;
  open_.clear();
  stack_.clear();
  OpenElement();
  if (!FindTag()) {
    return false;
  }
  for (;;) {
    if (ParseStartTag()) {
      CloseElement();
    }
    while (!open_.empty() && ParseContent()) {
      CloseElement();
    }
    if (open_.empty()) {
      return true;
    }
    OpenElement();  // a child
    if (!FindTag()) {
      CloseElement();
      Fail("Missing end tag: " + std::string(Innermost().name));
    }
  }
}

void XmlParser::OpenElement() {
  if (open_.size() > XmlObject::kDeepestElement) {
    Fail("Elements are nested deeper than " + std::to_string(XmlObject::kDeepestElement) + " levels");
  }
  open_.push_back({stack_.size()});
  stack_.emplace_back().depth = static_cast<int>(open_.size()) - 1;
}

void XmlParser::CloseElement() {
  TakeChildren();
  open_.pop_back();
  if (open_.empty()) {
    return;
  }
  if (!keep_) {
    stack_.pop_back();
  } else if (stack_.size() - open_.back().place > kMostWaitingChildren) {
    TakeChildren();
  }
}

// Moves the complete children of the innermost element from the stack into it. Their links to it are set when it
// moves to its own place.
void XmlParser::TakeChildren() {
  const auto first = stack_.begin() + static_cast<std::ptrdiff_t>(open_.back().place) + 1;
  std::vector<XmlObject>& children = Innermost().children;
  const std::size_t needed = children.size() + static_cast<std::size_t>(stack_.end() - first);
  if (needed > children.capacity()) {
    children.reserve(std::max(needed, 2 * children.capacity()));
  }
  std::move(first, stack_.end(), std::back_inserter(children));
  stack_.erase(first, stack_.end());
}

// Moves behind the "<" of the element's tag, gathering declaration and instructions on the way. False at the end of
// the text.
bool XmlParser::FindTag() {
  for (;;) {
    SkipBlanks();
    if (AtEnd()) {
      return false;
    }
    if (Here() != '<') {
      Fail("Left angle bracket character expected");
    }
    if (!TakeInstruction()) {
      ++position_;
      return true;
    }
  }
}

bool XmlParser::TakeInstruction() {
  if (!At("<?")) {
    return false;
  }
  const std::size_t end = text_.find("?>", position_ + 2);
  if (end == std::string_view::npos) {
    Fail("Missing end tag: <?");
  }
  const std::string_view inner = text_.substr(position_ + 2, end - position_ - 2);
  if (inner.size() > 3 && inner.starts_with("xml") && IsXmlSpace(inner[3])) {
    const std::string rewritten = "<" + std::string(inner) + "/>";
    XmlObject element;
    XmlParser(rewritten).ParseElement(element);
    Innermost().GetProlog().declaration = std::move(element.attributes);
  } else {
    Innermost().GetProlog().instructions.emplace_back(text_.substr(position_, end + 2 - position_));
  }
  position_ = end + 2;
  return true;
}

// From behind the "<" to behind the ">". True when the element has ended with its start tag.
bool XmlParser::ParseStartTag() {
  ParseName();
  const bool withAttributes = keep_ || open_.size() == 1;
  for (char c = Here(); c != '>'; c = Here()) {
    if (AtEnd()) {
      Fail("Missing end tag: " + std::string(Innermost().name));
    }
    if (MayBeCommentMark(c) && SkipComment()) {
      continue;
    }
    if (!withAttributes || IsXmlSpace(c) || c == '/') {
      ++position_;
    } else {
      ParseAttribute();
    }
  }
  StoreAttributes();
  ++position_;
  return text_[position_ - 2] == '/';
}

// A tag spelled "xml" is a name like any other.
void XmlParser::ParseName() {
  SkipBlanks();
  const std::size_t begin = position_;
  for (;; ++position_) {
    RunTo(kStopsTagName);
    const char c = Here();
    const bool goesOn = c == '/' ? !At("/>") : MayBeCommentMark(c) && !At(kCommentStart) && !At(kCommentEnd);
    if (AtEnd() || !goesOn) {
      break;
    }
  }
  const std::string_view name = text_.substr(begin, position_ - begin);
  if (AtEnd()) {
    Fail("Missing end tag: " + std::string(name));
  }
  if (name.empty() || HasXmlClass(name.front(), kNoNameStart)) {
    Fail(IsXmlSpace(Here()) ? "Invalid tag name: " + std::string(name) : "Invalid tag name");
  }
  Innermost().name = name;
}

// One attribute. When the tag's ">" or the text's end comes before it is complete, it is dropped.
void XmlParser::ParseAttribute() {
  const std::size_t begin = position_;
  for (;; ++position_) {
    RunTo(kStopsAttributeName);
    if (!MayBeCommentMark(Here()) || At(kCommentStart) || At(kCommentEnd)) {
      break;
    }
  }
  if (AtEnd() || Here() == '>') {
    return;
  }
  const std::string_view name = text_.substr(begin, position_ - begin);
  if (!lenient_ && (name.empty() || HasXmlClass(name.front(), kNoNameStart))) {
    Fail("Invalid attribute name: " + std::string(name));
  }
  SkipBlanks();
  if (AtEnd() || Here() == '>') {
    return;
  }
  if (Here() != '=') {
    Fail("Equal chracter expected: " + std::string(1, Here()) + " attribute value: " + std::string(name) +
         " tag value: " + std::string(Innermost().name));
  }
  ++position_;
  SkipBlanks();
  if (AtEnd() || Here() == '>') {
    return;
  }
  const char quote = Here();
  if (quote != '"' && quote != '\'') {
    Fail("Single or double quote expected: " + std::string(1, quote) + " attribute: " + std::string(name) +
         " tag value: " + std::string(Innermost().name) + "\n\n\n");
  }
  const std::size_t valueBegin = ++position_;
  const int commentDepth = open_.back().commentDepth;
  bool encoded = false;
  bool hasComments = false;
  for (;;) {
    RunTo(kStopsValue);
    const char c = Here();
    if (c == quote) {
      break;
    }
    if (c == '>' || AtEnd()) {
      return;
    }
    if (MayBeCommentMark(c) && SkipComment()) {
      hasComments = true;
      continue;
    }
    encoded = encoded || c == '&' || !HasXmlClass(c, kXmlCharacter);
    ++position_;
  }
  std::string_view value = text_.substr(valueBegin, position_ - valueBegin);
  if (hasComments) {
    value = cleaned_.emplace_back(WithoutComments(value, commentDepth));
  }
  AddAttribute({name, value, encoded});
  ++position_;
}

// Moves over white space and comments.
void XmlParser::SkipBlanks() {
  do {
    while (IsXmlSpace(Here())) {
      ++position_;
    }
  } while (MayBeCommentMark(Here()) && SkipComment());
}

// A repeated name (without regard to case) overwrites the first one's value.
void XmlParser::AddAttribute(const Attribute& attribute) {
  if (Attribute* first = FindRepeated(attribute.name)) {
    first->value = attribute.value;
    first->encoded = attribute.encoded;
  } else {
    tag_.push_back(attribute);
  }
}

XmlParser::Attribute* XmlParser::FindRepeated(std::string_view name) {
  if (tag_.size() < kManyAttributes) {
    const auto found = std::find_if(tag_.begin(), tag_.end(), [&](const Attribute& known) {
      return known.name.size() == name.size() && CDMUtil::EqualIgnoreCase(known.name, name);
    });
    return found == tag_.end() ? nullptr : &*found;
  }
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
  std::vector<XmlAttribute>& attributes = Innermost().attributes;
  attributes.reserve(tag_.size());
  for (const Attribute& attribute : tag_) {
    if (attribute.encoded) {
      attributes.emplace_back(attribute.name, XmlCharactersOf(DecodeXmlEntities(attribute.value)));
    } else {
      attributes.emplace_back(attribute.name, attribute.value);
    }
  }
  tag_.clear();
  cleaned_.clear();
  manyNames_.clear();
}

// Reads on from behind a start tag or a child. True when the element has ended; false at the "<" of a
// child.
bool XmlParser::ParseContent() {
  const std::size_t begin = position_;
  const int commentDepth = open_.back().commentDepth;
  bool hasComments = false;
  for (;;) {
    RunTo(kStopsText);
    const char c = Here();
    if (AtEnd()) {
      Fail("Missing end tag: " + std::string(Innermost().name));
    }
    if (c == '>') {
      ++position_;
      if (text_[position_ - 2] == '/') {
        return true;  // a "/>" in the text ends the element as well
      }
    } else if (SkipComment()) {
      hasComments = true;
    } else if (c == '<') {
      break;
    } else {
      ++position_;
    }
  }
  if (std::exchange(open_.back().firstRun, false) && keep_) {
    TakeText(text_.substr(begin, position_ - begin), hasComments, commentDepth);
  }
  if (!At("</")) {
    return false;
  }
  const std::size_t end = text_.find('>', position_);
  if (end == std::string_view::npos) {
    Fail("Missing Right Angle Bracket Character");
  }
  position_ = end + 1;
  return true;
}

// A run that holds more than white space becomes the element's value.
void XmlParser::TakeText(std::string_view run, bool hasComments, int commentDepth) {
  std::string cleaned;
  if (hasComments) {
    cleaned = WithoutComments(run, commentDepth);
    run = cleaned;
  }
  if (!std::all_of(run.begin(), run.end(), IsXmlSpace)) {
    Innermost().value = DecodeXmlEntities(run);
  }
}

// Moves behind a comment that begins here; comments nest. A closing mark outside a comment is skipped as well, and
// takes the effect from the next opening one. True when there was a mark.
bool XmlParser::SkipComment() {
  if (!At(kCommentStart) && !At(kCommentEnd)) {
    return false;
  }
  int& depth = open_.back().commentDepth;
  do {
    if (At(kCommentStart)) {
      ++depth;
      position_ += kCommentStartSize;
    } else if (At(kCommentEnd)) {
      --depth;
      position_ += kCommentEndSize;
    } else {
      ++position_;
      while (!AtEnd() && !MayBeCommentMark(Here())) {
        ++position_;
      }
    }
  } while (depth > 0 && !AtEnd());
  return true;
}

// "line, position" of the character that is being looked at, counted from where the search for the top-level element
// began. Counted only when it is asked for.
std::string XmlParser::Place() const {
  const std::string_view read = text_.substr(begin_, position_ + 1 - begin_);
  const auto line = 1 + std::count(read.begin(), read.end(), '\n');
  const std::size_t feed = read.rfind('\n');
  const std::size_t column = feed == std::string_view::npos ? read.size() : read.size() - feed - 1;
  return "(line " + std::to_string(line) + ", position " + std::to_string(column) + ") ";
}

// The message ends with the text of the innermost element as far as it was built.
void XmlParser::Fail(const std::string& message) {
  StoreAttributes();
  TakeChildren();
  Innermost().depth = 0;
  Innermost().Relink();
  throw std::runtime_error("XML Parsing Error " + Place() + message + Innermost().ToString(false));
}

}  // namespace panelglow
