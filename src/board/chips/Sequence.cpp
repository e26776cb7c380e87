#include "board/chips/Sequence.h"

#include "board/base/mblib_exception.h"
#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {

constexpr const char* kUndef = "undef";

std::vector<std::string> Tokens(const std::string& text, std::string_view separators) {
  std::vector<std::string> tokens;
  CDMUtil::Split(text, tokens, separators);
  return tokens;
}

}  // namespace

std::vector<std::string> SplitEntry(const std::string& entry) {
  std::vector<std::string> tokens = Tokens(entry, ": ");
  if (tokens.size() != 2) {
    throw mblib_exception("malformed sequence entry: '" + entry + "'. should be: 'cmd:data[.data]*,...'");
  }
  return tokens;
}

bool ParseSequence(const std::string& text, Sequence& sequence) {
  if (text == kUndef) {
    return false;
  }
  bool read = false;
  for (const std::string& entry : Tokens(text, ", ")) {
    const std::vector<std::string> tokens = SplitEntry(entry);
    SequenceEntry parsed;
    // Unsigned, since memory-mapped registers stand above 0x7FFFFFFF.
    parsed.command = CDMUtil::ToUnsignedLong(tokens[0]);
    if (tokens[1] != kUndef) {
      for (const std::string& byte : Tokens(tokens[1], ". ")) {
        parsed.data.push_back(static_cast<std::uint8_t>(CDMUtil::ToInt(byte)));
      }
    }
    sequence.push_back(std::move(parsed));
    read = true;
  }
  return read;
}

std::vector<std::uint8_t> ParseByteList(const std::string& text) {
  std::vector<std::uint8_t> bytes;
  for (const std::string& token : Tokens(text, ", ")) {
    bytes.push_back(static_cast<std::uint8_t>(CDMUtil::ToInt(token)));
  }
  return bytes;
}

}  // namespace panelglow
