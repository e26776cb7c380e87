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
#include <filesystem>
#include <functional>
#include <thread>

#include "platform/posix/Descriptor.h"
#include "platform/posix/TemporaryFile.h"

namespace panelglow::platform::posix {

namespace {

constexpr mode_t kNewFileMode = 0644;
constexpr int kLockTries = 100;
constexpr std::chrono::milliseconds kLockPause{100};  // with the tries: about ten seconds

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

// The content from the beginning; nothing when it is too large or cannot be read.
// By pieces that stay in the processor's cache: nothing is filled with zeroes first, and the file may grow or tell no
// size meanwhile.
std::optional<std::string> ReadAll(int fd) {
  struct stat status {};
  if (::fstat(fd, &status) != 0 || static_cast<std::size_t>(status.st_size) > Files::kLargestFile_bytes) {
    return std::nullopt;
  }
  std::string content;
  content.reserve(static_cast<std::size_t>(status.st_size));
  std::array<char, std::size_t{1} << 16U> piece;  // NOLINT(cppcoreguidelines-pro-type-member-init): read into
  for (;;) {
    const ssize_t got = ::read(fd, piece.data(), piece.size());
    if (got < 0 && errno != EINTR) {
      return std::nullopt;
    }
    if (got == 0) {
      return content;
    }
    content.append(piece.data(), got < 0 ? 0 : static_cast<std::size_t>(got));
    if (content.size() > Files::kLargestFile_bytes) {
      return std::nullopt;
    }
  }
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

// Opens and locks; without the lock when it is not to be had in time. `pause` lets some time pass between two tries.
Descriptor OpenLocked(const std::string& path, int flags, const std::function<void()>& pause) {
  Descriptor file = OpenRegular(path, flags);
  for (int i = 0; i < kLockTries && file; ++i) {
    if (::flock(file.Get(), LOCK_EX | LOCK_NB) == 0) {
      if (IsCurrent(file.Get(), path)) {
        break;
      }
      file = OpenRegular(path, flags);
    } else if (errno == EWOULDBLOCK) {
      pause();
    } else if (errno != EINTR) {
      break;  // a file system without locks
    }
  }
  return file;
}

enum class Replacement { kDone, kNoSpace, kNotPossible };

// Puts a new file with `bytes` in the place of `path`, with the owner and the rights of the old one. Otherwise
// nothing is changed: the bytes found no space, or the folder does not take a new file under this name.
Replacement ReplaceFile(const std::string& path, std::string_view bytes, const struct stat& old) {
  TemporaryFile file(path);
  if (!file) {
    return Replacement::kNotPossible;
  }
  if (!WriteAll(file.Get(), bytes) || ::fsync(file.Get()) != 0) {
    return Replacement::kNoSpace;
  }
  struct stat made {};
  const bool done = ::fstat(file.Get(), &made) == 0 &&
                    ((made.st_uid == old.st_uid && made.st_gid == old.st_gid) ||
                     ::fchown(file.Get(), old.st_uid, old.st_gid) == 0) &&
                    ::fchmod(file.Get(), old.st_mode & 07777U) == 0 && file.TakePlace();
  return done ? Replacement::kDone : Replacement::kNotPossible;
}

// Writes into the file itself; puts the old content back when that fails half-way.
bool OverwriteFile(int fd, std::string_view bytes) {
  const auto store = [&](std::string_view content) {
    return ::lseek(fd, 0, SEEK_SET) == 0 && WriteAll(fd, content) &&
           ::ftruncate(fd, static_cast<off_t>(content.size())) == 0;
  };
  const std::optional<std::string> old = ::lseek(fd, 0, SEEK_SET) == 0 ? ReadAll(fd) : std::nullopt;
  if (old && store(bytes)) {
    return true;
  }
  if (old) {
    store(*old);
  }
  return false;
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
  const Descriptor file = OpenLocked(NativePath(path), O_RDONLY, [this] { Pause(kLockPause); });
  return file ? ReadAll(file.Get()) : std::nullopt;
}

bool PosixFiles::Write(std::string_view path, std::string_view bytes) {
  const Descriptor file = OpenRegular(NativePath(path), O_WRONLY | O_CREAT | O_TRUNC);
  return file && WriteAll(file.Get(), bytes);
}

bool PosixFiles::WriteLocked(std::string_view path, std::string_view bytes) {
  std::string native = NativePath(path);
  const bool isNew = ::access(native.c_str(), F_OK) != 0;
  const Descriptor file = OpenLocked(native, O_RDWR | O_CREAT, [this] { Pause(kLockPause); });
  struct stat status {};
  if (!file || ::fstat(file.Get(), &status) != 0) {
    return false;
  }
  std::array<char, PATH_MAX> resolved{};
  if (::realpath(native.c_str(), resolved.data()) != nullptr) {
    native = resolved.data();  // a link stays a link: its target is replaced
  }
  const Replacement replacement = ReplaceFile(native, bytes, status);
  const bool written = replacement == Replacement::kDone ||
                       (replacement == Replacement::kNotPossible && OverwriteFile(file.Get(), bytes));
  if (!written && isNew && status.st_size == 0) {
    ::unlink(native.c_str());
  }
  return written;
}

bool PosixFiles::Remove(std::string_view path) { return ::unlink(NativePath(path).c_str()) == 0; }

// One file has one full path, whatever "." and ".." the caller's form has: locks are named after it.
std::string PosixFiles::FullPath(std::string_view path) {
  return (std::filesystem::path(CurrentDirectory()) / NativePath(path)).lexically_normal().string();
}

std::string PosixFiles::CurrentDirectory() {
  std::array<char, PATH_MAX> path{};
  return ::getcwd(path.data(), path.size()) == nullptr ? std::string() : std::string(path.data());
}

std::string PosixFiles::FileName(std::string_view path) {
  const std::size_t separator = path.find_last_of("\\/");
  return std::string(separator == std::string_view::npos ? path : path.substr(separator + 1));
}

void PosixFiles::Pause(std::chrono::milliseconds duration) { std::this_thread::sleep_for(duration); }

std::string PosixFiles::ExecutablePath() {
  std::array<char, PATH_MAX> path{};
  const ssize_t length = ::readlink("/proc/self/exe", path.data(), path.size());
  return length <= 0 ? std::string() : std::string(path.data(), static_cast<std::size_t>(length));
}

}  // namespace panelglow::platform::posix
