// Who owns which physical addresses, as the kernel lists them for people (/proc/iomem).
//
// Not everything that answers is in the list, so it is good for a remark and for no refusal.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace panelglow::platform::host_linux {

enum class MemoryOwner { kUnknown, kRam, kDevice, kNobody };

class MemoryMap {
 public:
  /// `text` as in /proc/iomem: a line "first-last : owner" for each range, both addresses inclusive and hexadecimal,
  /// what is inside a range below it. Other lines are passed over.
  explicit MemoryMap(std::string_view text);

  /// Who owns `length` bytes from `first` on. RAM when any of them is; a device when any of them has an owner that is
  /// neither RAM nor a bus. Unknown without the right to the addresses, which are all 0 then.
  [[nodiscard]] MemoryOwner OwnerOf(std::uint64_t first, std::uint64_t length) const;

 private:
  struct Range {
    std::uint64_t first = 0;
    std::uint64_t last = 0;
    MemoryOwner owner = MemoryOwner::kDevice;
  };
  std::vector<Range> ranges_;
};

/// What to tell people ahead of accesses to an address of that owner; empty for an owner that answers.
std::string RemarkOn(MemoryOwner owner, std::uint64_t address);

}  // namespace panelglow::platform::host_linux
