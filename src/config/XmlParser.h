// The parser behind XmlObject: one pass over one text. Each element is built once, with its lists at their final
// size, and moved once, when its parent is complete.
#pragma once

#include <cstddef>
#include <list>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "config/XmlBlocks.h"
#include "config/XmlCharacters.h"
#include "config/XmlEntities.h"
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
    bool encoded = false;    // there is an "&" in the value
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
  void TakeChildren();
  bool FindTag();
  void TakeInstruction();
  bool ParseContent();
  void TakeText(std::string_view run, bool hasComments, int commentDepth);

  // Start tags: XmlStartTag.cpp.
  bool ParseStartTag();
  void ParseName();
  void ParseAttribute();
  void AddAttribute(std::string_view name, std::string_view value, bool encoded);
  Attribute* FindRepeated(std::string_view name);
  Attribute* FindAmongMany(std::string_view name);
  void StoreAttributes();

  // Moves over white space and comments.
  void SkipBlanks() {
    do {
      here_ = FindXmlClass(here_, kStopsBlanks);
    } while (SkipComment());
  }

  // Moves behind a comment that begins here. True when there was a mark.
  bool SkipComment() {
    const bool isMark = AtCommentMark();
    if (isMark) {
      PassComment();
    }
    return isMark;
  }
  void PassComment();

  // True when `word` stands here. The NUL behind the text differs from every word.
  template <std::size_t Size>
  [[nodiscard]] bool At(const char (&word)[Size]) const {
    for (std::size_t i = 0; i + 1 < Size; ++i) {
      if (here_[i] != word[i]) {
        return false;
      }
    }
    return true;
  }
  static constexpr char kCommentStart[] = "<!--";
  static constexpr char kCommentEnd[] = "-->";
  [[nodiscard]] bool AtCommentMark() const { return At(kCommentStart) || At(kCommentEnd); }
  [[nodiscard]] bool AtEnd() const { return *here_ == '\0'; }
  [[nodiscard]] bool AtTagEnd() const { return *here_ == '>' || AtEnd(); }
  static std::string WithoutComments(std::string_view raw, int commentDepth);

  // Null for the tree of a small text: the heap will do, and a whole block would be too much.
  [[nodiscard]] XmlBlocks* IfLarge(XmlBlocks& blocks) { return isLarge_ ? &blocks : nullptr; }
  [[nodiscard]] XmlObject& Innermost() { return stack_[open_.back().place]; }
  [[nodiscard]] std::string Place() const;
  [[noreturn]] void Fail(const std::string& message);

  const char* here_;   // the character that is being looked at
  const char* begin_;  // of the top-level element being read
  bool lenient_;
  bool isLarge_;
  bool keep_ = true;
  XmlEntityDecoder entities_;

  // Lists of children stand apart from the rest. So both kinds of blocks hold their pieces in about the order in
  // which a tree is gone over, and the processor fetches them ahead; with one kind for all, destroying takes three
  // times as long.
  XmlBlocks childBlocks_;
  XmlBlocks otherBlocks_;
  std::vector<Open> open_;          // outermost first
  XmlList<XmlObject> stack_;        // the open elements, each with its complete children behind it
  std::vector<Attribute> tag_;      // attributes of the tag being read
  std::list<std::string> cleaned_;  // values of it that held comments
  std::unordered_map<std::string, std::size_t> manyNames_;  // lowered names of a tag with many attributes
};

}  // namespace panelglow
