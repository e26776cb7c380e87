#include "config/XmlParser.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <stdexcept>
#include <unordered_map>
#include <utility>

#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {

constexpr std::string_view kCommentStart = "<!--";
constexpr std::string_view kCommentEnd = "-->";
constexpr std::size_t kManyAttributes = 32;  // from here on a repeated name is looked up in a table

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

// Classes of the 256 byte values.
constexpr std::uint8_t kXmlCharacter = 1;    // 0x09, 0x0A, 0x0D, 0x20 to 0xFE
constexpr std::uint8_t kNoNameStart = 2;     // a digit or a punctuation character
constexpr std::uint8_t kEndsPlainValue = 4;  // what an attribute value cannot simply run over

constexpr std::array<std::uint8_t, 256> MakeClasses() {
  std::array<std::uint8_t, 256> classes{};
  for (unsigned c = 0; c < 256; ++c) {
    std::uint8_t bits = 0;
    if (c == 0x09 || c == 0x0A || c == 0x0D || (c >= 0x20 && c <= 0xFE)) {
      bits |= kXmlCharacter;
    }
    const bool letter = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
    if (c > 0x20 && c < 0x7F && !letter) {
      bits |= kNoNameStart;
    }
    if (c == '<' || c == '>' || c == '"' || c == '\'') {
      bits |= kEndsPlainValue;
    }
    classes[c] = bits;
  }
  return classes;
}
constexpr std::array<std::uint8_t, 256> kClasses = MakeClasses();

constexpr bool Is(char c, std::uint8_t wanted) { return (kClasses[static_cast<std::uint8_t>(c)] & wanted) != 0; }

// Thrown inside one level and turned into the error of that level there.
struct LevelError {
  std::string message;
};

std::string WithoutComments(std::string_view text) {
  std::string result;
  int depth = 0;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text.substr(i, kCommentStart.size()) == kCommentStart) {
      ++depth;
      i += kCommentStart.size() - 1;
    } else if (depth > 0 && text.substr(i, kCommentEnd.size()) == kCommentEnd) {
      --depth;
      i += kCommentEnd.size() - 1;
    } else if (depth == 0) {
      result += text[i];
    }
  }
  return result;
}

}  // namespace

std::string DecodeXmlEntities(std::string_view text) {
  std::size_t ampersand = text.find('&');
  if (ampersand == std::string_view::npos) {
    return std::string(text);
  }
  std::string decoded;
  decoded.reserve(text.size());
  std::size_t at = 0;
  while (ampersand != std::string_view::npos) {
    decoded += text.substr(at, ampersand - at);
    const std::string_view rest = text.substr(ampersand);
    const auto entity =
        std::find_if(kEntities.begin(), kEntities.end(), [&](const Entity& e) { return rest.starts_with(e.text); });
    decoded += entity == kEntities.end() ? '&' : entity->character;
    at = ampersand + (entity == kEntities.end() ? 1 : entity->text.size());
    ampersand = text.find('&', at);
  }
  decoded += text.substr(at);
  return decoded;
}

std::string_view XmlCharactersOf(std::string_view text) {
  const auto bad = std::find_if(text.begin(), text.end(), [](char c) { return !Is(c, kXmlCharacter); });
  return text.substr(0, static_cast<std::size_t>(bad - text.begin()));
}

bool XmlParser::ParseElement(XmlObject& object) {
  const bool found = Parse(object, 0, false);
  object.Relink();
  return found;
}

bool XmlParser::SkipElement() {
  XmlObject nothing;
  return Parse(nothing, 0, true);
}

// "line, position" of the character that is being looked at. Counted only when it is asked for.
std::string XmlParser::Place() const {
  const std::string_view read = text_.substr(0, std::min(position_ + 1, text_.size()));
  const auto line = 1 + std::count(read.begin(), read.end(), '\n');
  const std::size_t feed = read.rfind('\n');
  const std::size_t column = feed == std::string_view::npos ? read.size() : read.size() - feed - 1;
  return "(line " + std::to_string(line) + ", position " + std::to_string(column) + ") ";
}

void XmlParser::Fail(const std::string& message) { throw LevelError{message}; }

bool XmlParser::Parse(XmlObject& object, int depth, bool skip) {
  const std::size_t firstPair = pairs_.size();
  try {
    return ParseHere(object, depth, skip);
  } catch (const LevelError& error) {
    if (object.attributes.empty()) {
      StoreAttributes(object, firstPair);  // the element as far as it was built
    }
    object.Relink();
    throw std::runtime_error("XML Parsing Error " + Place() + error.message + object.ToString(false));
  }
}

