#include "platform/host_linux/KernelFiles.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string_view>

#include "platform/posix/Descriptor.h"

namespace panelglow::platform::host_linux {

namespace {

constexpr std::size_t kAttribute_bytes = 4096;  // the kernel shows no more in one
constexpr std::size_t kMostNames = 65536;

// Disks are counted in letters behind two that say what they are, the shorter names first.
bool IsLetteredDisk(const std::string& name) {
  return name.size() > 2 && (name[0] == 's' || name[0] == 'v') && name[1] == 'd';
}

}  // namespace

bool IsAheadOf(const std::string& one, const std::string& other) {
  const bool areLetters = IsLetteredDisk(one) && IsLetteredDisk(other) && one[0] == other[0];
  if (areLetters && one.size() != other.size()) {
    return one.size() < other.size();
  }
  return ::strverscmp(one.c_str(), other.c_str()) < 0;
}

std::optional<std::string> ReadKernelBytes(const std::string& path, std::size_t most_bytes) {
  // Without waiting: what should be an attribute may be a pipe.
  const posix::Descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
  struct stat status {};
  if (!file || ::fstat(file.Get(), &status) != 0 || !S_ISREG(status.st_mode)) {
    return std::nullopt;
  }
  std::string bytes;
  std::array<char, kAttribute_bytes> room{};
  while (bytes.size() < most_bytes) {
    const ssize_t size = ::read(file.Get(), room.data(), std::min(room.size(), most_bytes - bytes.size()));
    if (size < 0 && errno == EINTR) {
      continue;
    }
    if (size < 0) {
      return std::nullopt;
    }
    if (size == 0) {
      break;
    }
    bytes.append(room.data(), static_cast<std::size_t>(size));
  }
  return bytes;
}

std::string ReadKernelText(const std::string& path) {
  std::string text = ReadKernelBytes(path, kAttribute_bytes).value_or("");
  text.resize(std::min(text.find('\0'), text.size()));
  constexpr const char* kBlanks = " \t\r\n";
  const std::size_t first = text.find_first_not_of(kBlanks);
  text = first == std::string::npos ? std::string() : text.substr(first, text.find_last_not_of(kBlanks) - first + 1);
  std::replace_if(
      text.begin(), text.end(), [](char c) { return c < ' ' || c > '~'; }, '?');
  return text;
}

std::optional<std::uint64_t> ReadKernelNumber(const std::string& path, std::uint64_t largest) {
  const std::string text = ReadKernelText(path);
  const bool isHexadecimal = text.compare(0, 2, "0x") == 0;
  std::uint64_t number = 0;
  const char* const end = text.data() + text.size();
  const auto [last, error] =
      std::from_chars(text.data() + (isHexadecimal ? 2 : 0), end, number, isHexadecimal ? 16 : 10);
  return error == std::errc() && last == end && number <= largest ? std::optional(number) : std::nullopt;
}

std::vector<std::string> KernelNames(const std::string& folder) {
  std::vector<std::string> names;
  const std::unique_ptr<DIR, int (*)(DIR*)> open(::opendir(folder.c_str()), &::closedir);
  while (open && names.size() < kMostNames) {
    const dirent* const entry = ::readdir(open.get());
    if (entry == nullptr) {
      break;
    }
    if (entry->d_name[0] != '.') {
      names.emplace_back(entry->d_name);
    }
  }
  std::sort(names.begin(), names.end(), IsAheadOf);
  return names;
}

std::string RealPath(const std::string& path) {
  const std::unique_ptr<char, void (*)(void*)> real(::realpath(path.c_str(), nullptr), &std::free);
  return real ? std::string(real.get()) : std::string();
}

std::string LinkName(const std::string& path) {
  std::array<char, PATH_MAX> target{};
  const ssize_t size = ::readlink(path.c_str(), target.data(), target.size());
  if (size <= 0) {
    return {};
  }
  const std::string_view text(target.data(), static_cast<std::size_t>(size));
  return std::string(text.substr(text.rfind('/') + 1));
}

std::vector<std::string> PathNames(const std::string& path) {
  std::vector<std::string> names;
  std::size_t begin = 0;
  while (begin < path.size()) {
    const std::size_t end = std::min(path.find('/', begin), path.size());
    if (end > begin) {
      names.push_back(path.substr(begin, end - begin));
    }
    begin = end + 1;
  }
  return names;
}

}  // namespace panelglow::platform::host_linux
