#include "platform/posix/TemporaryFile.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <string_view>
#include <utility>

namespace panelglow::platform::posix {

namespace {

namespace fs = std::filesystem;

constexpr std::string_view kMark = ".panelglow-";
constexpr std::string_view kPlaces = "XXXXXX";  // for mkostemp
constexpr int kTries = 10;

bool Lock(int fd, int operation) {
  int result = -1;
  do {
    result = ::flock(fd, operation);
  } while (result != 0 && errno == EINTR);
  return result == 0;
}

// A file without a lock has lost its writer. One that cannot be opened or locked at all stays.
void RemoveIfLeft(const fs::path& path) {
  const Descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOFOLLOW));
  if (file && Lock(file.Get(), LOCK_EX | LOCK_NB) && IsCurrent(file.Get(), path)) {
    ::unlink(path.c_str());
  }
}

void RemoveWhatWasLeft(const std::string& target) {
  const fs::path beside(target);
  const std::string start = beside.filename().string() + std::string(kMark);
  std::error_code error;  // a folder that cannot be listed keeps what it has
  fs::directory_iterator entry(beside.has_parent_path() ? beside.parent_path() : fs::path("."), error);
  for (; !error && entry != fs::directory_iterator(); entry.increment(error)) {
    const std::string name = entry->path().filename().string();
    if (name.size() == start.size() + kPlaces.size() && name.starts_with(start)) {
      RemoveIfLeft(entry->path());
    }
  }
}

}  // namespace

bool IsCurrent(int fd, const std::string& path) {
  struct stat opened {};
  struct stat named {};
  return ::fstat(fd, &opened) == 0 && ::stat(path.c_str(), &named) == 0 && opened.st_ino == named.st_ino &&
         opened.st_dev == named.st_dev;
}

TemporaryFile::TemporaryFile(std::string targetPath) : target_(std::move(targetPath)) {
  RemoveWhatWasLeft(target_);
  // Between the making and the lock another process may take it for one that was left.
  for (int i = 0; i < kTries; ++i) {
    Make();
    if (!file_ || !Lock(file_.Get(), LOCK_EX) || IsCurrent(file_.Get(), path_)) {
      return;
    }
  }
}

void TemporaryFile::Make() {
  path_ = target_ + std::string(kMark) + std::string(kPlaces);
  file_ = Descriptor(::mkostemp(path_.data(), O_CLOEXEC));
  if (!file_) {
    path_.clear();
  }
}

TemporaryFile::~TemporaryFile() {
  if (!path_.empty()) {
    ::unlink(path_.c_str());
  }
}

bool TemporaryFile::TakePlace() {
  if (path_.empty() || std::rename(path_.c_str(), target_.c_str()) != 0) {
    return false;
  }
  path_.clear();
  return true;
}

}  // namespace panelglow::platform::posix
