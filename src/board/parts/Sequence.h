// The sequence language of the chip file: "cmd:data[.data]*,...". What an entry means is the chip class's own.
#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "board/base/Setting.h"

namespace panelglow {

struct SequenceEntry {
  std::uint32_t command = 0;
  std::vector<std::uint8_t> data;
  bool operator==(const SequenceEntry&) const = default;
};

using Sequence = std::vector<SequenceEntry>;

/// Appends the entries of a setting to `sequence`. "undef" as the whole text gives none, as data an entry without
/// data. Numbers are decimal or "0x" hexadecimal; any other token is 0. True when at least one number was read.
/// Throws mblib_exception for an entry that is not "cmd:data". What is odd about a number is told to people; of a
/// command `commandBits` count to the chip.
bool ParseSequence(const Setting& setting, Sequence& sequence, unsigned commandBits = 32);

/// The tokens of a sequence entry or pair of a setting, split at colons and blanks. Throws mblib_exception, and tells
/// people where the entry stands, unless there are two.
std::vector<std::string> SplitEntry(const std::string& entry, const Setting& setting);

/// A list of "address:byte" of a setting; "undef" is an empty one. Throws mblib_exception as SplitEntry does.
template <class Address>
std::vector<std::pair<Address, std::uint8_t>> ParsePairs(const Setting& setting);

/// Splits a setting at commas and blanks; "undef" has no parts.
std::vector<std::string> SplitList(const Setting& setting);

/// A list of bytes, separated by commas and blanks; the low 8 bits of each number.
std::vector<std::uint8_t> ParseByteList(const Setting& setting);

template <class Address>
std::vector<std::pair<Address, std::uint8_t>> ParsePairs(const Setting& setting) {
  constexpr unsigned kAddressBits = 8 * sizeof(Address);
  std::vector<std::pair<Address, std::uint8_t>> pairs;
  for (const std::string& entry : SplitList(setting)) {
    const std::vector<std::string> tokens = SplitEntry(entry, setting);
    pairs.emplace_back(static_cast<Address>(NumberIn(tokens[0], kAddressBits, setting)),
                       static_cast<std::uint8_t>(NumberIn(tokens[1], 8, setting)));
  }
  return pairs;
}

}  // namespace panelglow
