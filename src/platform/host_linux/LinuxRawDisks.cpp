#include "platform/host_linux/LinuxRawDisks.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <new>
#include <sstream>
#include <string_view>
#include <utility>

#include "platform/host_linux/CurrentThread.h"
#include "platform/host_linux/StorageInventory.h"
#include "platform/posix/Descriptor.h"

namespace panelglow::platform::host_linux {

namespace {

constexpr std::size_t kAlignment = 4096;  // the largest sector in use

class AlignedBlock : public DiskBlock {
 public:
  explicit AlignedBlock(std::size_t size)
      : bytes_(static_cast<std::byte*>(::operator new (size, std::align_val_t{kAlignment}, std::nothrow))),
        size_(bytes_ == nullptr ? 0 : size) {
    std::fill_n(bytes_, size_, std::byte{});
  }
  ~AlignedBlock() override { ::operator delete (bytes_, std::align_val_t{kAlignment}); }
  AlignedBlock(const AlignedBlock&) = delete;
  AlignedBlock& operator=(const AlignedBlock&) = delete;
  std::span<std::byte> Bytes() override { return {bytes_, size_}; }
  [[nodiscard]] bool IsThere() const { return bytes_ != nullptr; }

 private:
  std::byte* bytes_;  // owned
  std::size_t size_;
};

// Whether a device file is the disk's own or a partition's: "/dev/sda1" of "/dev/sda", "/dev/nvme0n1p2" of
// "/dev/nvme0n1", but "/dev/sdaa" is another disk.
bool IsPartOf(std::string_view disk, std::string_view device) {
  if (disk.empty() || device.substr(0, disk.size()) != disk) {
    return false;
  }
  const auto isDigit = [](char c) { return c >= '0' && c <= '9'; };
  std::string_view rest = device.substr(disk.size());
  if (rest.empty()) {
    return true;
  }
  if (isDigit(disk.back())) {
    if (rest.front() != 'p') {
      return false;
    }
    rest.remove_prefix(1);
  }
  return !rest.empty() && std::all_of(rest.begin(), rest.end(), isDigit);
}

// Where partitions of this disk are mounted, for people: "/boot, /". Empty: not by a mount.
std::string MountedAt(const std::string& disk) {
  std::ifstream mounts("/proc/self/mounts");
  std::string places;
  for (std::string line; std::getline(mounts, line);) {
    std::istringstream words(line);
    std::string device;
    std::string place;
    if (words >> device >> place && IsPartOf(disk, device)) {
      places += (places.empty() ? "" : ", ") + place;
    }
  }
  return places;
}

}  // namespace

struct LinuxRawDisks::OpenDisk {
  posix::Descriptor file;
  bool isWritable = false;
  std::uint64_t node = 0;
};

class LinuxRawDisks::Disk : public RawDisk {
 public:
  Disk(std::shared_ptr<const OpenDisk> open, std::string path, posix::OnceTeller& teller)
      : open_(std::move(open)), path_(std::move(path)), teller_(teller) {}

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
    return Moved("read", ::pread(open_->file.Get(), bytes.data(), bytes.size(), position_));
  }

  std::size_t Write(std::span<const std::byte> bytes) override {
    CurrentThread::CheckEndRequest();
    return open_->isWritable ? Moved("written", ::pwrite(open_->file.Get(), bytes.data(), bytes.size(), position_))
                             : 0;
  }

 private:
  std::size_t Moved(const char* what, ssize_t count) {
    if (count > 0) {
      position_ += count;
      return static_cast<std::size_t>(count);
    }
    const int error = count < 0 ? errno : 0;
    teller_.Tell("The disk " + path_ + " cannot be " + what + " (" +
                 (error == 0 ? std::string("it ends before") : std::string(std::strerror(error))) +
                 "), so its LED may stay dark.");
    return 0;
  }

  std::shared_ptr<const OpenDisk> open_;
  std::string path_;
  posix::OnceTeller& teller_;  // the disks', which outlive every run
  off_t position_ = 0;
};

std::shared_ptr<const LinuxRawDisks::OpenDisk> LinuxRawDisks::Find(const std::string& path, std::uint64_t node) {
  const std::lock_guard<std::mutex> lock(guard_);
  std::weak_ptr<const OpenDisk>& known = open_[path];
  if (auto open = known.lock(); open && open->node == node) {
    return open;
  }
  last_ = nullptr;
  constexpr int kUnbuffered = O_DIRECT | O_CLOEXEC;
  posix::Descriptor file(::open(path.c_str(), O_RDWR | O_EXCL | kUnbuffered));
  const int refusal = file ? 0 : errno;
  if (refusal != 0) {
    file = posix::Descriptor(::open(path.c_str(), O_RDONLY | kUnbuffered));
  }
  if (!file) {
    const int error = errno;
    teller_.Tell("The disk " + path + " cannot be opened (" + std::strerror(error) + "), so its LED stays dark" +
                 (error == EACCES || error == EPERM
                      ? ": start the program as root, or as a member of the group \"disk\"."
                      : "."));
    return nullptr;
  }
  if (refusal != 0) {
    const std::string places = MountedAt(path);
    teller_.Tell("The disk " + path +
                 (refusal != EBUSY ? std::string(" cannot be written (") + std::strerror(refusal) + ")"
                  : places.empty() ? std::string(" is in use by another program or as part of a volume")
                                   : " is in use (mounted at " + places + ")") +
                 ": its LED is lit by reading alone, nothing is written to it.");
  }
  auto open = std::make_shared<const OpenDisk>(OpenDisk{std::move(file), refusal == 0, node});
  known = open;
  last_ = open;
  return open;
}

std::unique_ptr<RawDisk> LinuxRawDisks::Open(std::string_view name) {
  CurrentThread::CheckEndRequest();
  const std::string path = DiskFileOf({}, name);
  struct stat status {};
  if (path.empty() || ::stat(path.c_str(), &status) != 0 || !S_ISBLK(status.st_mode)) {
    return nullptr;
  }
  std::shared_ptr<const OpenDisk> open = Find(path, status.st_ino);
  return open ? std::make_unique<Disk>(std::move(open), path, teller_) : nullptr;
}

std::unique_ptr<DiskBlock> LinuxRawDisks::Allocate(std::size_t size_bytes) {
  auto block = std::make_unique<AlignedBlock>(size_bytes);
  return block->IsThere() ? std::move(block) : nullptr;
}

}  // namespace panelglow::platform::host_linux
