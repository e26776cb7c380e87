#include "platform/host_linux/PhysicalMemory.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>

namespace panelglow::platform::host_linux {

namespace {

constexpr std::uint64_t kLargestMapping = std::uint64_t{1} << 20U;

#ifdef MAP_32BIT
constexpr int kLowPlace = MAP_32BIT;
#else
constexpr int kLowPlace = 0;
#endif

}  // namespace

PhysicalMemory::~PhysicalMemory() {
  for (const auto& [pages, mapping] : mappings_) {
    ::munmap(mapping.begin, mapping.length);
  }
  if (file_ >= 0) {
    ::close(file_);
  }
}

int PhysicalMemory::Open() {
  const std::lock_guard<std::mutex> lock(guard_);
  if (file_ < 0) {
    file_ = ::open("/dev/mem", O_RDWR | O_SYNC | O_CLOEXEC);
  }
  return file_ < 0 ? errno : 0;
}

std::uint64_t PhysicalMemory::Map(std::uint64_t address, std::uint64_t length, Reach reach, int& error) {
  const bool isPossible = length != 0 && length <= kLargestMapping && address + length >= address;
  error = isPossible ? Open() : EINVAL;
  if (error != 0) {
    return 0;
  }
  static const auto page = static_cast<std::uint64_t>(::sysconf(_SC_PAGESIZE));
  const std::uint64_t first = address & ~(page - 1);
  const std::uint64_t size = (address + length - first + page - 1) & ~(page - 1);
  const std::lock_guard<std::mutex> lock(guard_);
  Mapping& mapping = mappings_[{first, size, reach}];
  if (mapping.begin == nullptr) {
    void* const begin =
        ::mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_SHARED | (reach == Reach::kNarrow ? kLowPlace : 0), file_,
               static_cast<off_t>(first));
    if (begin == MAP_FAILED) {
      error = errno;
      mappings_.erase({first, size, reach});
      return 0;
    }
    mapping = {begin, size, 0};
  }
  ++mapping.users;
  return mapping.Begin() + (address - first);
}

bool PhysicalMemory::Unmap(std::uint64_t mapped) {
  const std::lock_guard<std::mutex> lock(guard_);
  const auto found = std::find_if(mappings_.begin(), mappings_.end(), [&](const auto& entry) {
    return mapped >= entry.second.Begin() && mapped < entry.second.Begin() + entry.second.length;
  });
  if (found == mappings_.end()) {
    return false;
  }
  if (--found->second.users == 0) {
    ::munmap(found->second.begin, found->second.length);
    mappings_.erase(found);
  }
  return true;
}

}  // namespace panelglow::platform::host_linux
