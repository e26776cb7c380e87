// The parser behind XmlObject: one pass over one text. Each element is built once, with its lists at their final
// size, and moved once, when its parent is complete.
#pragma once

#include <cstddef>
#include <cstdint>
#include <list>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "config/XmlObject.h"

namespace panelglow {

class XmlParser {
 public:
  /// `text` must outlive the parser; it ends at its first NUL. `lenient`: attribute names may begin with any
  /// character.
  explicit XmlParser(const std::string& text, bool lenient = false);
  explicit XmlParser(std::string&& text, bool lenient = false) = delete;

  /// Parses the next top-level element into `object`, which is empty. True when there was one; false when only white
  /// space, comments and instructions were left (the latter are kept in `object`). Throws std::runtime_error.
  bool ParseElement(XmlObject& object);

  /// Moves behind the next top-level element without keeping anything. False when there was none.
  bool SkipElement();

 private:
  // An attribute of the tag being read.
  struct Attribute {
    std::string_view name;
    std::string_view value;  // raw, or without its comments in `cleaned_`
    bool encoded = false;    // the value is to be decoded and cut
  };

  // An element whose end has not been found yet. On the stack it is followed by its complete children.
  struct Open {
    std::size_t place = 0;  // on the stack
    int commentDepth = 0;
    bool firstRun = true;  // no text run has ended yet
  };

  bool Parse(bool keep);
  void OpenElement();
  void CloseElement();
  bool FindTag();
  bool TakeInstruction();
  bool ParseStartTag();
  void ParseName();
  void ParseAttribute();
  void SkipBlanks();
  void AddAttribute(const Attribute& attribute);
  Attribute* FindRepeated(std::string_view name);
  void StoreAttributes();
  bool ParseContent();
  void TakeText(std::string_view run, bool hasComments, int commentDepth);
  void TakeChildren();
  bool SkipComment();

  // True when `word` stands here. The NUL behind the text differs from every word.
  template <std::size_t Size>
  [[nodiscard]] bool At(const char (&word)[Size]) const {
    const char* here = text_.data() + position_;
    for (std::size_t i = 0; i + 1 < Size; ++i) {
      if (here[i] != word[i]) {
        return false;
      }
    }
    return true;
  }
  [[nodiscard]] bool AtEnd() const { return position_ >= text_.size(); }

  // The character here; NUL at the end of the text.
  [[nodiscard]] char Here() const { return *(text_.data() + position_); }

  // Moves to the next character of one of the classes `stops`, which has NUL among them.
  void RunTo(std::uint8_t stops);
  [[nodiscard]] XmlObject& Innermost() { return stack_[open_.back().place]; }
  [[nodiscard]] std::string Place() const;
  [[noreturn]] void Fail(const std::string& message);

  std::string_view text_;  // a NUL stands behind it
  bool lenient_;
  bool keep_ = true;
  std::size_t position_ = 0;
  std::size_t begin_ = 0;           // of the top-level element being read
  std::vector<Open> open_;          // outermost first
  std::vector<XmlObject> stack_;    // the open elements, each with its complete children behind it
  std::vector<Attribute> tag_;      // attributes of the tag being read
  std::list<std::string> cleaned_;  // values of it that held comments
  std::unordered_map<std::string, std::size_t> manyNames_;  // lowered names of a tag with many attributes
};

/// Replaces the known entities by their characters, from left to right; any other "&" stays.
std::string DecodeXmlEntities(std::string_view text);

/// White space in the parser's sense.
constexpr bool IsXmlSpace(char c) { return c == ' ' || c == '\t' || c == '\n' || c == '\r'; }

}  // namespace panelglow
