#include "config/XmlParser.h"

#include <algorithm>
#include <cstring>
#include <stdexcept>
#include <utility>

namespace panelglow {

namespace {

// An element with more children takes them in portions, so that the stack stays small.
constexpr std::size_t kMostWaitingChildren = 256;

// From here on a text is large: its tree has its memory in blocks.
constexpr std::size_t kLargeText_bytes = 16384;

}  // namespace

XmlParser::XmlParser(const std::string& text, bool lenient)
    : here_(text.c_str()), begin_(here_), lenient_(lenient), isLarge_(text.size() >= kLargeText_bytes) {}

bool XmlParser::ParseElement(XmlObject& object) {
  const bool found = Parse(true);
  object = std::move(stack_.front());
  return found;
}

bool XmlParser::SkipElement() { return Parse(false); }

// The element stands complete at the bottom of the stack afterwards.
bool XmlParser::Parse(bool keep) {
  keep_ = keep;
  begin_ = here_;
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
  if (stack_.size() > open_.back().place + 1) {
    TakeChildren();
  }
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
  Innermost().children.TakeTail(stack_, open_.back().place + 1, IfLarge(childBlocks_));
}

// Moves behind the "<" of the element's tag, gathering declaration and instructions on the way. False at the end of
// the text.
bool XmlParser::FindTag() {
  for (;;) {
    SkipBlanks();
    if (AtEnd()) {
      return false;
    }
    if (*here_ != '<') {
      Fail("Left angle bracket character expected");
    }
    if (!At("<?")) {
      ++here_;
      return true;
    }
    TakeInstruction();
  }
}

void XmlParser::TakeInstruction() {
  const char* const end = std::strstr(here_ + 2, "?>");
  if (end == nullptr) {
    Fail("Missing end tag: <?");
  }
  const std::string_view inner(here_ + 2, end);
  if (inner.size() > 3 && inner.starts_with("xml") && IsXmlSpace(inner[3])) {
    const std::string rewritten = "<" + std::string(inner) + "/>";
    XmlObject element;
    XmlParser(rewritten).ParseElement(element);
    Innermost().GetProlog().declaration = std::move(element.attributes);
  } else {
    Innermost().GetProlog().instructions.emplace_back(here_, end + 2);
  }
  here_ = end + 2;
}

// Reads on from behind a start tag or a child. True when the element has ended; false at the "<" of a
// child.
bool XmlParser::ParseContent() {
  const char* const begin = here_;
  const int commentDepth = open_.back().commentDepth;
  bool hasComments = false;
  const char* const behindBlanks = here_ = FindXmlClass(here_, kStopsBlanks);
  for (;;) {
    here_ = FindXmlClass(here_, kStopsText);
    if (AtEnd()) {
      Fail("Missing end tag: " + std::string(Innermost().name));
    }
    if (*here_ == '>') {
      ++here_;
      if (here_[-2] == '/') {
        return true;  // a "/>" in the text ends the element as well
      }
    } else if (SkipComment()) {
      hasComments = true;
    } else if (*here_ == '<') {
      break;
    } else {
      ++here_;
    }
  }
  if (std::exchange(open_.back().firstRun, false) && keep_ && here_ != behindBlanks) {
    TakeText({begin, here_}, hasComments, commentDepth);
  }
  if (!At("</")) {
    return false;
  }
  const char* const end = std::strchr(here_, '>');
  if (end == nullptr) {
    Fail("Missing Right Angle Bracket Character");
  }
  here_ = end + 1;
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
    Innermost().value.Set(entities_.Decode(run), IfLarge(otherBlocks_));
  }
}

// `commentDepth` is the element's where `raw` begins.
std::string XmlParser::WithoutComments(std::string_view raw, int commentDepth) {
  std::string kept;
  while (!raw.empty()) {
    if (raw.starts_with(kCommentStart)) {
      ++commentDepth;
      raw.remove_prefix(sizeof(kCommentStart) - 1);
    } else if (raw.starts_with(kCommentEnd)) {
      --commentDepth;
      raw.remove_prefix(sizeof(kCommentEnd) - 1);
    } else {
      kept.append(raw, 0, commentDepth > 0 ? 0 : 1);
      raw.remove_prefix(1);
    }
  }
  return kept;
}

// Comments nest. A closing mark outside a comment is passed as well, and takes the effect from the next opening one.
void XmlParser::PassComment() {
  int& depth = open_.back().commentDepth;
  do {
    if (At(kCommentStart)) {
      ++depth;
      here_ += sizeof(kCommentStart) - 1;
    } else if (At(kCommentEnd)) {
      --depth;
      here_ += sizeof(kCommentEnd) - 1;
    } else {
      ++here_;
      while (!AtEnd() && *here_ != '<' && *here_ != '-') {
        ++here_;
      }
    }
  } while (depth > 0 && !AtEnd());
}

// "line, position" of the character that is being looked at, counted from where the search for the top-level element
// began. Counted only when it is asked for.
std::string XmlParser::Place() const {
  const std::string_view read(begin_, here_ + (AtEnd() ? 0 : 1));
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
