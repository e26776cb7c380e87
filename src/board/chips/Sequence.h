// The sequence language of the chip file: "cmd:data[.data]*,...". What an entry means is the chip class's own.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace panelglow {

struct SequenceEntry {
  std::uint32_t command = 0;
  std::vector<std::uint8_t> data;
  bool operator==(const SequenceEntry&) const = default;
};

using Sequence = std::vector<SequenceEntry>;

/// Appends the entries of `text` to `sequence`. "undef" as the whole text gives none, as data an entry without data.
/// Numbers are decimal or "0x" hexadecimal; any other token is 0. True when at least one number was read. Throws
/// mblib_exception for an entry that is not "cmd:data".
bool ParseSequence(const std::string& text, Sequence& sequence);

/// The tokens of a sequence entry or pair, split at colons and blanks. Throws mblib_exception unless there are two.
std::vector<std::string> SplitEntry(const std::string& entry);

/// A list of bytes, separated by commas and blanks; the low 8 bits of each number.
std::vector<std::uint8_t> ParseByteList(const std::string& text);

}  // namespace panelglow
