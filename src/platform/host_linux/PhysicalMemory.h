// The machine's physical address space, by mappings of /dev/mem that are kept: device memory cannot be read or
// written there, only mapped.
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <mutex>
#include <tuple>

namespace panelglow::platform::host_linux {

/// Where in the process a mapping may be: anywhere, or where 32 bits reach.
enum class Reach { kAll, kNarrow };

class PhysicalMemory {
 public:
  PhysicalMemory() = default;
  ~PhysicalMemory();
  PhysicalMemory(const PhysicalMemory&) = delete;
  PhysicalMemory& operator=(const PhysicalMemory&) = delete;

  /// Whether the kernel lets anybody in: 0, or its error number.
  int Open();

  /// The address in this process, the same one for the same pages; 0 with the kernel's error number: RAM and ranges
  /// that a kernel driver has are refused. EINVAL is for lengths of 0 and above 1 MiB, whoever asks.
  std::uint64_t Map(std::uint64_t address, std::uint64_t length, Reach reach, int& error);

  /// Gives a mapping back when nobody has it any more; false for an address that is none.
  bool Unmap(std::uint64_t mapped);

 private:
  struct Mapping {
    void* begin = nullptr;  // of the pages, in the process; owned

    [[nodiscard]] std::uint64_t Begin() const { return reinterpret_cast<std::uint64_t>(begin); }
    std::size_t length = 0;
    unsigned users = 0;
  };

  std::mutex guard_;
  int file_ = -1;
  std::map<std::tuple<std::uint64_t, std::uint64_t, Reach>, Mapping> mappings_;  // by first page and length
};

}  // namespace panelglow::platform::host_linux
