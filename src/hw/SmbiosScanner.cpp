#include "hw/SmbiosScanner.h"

#include <algorithm>
#include <array>
#include <cstddef>

namespace panelglow {

namespace {

constexpr std::uint32_t kFirstSegment = 0xF000;
constexpr std::uint32_t kLastSegment = 0xFFFF;
constexpr std::array<std::uint8_t, 4> kAnchor{'_', 'S', 'M', '_'};

// Offsets in the entry point.
constexpr std::uint16_t kVersion = 6;
constexpr std::uint16_t kTableLength = 22;
constexpr std::uint16_t kTableAddressLow = 24;
constexpr std::uint16_t kTableAddressHigh = 26;
constexpr std::uint16_t kStructureCount = 28;

constexpr std::uint16_t kVersion21 = 0x0102;       // counts in one byte only
constexpr std::uint8_t kMemoryControllerType = 5;  // has a length rule of its own
constexpr std::size_t kHeaderSize = 4;

}  // namespace

void SmbiosScanner::Scan(const Source& source) {
  for (std::uint32_t at = kFirstSegment; at <= kLastSegment; ++at) {
    const auto segment = static_cast<std::uint16_t>(at);
    bool match = true;
    for (std::uint16_t i = 0; i < kAnchor.size() && match; ++i) {
      match = source.readByte(segment, i) == kAnchor[i];
    }
    if (!match) {
      continue;
    }
    const std::uint32_t high = source.readWord(segment, kTableAddressHigh);
    const std::uint32_t address = high << 16U | source.readWord(segment, kTableAddressLow);
    const std::uint16_t length = source.readWord(segment, kTableLength);
    version_ = source.readWord(segment, kVersion);
    std::size_t count = source.readWord(segment, kStructureCount);
    if (version_ == kVersion21) {
      count &= 0xFF;
    }
    table_.resize(length);
    for (std::uint32_t i = 0; i < length; ++i) {
      table_[i] = source.readByte(static_cast<std::uint16_t>((address + i) >> 4U),
                                  static_cast<std::uint16_t>((address + i) & 15U));
    }
    Walk(count);
    return;
  }
}

// Steps from structure to structure; one that would leave the table ends the walk.
void SmbiosScanner::Walk(std::size_t count) {
  std::size_t start = 0;
  for (std::size_t i = 0; i < count && start + kHeaderSize <= table_.size(); ++i) {
    const std::uint8_t type = table_[start];
    const std::uint8_t length = table_[start + 1];
    structures_.push_back({type, start});
    if (type == kMemoryControllerType) {
      const std::size_t slots = start + 14 < table_.size() ? table_[start + 14] : 0U;
      start += 16 + 2 * slots;
      if (start + 1 < table_.size() && table_[start] == 0 && table_[start + 1] == 0) {
        start += 2;
      }
      continue;
    }
    start += length;
    while (start + 1 < table_.size() && (table_[start] != 0 || table_[start + 1] != 0)) {
      ++start;
    }
    start += 2;
  }
}

std::ptrdiff_t SmbiosScanner::Find(std::uint8_t type) const {
  const auto found =
      std::find_if(structures_.begin(), structures_.end(), [&](const Structure& s) { return s.type == type; });
  return found == structures_.end() ? -1 : static_cast<std::ptrdiff_t>(found->start);
}

std::span<const std::uint8_t> SmbiosScanner::At(std::ptrdiff_t structure) const {
  if (structure < 0 || static_cast<std::size_t>(structure) >= table_.size()) {
    return {};
  }
  return std::span(table_).subspan(static_cast<std::size_t>(structure));
}

std::string SmbiosScanner::StringOf(std::span<const std::uint8_t> structure, std::uint8_t index) {
  if (index == 0 || structure.size() < 2 || structure[1] > structure.size()) {
    return {};
  }
  auto at = structure.begin() + structure[1];
  for (unsigned number = 1;; ++number) {
    const auto end = std::find(at, structure.end(), std::uint8_t{0});
    if (number == index || at == end || end == structure.end()) {
      return number == index ? std::string(at, end) : std::string();  // an empty string ends the list
    }
    at = end + 1;
  }
}

}  // namespace panelglow