bool XmlParser::ParseHere(XmlObject& object, int depth, bool skip) {
  if (depth > XmlObject::kDeepestElement) {
    Fail("Elements are nested deeper than " + std::to_string(XmlObject::kDeepestElement) + " levels");
  }
  if (!FindTag(object)) {
    return false;
  }
  if (ParseStartTag(object, !skip || depth == 0)) {
    return true;
  }
  ParseContent(object, depth, skip);
  return true;
}

// Moves behind a comment that begins here; comments nest. True when there was one.
bool XmlParser::SkipComment() {
  if (!At(kCommentStart)) {
    return false;
  }
  int depth = 0;
  while (!AtEnd()) {
    if (At(kCommentStart)) {
      ++depth;
      position_ += kCommentStart.size();
    } else if (At(kCommentEnd)) {
      position_ += kCommentEnd.size();
      if (--depth == 0) {
        return true;
      }
    } else {
      // Only these two characters can begin a mark.
      position_ = std::min(text_.find_first_of("<-", position_ + 1), text_.size());
    }
  }
  return true;
}

// Moves behind the "<" of the element's tag, gathering declaration and instructions on the way.
bool XmlParser::FindTag(XmlObject& object) {
  while (!AtEnd()) {
    const char c = text_[position_];
    if (IsXmlSpace(c)) {
      ++position_;
    } else if (SkipComment()) {
      continue;
    } else if (c != '<') {
      Fail("Left angle bracket character expected");
    } else if (!TakeInstruction(object)) {
      ++position_;
      return true;
    }
  }
  return false;
}

bool XmlParser::TakeInstruction(XmlObject& object) {
  if (!At("<?")) {
    return false;
  }
  const std::size_t end = text_.find("?>", position_ + 2);
  if (end == std::string_view::npos) {
    Fail("Missing end tag: <?");
  }
  const std::string_view inner = text_.substr(position_ + 2, end - position_ - 2);
  if (inner.size() > 3 && inner.substr(0, 3) == "xml" && IsXmlSpace(inner[3])) {
    const std::string rewritten = "<" + std::string(inner) + "/>";
    XmlObject element;
    XmlParser(rewritten).ParseElement(element);
    object.declaration = std::move(element.attributes);
  } else {
    object.instructions.emplace_back(text_.substr(position_, end + 2 - position_));
  }
  position_ = end + 2;
  return true;
}

// From behind the "<" to behind the ">". True when the element has ended with its start tag.
bool XmlParser::ParseStartTag(XmlObject& object, bool withAttributes) {
  const std::size_t firstPair = pairs_.size();
  ParseName(object);
  while (!AtEnd() && text_[position_] != '>') {
    const char c = text_[position_];
    if (c == '<' && SkipComment()) {
      continue;
    }
    if (!withAttributes || IsXmlSpace(c) || c == '/') {
      ++position_;
    } else if (!ParseAttribute(object)) {
      break;
    }
  }
  if (AtEnd()) {
    Fail("Missing end tag: " + object.name);
  }
  StoreAttributes(object, firstPair);
  const bool ended = text_[position_ - 1] == '/';
  ++position_;
  return ended;
}

void XmlParser::ParseName(XmlObject& object) {
  while (!AtEnd() && (IsXmlSpace(text_[position_]) || SkipComment())) {
    position_ += AtEnd() || !IsXmlSpace(text_[position_]) ? 0 : 1;
  }
  const std::size_t begin = position_;
  while (!AtEnd() && !IsXmlSpace(text_[position_]) && text_[position_] != '>' && !At("/>") && !At(kCommentStart)) {
    ++position_;
  }
  object.name = text_.substr(begin, position_ - begin);
  if (AtEnd()) {
    Fail("Missing end tag: " + object.name);
  }
  if (object.name.empty() || Is(object.name.front(), kNoNameStart)) {
    const bool atSpace = IsXmlSpace(text_[position_]);
    const std::string refused = std::exchange(object.name, {});
    Fail(atSpace ? "Invalid tag name: " + refused : "Invalid tag name");
  }
}

