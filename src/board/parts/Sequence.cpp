#include "board/parts/Sequence.h"

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

std::vector<std::string> SplitList(const Setting& setting) {
  return setting.text == kUndef ? std::vector<std::string>() : Tokens(setting.text, ", ");
}

std::vector<std::string> SplitEntry(const std::string& entry, const Setting& setting) {
  std::vector<std::string> tokens = Tokens(entry, ": ");
  if (tokens.size() != 2) {
    const std::string failure = "malformed sequence entry: '" + entry + "'. should be: 'cmd:data[.data]*,...'";
    TellOf(setting, failure);
    throw mblib_exception(failure);
  }
  return tokens;
}

bool ParseSequence(const Setting& setting, Sequence& sequence, unsigned commandBits) {
  bool read = false;
  for (const std::string& entry : SplitList(setting)) {
    const std::vector<std::string> tokens = SplitEntry(entry, setting);
    SequenceEntry parsed;
    // Unsigned, since memory-mapped registers stand above 0x7FFFFFFF.
    parsed.command = CDMUtil::ToUnsignedLong(tokens[0]);
    CheckNumber(tokens[0], commandBits, parsed.command & (0xFFFFFFFFU >> (32 - commandBits)), setting);
    if (tokens[1] != kUndef) {
      for (const std::string& byte : Tokens(tokens[1], ". ")) {
        parsed.data.push_back(static_cast<std::uint8_t>(NumberIn(byte, 8, setting)));
      }
    }
    sequence.push_back(std::move(parsed));
    read = true;
  }
  return read;
}

std::vector<std::uint8_t> ParseByteList(const Setting& setting) {
  std::vector<std::uint8_t> bytes;
  for (const std::string& token : Tokens(setting.text, ", ")) {
    bytes.push_back(static_cast<std::uint8_t>(NumberIn(token, 8, setting)));
  }
  return bytes;
}

}  // namespace panelglow
