#include "platform/host_linux/LinuxRawDisks.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <new>
#include <sstream>

#include "platform/host_linux/CurrentThread.h"
#include "platform/host_linux/StorageInventory.h"
#include "platform/posix/Descriptor.h"
#include "platform/posix/TellPeople.h"

namespace panelglow::platform::host_linux {

namespace {

constexpr std::size_t kAlignment = 4096;  // the largest sector in use

class AlignedBlock : public DiskBlock {
 public:
  explicit AlignedBlock(std::size_t size)
      : bytes_(static_cast<std::byte*>(::operator new (size, std::align_val_t{kAlignment}, std::nothrow))),
        size_(size) {}
  ~AlignedBlock() override { ::operator delete (bytes_, std::align_val_t{kAlignment}); }
  AlignedBlock(const AlignedBlock&) = delete;
  AlignedBlock& operator=(const AlignedBlock&) = delete;
  std::span<std::byte> Bytes() override { return {bytes_, bytes_ == nullptr ? 0 : size_}; }
  [[nodiscard]] bool IsThere() const { return bytes_ != nullptr; }

 private:
  std::byte* bytes_;  // owned
  std::size_t size_;
};

class Disk : public RawDisk {
 public:
  Disk(posix::Descriptor file, bool isWritable) : file_(std::move(file)), isWritable_(isWritable) {}

  bool Seek(std::uint64_t position) override {
    CurrentThread::CheckEndRequest();
    if (position > static_cast<std::uint64_t>(INT64_MAX)) {
      return false;
    }
    position_ = static_cast<off_t>(position);
    return true;
  }

  std::size_t Read(std::span<std::byte> bytes) override {
    CurrentThread::CheckEndRequest();
    return Moved(::pread(file_.Get(), bytes.data(), bytes.size(), position_));
  }

  std::size_t Write(std::span<const std::byte> bytes) override {
    CurrentThread::CheckEndRequest();
    return isWritable_ ? Moved(::pwrite(file_.Get(), bytes.data(), bytes.size(), position_)) : 0;
  }

 private:
  std::size_t Moved(ssize_t count) {
    if (count <= 0) {
      return 0;
    }
    position_ += count;
    return static_cast<std::size_t>(count);
  }

  posix::Descriptor file_;
  bool isWritable_;
  off_t position_ = 0;
};

// Where partitions of this disk are mounted, for people: "/boot, /". Empty: not by a mount.
std::string MountedAt(const std::string& disk) {
  std::ifstream mounts("/proc/self/mounts");
  std::string places;
  for (std::string line; std::getline(mounts, line);) {
    std::istringstream words(line);
    std::string device;
    std::string place;
    if (words >> device >> place && device.rfind(disk, 0) == 0) {
      places += (places.empty() ? "" : ", ") + place;
    }
  }
  return places;
}

}  // namespace

void LinuxRawDisks::TellOnce(const std::string& sentence) {
  const std::lock_guard<std::mutex> lock(guard_);
  if (told_.insert(sentence).second) {
    posix::TellPeople(sentence);
  }
}

std::unique_ptr<RawDisk> LinuxRawDisks::Open(std::string_view name) {
  CurrentThread::CheckEndRequest();
  const std::string path = DiskFileOf({}, name);
  struct stat status {};
  if (path.empty() || ::stat(path.c_str(), &status) != 0 || !S_ISBLK(status.st_mode)) {
    return nullptr;
  }
  constexpr int kUnbuffered = O_DIRECT | O_CLOEXEC;
  posix::Descriptor file(::open(path.c_str(), O_RDWR | O_EXCL | kUnbuffered));
  if (file) {
    return std::make_unique<Disk>(std::move(file), true);
  }
  const int refusal = errno;
  file = posix::Descriptor(::open(path.c_str(), O_RDONLY | kUnbuffered));
  if (!file) {
    TellOnce("The disk " + path + " cannot be opened (" + std::strerror(errno) +
             "), so its LED stays dark: start the program as root, or as a member of the group \"disk\".");
    return nullptr;
  }
  const std::string places = MountedAt(path);
  TellOnce("The disk " + path +
           (refusal != EBUSY ? std::string(" cannot be written (") + std::strerror(refusal) + ")"
            : places.empty() ? std::string(" is in use by another program or as part of a volume")
                             : " is in use (mounted at " + places + ")") +
           ": its LED is lit by reading alone, nothing is written to it.");
  return std::make_unique<Disk>(std::move(file), false);
}

std::unique_ptr<DiskBlock> LinuxRawDisks::Allocate(std::size_t size_bytes) {
  auto block = std::make_unique<AlignedBlock>(size_bytes);
  return block->IsThere() ? std::move(block) : nullptr;
}

}  // namespace panelglow::platform::host_linux