// One attribute. False when the tag's ">" came before it was complete: it is dropped then.
bool XmlParser::ParseAttribute(XmlObject& object) {
  const std::size_t begin = position_;
  while (!AtEnd() && !IsXmlSpace(text_[position_]) && text_[position_] != '=' && text_[position_] != '>') {
    ++position_;
  }
  const std::string_view attribute = text_.substr(begin, position_ - begin);
  if (AtEnd() || text_[position_] == '>') {
    return false;
  }
  if (!lenient_ && (attribute.empty() || Is(attribute.front(), kNoNameStart))) {
    Fail("Invalid attribute name: " + std::string(attribute));
  }
  while (!AtEnd() && text_[position_] != '=') {
    const char c = text_[position_];
    if (c == '>') {
      return false;
    }
    if (SkipComment()) {
      continue;
    }
    if (!IsXmlSpace(c)) {
      Fail("Equal chracter expected: " + std::string(1, c) + " attribute value: " + std::string(attribute) +
           " tag value: " + object.name);
    }
    ++position_;
  }
  if (AtEnd()) {
    return false;
  }
  ++position_;
  while (!AtEnd() && text_[position_] != '"' && text_[position_] != '\'') {
    const char c = text_[position_];
    if (c == '>') {
      return false;
    }
    if (SkipComment()) {
      continue;
    }
    if (!IsXmlSpace(c)) {
      Fail("Single or double quote expected: " + std::string(1, c) + " attribute: " + std::string(attribute) +
           " tag value: " + object.name + "\n\n\n");
    }
    ++position_;
  }
  if (AtEnd()) {
    return false;
  }
  const char quote = text_[position_++];
  const std::size_t valueBegin = position_;
  bool hasComment = false;
  while (!AtEnd() && text_[position_] != quote) {
    if (!Is(text_[position_], kEndsPlainValue)) {
      ++position_;
      continue;
    }
    if (text_[position_] == '>') {
      return false;
    }
    if (SkipComment()) {
      hasComment = true;
      continue;
    }
    ++position_;
  }
  if (AtEnd()) {
    return false;
  }
  const std::string_view raw = text_.substr(valueBegin, position_ - valueBegin);
  ++position_;
  std::string decoded = DecodeXmlEntities(hasComment ? WithoutComments(raw) : raw);
  decoded.resize(XmlCharactersOf(decoded).size());
  pairs_.push_back({attribute, std::move(decoded)});
  return true;
}

// Moves the gathered pairs into the object, a repeated name (without regard to case) overwriting the first.
void XmlParser::StoreAttributes(XmlObject& object, std::size_t first) {
  const std::size_t count = pairs_.size() - first;
  object.attributes.reserve(count);
  std::unordered_map<std::string, std::size_t> places;
  for (std::size_t i = first; i < pairs_.size(); ++i) {
    XmlAttribute* known = nullptr;
    if (count < kManyAttributes) {
      known = object.FindAttribute(pairs_[i].name);
    } else {
      const auto [place, isNew] = places.emplace(CDMUtil::ToLower(pairs_[i].name), object.attributes.size());
      known = isNew ? nullptr : &object.attributes[place->second];
    }
    if (known != nullptr) {
      known->value = std::move(pairs_[i].value);
    } else {
      object.attributes.emplace_back(std::string(pairs_[i].name), std::move(pairs_[i].value));
    }
  }
  pairs_.resize(first);
}

// The first text of an element becomes its value when it holds more than white space.
void XmlParser::TakeText(XmlObject& object, std::string_view run, bool hasComment) const {
  std::string cleaned;
  if (hasComment) {
    cleaned = WithoutComments(run);
    run = cleaned;
  }
  if (!std::all_of(run.begin(), run.end(), IsXmlSpace)) {
    object.value = DecodeXmlEntities(run);
  }
}

void XmlParser::ParseContent(XmlObject& object, int depth, bool skip) {
  const std::size_t runBegin = position_;
  bool firstRun = true;
  bool hasComment = false;
  for (;;) {
    const std::size_t tag = std::min(text_.find('<', position_), text_.size());
    // A "/>" in the text ends the element as well.
    const std::size_t close = text_.substr(0, tag).find("/>", std::max(position_, std::size_t{1}) - 1);
    if (close != std::string_view::npos) {
      position_ = close + 2;
      return;
    }
    position_ = tag;
    if (AtEnd()) {
      Fail("Missing end tag: " + object.name);
    }
    if (SkipComment()) {
      hasComment = true;
      continue;
    }
    if (std::exchange(firstRun, false) && !skip) {
      TakeText(object, text_.substr(runBegin, position_ - runBegin), hasComment);
    }
    if (position_ + 1 < text_.size() && text_[position_ + 1] == '/') {
      const std::size_t end = text_.find('>', position_);
      if (end == std::string_view::npos) {
        Fail("Missing Right Angle Bracket Character");
      }
      position_ = end + 1;
      return;
    }
    bool complete = true;
    if (skip) {
      XmlObject nothing;
      complete = Parse(nothing, depth + 1, true);
    } else {
      complete = Parse(object.children.emplace_back(), depth + 1, false);
      if (!complete) {
        object.children.pop_back();
      }
    }
    if (!complete) {
      Fail("Missing end tag: " + object.name);
    }
  }
}

}  // namespace panelglow
