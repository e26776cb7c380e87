// The parser behind XmlObject: one pass over one text, no copy but of what is kept.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "config/XmlObject.h"

namespace panelglow {

class XmlParser {
 public:
  /// `text` must outlive the parser. `lenient`: attribute names may begin with any character.
  explicit XmlParser(std::string_view text, bool lenient = false) : text_(text), lenient_(lenient) {}

  /// Parses the next top-level element into `object`, which is empty. True when there was one; false when only white
  /// space, comments and instructions were left (the latter are kept in `object`). Throws std::runtime_error.
  bool ParseElement(XmlObject& object);

  /// Moves behind the next top-level element without keeping anything. False when there was none.
  bool SkipElement();

  /// Where the next element would begin.
  [[nodiscard]] std::size_t Position() const { return position_; }

 private:
  struct Pair {
    std::string_view name;
    std::string value;
  };

  bool Parse(XmlObject& object, int depth, bool skip);
  bool ParseHere(XmlObject& object, int depth, bool skip);
  bool FindTag(XmlObject& object);
  bool TakeInstruction(XmlObject& object);
  bool ParseStartTag(XmlObject& object, bool withAttributes);
  void ParseName(XmlObject& object);
  bool ParseAttribute(XmlObject& object);
  void ParseContent(XmlObject& object, int depth, bool skip);
  void TakeText(XmlObject& object, std::string_view run, bool hasComment) const;
  void StoreAttributes(XmlObject& object, std::size_t first);
  bool SkipComment();
  [[nodiscard]] bool At(std::string_view word) const { return text_.substr(position_, word.size()) == word; }
  [[nodiscard]] bool AtEnd() const { return position_ >= text_.size(); }
  [[nodiscard]] std::string Place() const;
  [[noreturn]] void Fail(const std::string& message);

  std::string_view text_;
  bool lenient_;
  std::size_t position_ = 0;
  std::vector<Pair> pairs_;  // attributes of the start tags being read, innermost last
};

/// Replaces the known entities by their characters, from left to right; any other "&" stays.
std::string DecodeXmlEntities(std::string_view text);

/// The part of `text` before its first byte that is no XML character.
std::string_view XmlCharactersOf(std::string_view text);

/// White space in the parser's sense.
constexpr bool IsXmlSpace(char c) { return c == ' ' || c == '\t' || c == '\n' || c == '\r'; }

}  // namespace panelglow
