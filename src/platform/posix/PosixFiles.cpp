#include "platform/posix/PosixFiles.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <cstdlib>
#include <ctime>
#include <utility>

namespace panelglow::platform::posix {

namespace {

constexpr mode_t kNewFileMode = 0644;
constexpr int kLockTries = 100;
constexpr long kLockPause_ns = 100'000'000;  // with the tries: about ten seconds

class Descriptor {
 public:
  explicit Descriptor(int fd) : fd_(fd) {}
  Descriptor(Descriptor&& other) noexcept : fd_(std::exchange(other.fd_, -1)) {}
  Descriptor& operator=(Descriptor&& other) noexcept {
    std::swap(fd_, other.fd_);
    return *this;
  }
  ~Descriptor() {
    if (fd_ >= 0) {
      ::close(fd_);
    }
  }
  [[nodiscard]] int Get() const { return fd_; }
  explicit operator bool() const { return fd_ >= 0; }

 private:
  int fd_;
};

// Never blocks on a FIFO, never opens a folder or a device as a file.
Descriptor OpenRegular(const std::string& path, int flags) {
  if (path.empty()) {
    return Descriptor(-1);
  }
  Descriptor file(::open(path.c_str(), flags | O_CLOEXEC | O_NONBLOCK, kNewFileMode));
  struct stat status {};
  if (file && (::fstat(file.Get(), &status) != 0 || !S_ISREG(status.st_mode))) {
    return Descriptor(-1);
  }
  return file;
}

void Lock(int fd) {
  for (int i = 0; i < kLockTries && ::flock(fd, LOCK_EX | LOCK_NB) != 0 && (errno == EWOULDBLOCK || errno == EINTR); ++i) {
    const timespec pause{0, kLockPause_ns};
    ::nanosleep(&pause, nullptr);
  }
}

// The content from the beginning; nothing when it is too large or cannot be read.
std::optional<std::string> ReadAll(int fd) {
  struct stat status {};
  if (::fstat(fd, &status) != 0 || static_cast<std::size_t>(status.st_size) > Files::kLargestFile_bytes) {
    return std::nullopt;
  }
  std::string content(static_cast<std::size_t>(status.st_size), '\0');
  std::size_t length = 0;
  for (;;) {
    if (length == content.size()) {
      // The file may have grown since, and some report no size at all.
      std::array<char, 4096> more{};
      const ssize_t got = ::read(fd, more.data(), more.size());
      if (got < 0 && errno == EINTR) {
        continue;
      }
      if (got <= 0) {
        break;
      }
      content.append(more.data(), static_cast<std::size_t>(got));
      length = content.size();
      if (length > Files::kLargestFile_bytes) {
        return std::nullopt;
      }
      continue;
    }
    const ssize_t got = ::read(fd, content.data() + length, content.size() - length);
    if (got < 0 && errno == EINTR) {
      continue;
    }
    if (got < 0) {
      return std::nullopt;
    }
    if (got == 0) {
      break;
    }
    length += static_cast<std::size_t>(got);
  }
  content.resize(length);
  return content;
}

bool WriteAll(int fd, std::string_view bytes) {
  while (!bytes.empty()) {
    const ssize_t written = ::write(fd, bytes.data(), bytes.size());
    if (written < 0 && errno == EINTR) {
      continue;
    }
    if (written <= 0) {
      return false;
    }
    bytes.remove_prefix(static_cast<std::size_t>(written));
  }
  return true;
}

// True while `fd` is still the file that `path` names: another writer may have put a new one in its place.
bool IsCurrent(int fd, const std::string& path) {
  struct stat opened {};
  struct stat named {};
  return ::fstat(fd, &opened) == 0 && ::stat(path.c_str(), &named) == 0 && opened.st_ino == named.st_ino &&
         opened.st_dev == named.st_dev;
}

Descriptor OpenLocked(const std::string& path, int flags) {
  for (int i = 0; i < kLockTries; ++i) {
    Descriptor file = OpenRegular(path, flags);
    if (!file) {
      return file;
    }
    Lock(file.Get());
    if (IsCurrent(file.Get(), path)) {
      return file;
    }
  }
  return OpenRegular(path, flags);
}

// Puts a new file with `bytes` in the place of `path`. False, and nothing changed, when that does not work.
bool ReplaceFile(const std::string& path, std::string_view bytes, mode_t mode, bool& madeTemporary) {
  std::string temporary = path + ".XXXXXX";
  Descriptor file(::mkostemp(temporary.data(), O_CLOEXEC));
  madeTemporary = static_cast<bool>(file);
  if (!file) {
    return false;
  }
  const bool written = WriteAll(file.Get(), bytes) && ::fchmod(file.Get(), mode & 07777U) == 0 &&
                       ::fsync(file.Get()) == 0 && ::rename(temporary.c_str(), path.c_str()) == 0;
  if (!written) {
    ::unlink(temporary.c_str());
  }
  return written;
}

}  // namespace

std::string NativePath(std::string_view path) {
  std::string native(path);
  std::replace(native.begin(), native.end(), '\\', '/');
  return native;
}

bool PosixFiles::CanRead(std::string_view path) { return static_cast<bool>(OpenRegular(NativePath(path), O_RDONLY)); }

std::optional<std::string> PosixFiles::Read(std::string_view path) {
  const Descriptor file = OpenRegular(NativePath(path), O_RDONLY);
  return file ? ReadAll(file.Get()) : std::nullopt;
}

std::optional<std::string> PosixFiles::ReadLocked(std::string_view path) {
  const Descriptor file = OpenLocked(NativePath(path), O_RDONLY);
  return file ? ReadAll(file.Get()) : std::nullopt;
}

bool PosixFiles::Write(std::string_view path, std::string_view bytes) {
  const Descriptor file = OpenRegular(NativePath(path), O_WRONLY | O_CREAT | O_TRUNC);
  return file && WriteAll(file.Get(), bytes);
}

bool PosixFiles::WriteLocked(std::string_view path, std::string_view bytes) {
  std::string native = NativePath(path);
  std::array<char, PATH_MAX> resolved{};
  if (::realpath(native.c_str(), resolved.data()) != nullptr) {
    native = resolved.data();  // a link stays a link: its target is replaced
  }
  const bool isNew = ::access(native.c_str(), F_OK) != 0;
  const Descriptor file = OpenLocked(native, O_RDWR | O_CREAT);
  struct stat status {};
  if (!file || ::fstat(file.Get(), &status) != 0) {
    return false;
  }
  bool madeTemporary = false;
  if (ReplaceFile(native, bytes, status.st_mode, madeTemporary)) {
    return true;
  }
  if (madeTemporary) {
    if (isNew) {
      ::unlink(native.c_str());
    }
    return false;  // a full disk: the old content is safe
  }
  // The folder takes no new files; the file itself may still be written.
  const std::optional<std::string> old = ReadAll(file.Get());
  const auto store = [&](std::string_view content) {
    return ::lseek(file.Get(), 0, SEEK_SET) == 0 && WriteAll(file.Get(), content) &&
           ::ftruncate(file.Get(), static_cast<off_t>(content.size())) == 0;
  };
  if (store(bytes)) {
    return true;
  }
  if (old) {
    store(*old);
  }
  return false;
}

bool PosixFiles::Remove(std::string_view path) { return ::unlink(NativePath(path).c_str()) == 0; }

std::string PosixFiles::FullPath(std::string_view path) {
  std::string native = NativePath(path);
  if (native.starts_with('/')) {
    return native;
  }
  while (native.starts_with("./")) {
    native.erase(0, 2);
  }
  return CurrentDirectory() + "/" + native;
}

std::string PosixFiles::CurrentDirectory() {
  std::array<char, PATH_MAX> path{};
  return ::getcwd(path.data(), path.size()) == nullptr ? std::string() : std::string(path.data());
}

std::string PosixFiles::FileName(std::string_view path) {
  const std::size_t separator = path.find_last_of("\\/");
  return std::string(separator == std::string_view::npos ? path : path.substr(separator + 1));
}

std::string PosixFiles::ExecutablePath() {
  std::array<char, PATH_MAX> path{};
  const ssize_t length = ::readlink("/proc/self/exe", path.data(), path.size());
  return length <= 0 ? std::string() : std::string(path.data(), static_cast<std::size_t>(length));
}

}  // namespace panelglow::platform::posix
