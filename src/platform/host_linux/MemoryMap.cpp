#include "platform/host_linux/MemoryMap.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstdio>
#include <optional>

namespace panelglow::platform::host_linux {

namespace {

// Takes a hexadecimal number from the front.
std::optional<std::uint64_t> TakeNumber(std::string_view& text) {
  std::uint64_t number = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number, 16);
  if (error != std::errc()) {
    return std::nullopt;
  }
  text.remove_prefix(static_cast<std::size_t>(end - text.data()));
  return number;
}

bool TakeText(std::string_view& text, std::string_view expected) {
  if (text.substr(0, expected.size()) != expected) {
    return false;
  }
  text.remove_prefix(expected.size());
  return true;
}

// What a bus passes on is nobody's until a device below it has it.
bool IsBus(std::string_view owner) { return owner.substr(0, 8) == "PCI Bus "; }

}  // namespace

MemoryMap::MemoryMap(std::string_view text) {
  while (!text.empty()) {
    std::string_view line = text.substr(0, text.find('\n'));
    text.remove_prefix(std::min(line.size() + 1, text.size()));
    line.remove_prefix(std::min(line.find_first_not_of(' '), line.size()));
    const auto first = TakeNumber(line);
    const bool hasLast = first && TakeText(line, "-");
    const auto last = hasLast ? TakeNumber(line) : std::nullopt;
    if (!last || *last < *first || !TakeText(line, " : ")) {
      continue;
    }
    ranges_.push_back({*first, *last,
                       line == "System RAM" ? MemoryOwner::kRam
                       : IsBus(line)        ? MemoryOwner::kNobody
                                            : MemoryOwner::kDevice});
  }
  if (std::all_of(ranges_.begin(), ranges_.end(), [](const Range& range) { return range.last == 0; })) {
    ranges_.clear();
  }
}

MemoryOwner MemoryMap::OwnerOf(std::uint64_t first, std::uint64_t length) const {
  if (ranges_.empty() || length == 0 || first + (length - 1) < first) {
    return MemoryOwner::kUnknown;
  }
  MemoryOwner owner = MemoryOwner::kNobody;
  for (const Range& range : ranges_) {
    if (range.last < first || range.first > first + (length - 1)) {
      continue;
    }
    if (range.owner == MemoryOwner::kRam) {
      return MemoryOwner::kRam;
    }
    owner = range.owner == MemoryOwner::kDevice ? range.owner : owner;
  }
  return owner;
}

std::string RemarkOn(MemoryOwner owner, std::uint64_t address) {
  if (owner != MemoryOwner::kRam && owner != MemoryOwner::kNobody) {
    return {};
  }
  std::array<char, 32> text{};
  std::snprintf(text.data(), text.size(), "0x%llX", static_cast<unsigned long long>(address));
  const std::string where = text.data();
  return owner == MemoryOwner::kRam
             ? "The memory at " + where +
                   " is RAM and no device, and nothing was read or written there: check the address in the "
                   "board's files."
             : "Nothing answers at the memory address " + where +
                   " as far as the kernel knows: if its LED stays dark, check the address in the board's files.";
}

}  // namespace panelglow::platform::host_linux
