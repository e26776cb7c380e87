#include "platform/sim/SimRawDisks.h"

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <new>
#include <optional>

#include "platform/AsciiCase.h"

namespace panelglow::platform::sim {

namespace {

constexpr std::size_t kSectorBytes = 512;
constexpr std::size_t kPageBytes = 4096;

constexpr Microseconds kOpenCost_us = 100;
constexpr Microseconds kRefusalCost_us = 20;     // of a request that never reaches the drive
constexpr Microseconds kRetries_us = 2'000'000;  // what a drive that barely reads spends on a request

class PageBlock : public DiskBlock {
 public:
  explicit PageBlock(std::size_t size_bytes)
      : size_bytes_(size_bytes), memory_(::operator new (size_bytes, std::align_val_t{kPageBytes})) {
    std::memset(memory_, 0, size_bytes);
  }
  ~PageBlock() override { ::operator delete (memory_, std::align_val_t{kPageBytes}); }
  PageBlock(const PageBlock&) = delete;
  PageBlock& operator=(const PageBlock&) = delete;

  std::span<std::byte> Bytes() override { return {static_cast<std::byte*>(memory_), size_bytes_}; }

 private:
  std::size_t size_bytes_;
  void* memory_;  // owned
};

bool IsAligned(std::uint64_t number) { return number % kSectorBytes == 0; }

bool IsAligned(std::span<const std::byte> bytes) {
  return IsAligned(bytes.size()) && IsAligned(reinterpret_cast<std::uintptr_t>(bytes.data()));
}

// Whether a request touches the block at which an ill disk fails.
bool TouchesTestBlock(std::uint64_t position, std::size_t size_bytes) {
  return position < DiskDevice::kTestBlock.first + DiskDevice::kTestBlock.size &&
         position + size_bytes > DiskDevice::kTestBlock.first;
}

bool LiesInTestBlock(std::uint64_t position, std::size_t size_bytes) {
  return position >= DiskDevice::kTestBlock.first &&
         position + size_bytes <= DiskDevice::kTestBlock.first + DiskDevice::kTestBlock.size;
}

}  // namespace

class SimRawDisks::Handle : public RawDisk {
 public:
  Handle(DiskDevice& disk, DoorContext& context) : disk_(disk), context_(context) {}

  bool Seek(std::uint64_t position) override {
    context_.scheduler.Spend(1);
    if (!IsAligned(position)) {
      return false;
    }
    position_ = position;
    return true;
  }

  std::size_t Read(std::span<std::byte> bytes) override {
    lastRead_.clear();
    const std::optional<std::size_t> size = Request(bytes, DiskSetup::Fault::kReadError);
    if (!size) {
      return 0;
    }
    const std::span<std::byte> read = bytes.first(*size);
    if (!disk_.Load(position_, read)) {
      return 0;
    }
    lastRead_.assign(read.begin(), read.end());
    lastPosition_ = position_;
    position_ += *size;
    return *size;
  }

  std::size_t Write(std::span<const std::byte> bytes) override {
    const bool wasRead = !lastRead_.empty() && lastPosition_ == position_ && lastRead_.size() == bytes.size() &&
                         std::memcmp(bytes.data(), lastRead_.data(), bytes.size()) == 0;
    lastRead_.clear();
    const std::uint64_t position = position_;
    if (!wasRead || !LiesInTestBlock(position, bytes.size())) {
      disk_.NoteForbiddenWrite(position, bytes.size());
    }
    const std::optional<std::size_t> size = Request(bytes, DiskSetup::Fault::kWriteError);
    if (!size || !disk_.Store(position, bytes.first(*size))) {
      return 0;
    }
    position_ += *size;
    return *size;
  }

 private:
  // The lamp's side of a request; ends it when the thread that waits for it is told to end, too.
  class Activity {
   public:
    Activity(DiskDevice& disk, DoorContext& context) : disk_(disk), context_(context) {
      disk_.BeginRequest();
      context_.moved();
    }
    ~Activity() {
      disk_.EndRequest();
      context_.moved();
    }
    Activity(const Activity&) = delete;
    Activity& operator=(const Activity&) = delete;

   private:
    DiskDevice& disk_;
    DoorContext& context_;
  };

  [[nodiscard]] bool IsThere() const { return !disk_.IsGone() && !context_.buses.IsRemoved(disk_.Setup().name); }

  // The time that a request takes, and how many of its bytes go through; nothing when it fails.
  std::optional<std::size_t> Request(std::span<const std::byte> bytes, DiskSetup::Fault failing) {
    const DiskSetup& setup = disk_.Setup();
    if (!IsThere() || !IsAligned(bytes) || position_ >= setup.size_bytes) {
      context_.scheduler.Spend(kRefusalCost_us);
      return std::nullopt;
    }
    const Microseconds duration = setup.fault == DiskSetup::Fault::kSlow ? kRetries_us : setup.latency_us;
    if (context_.Ignores(setup.name)) {
      context_.scheduler.Spend(duration);  // answered by something between here and the platters
    } else {
      const Activity activity(disk_, context_);
      context_.scheduler.Spend(duration);
    }
    if (!IsThere() || (setup.fault == failing && TouchesTestBlock(position_, bytes.size()))) {
      return std::nullopt;
    }
    return static_cast<std::size_t>(std::min<std::uint64_t>(bytes.size(), setup.size_bytes - position_));
  }

  DiskDevice& disk_;
  DoorContext& context_;
  std::uint64_t position_ = 0;
  std::uint64_t lastPosition_ = 0;
  std::vector<std::byte> lastRead_;  // by the last request, if that was a read
};

std::unique_ptr<RawDisk> SimRawDisks::Open(std::string_view path) {
  context_.scheduler.Spend(kOpenCost_us);
  for (DiskDevice* disk : disks_) {
    const DiskSetup& setup = disk->Setup();
    const bool isNamed = EqualNames(path, setup.path) || EqualNames(path, setup.interfacePath);
    if (isNamed && !path.empty() && setup.fault != DiskSetup::Fault::kNoOpen && !disk->IsGone() &&
        !context_.buses.IsRemoved(setup.name)) {
      return std::make_unique<Handle>(*disk, context_);
    }
  }
  return nullptr;
}

std::unique_ptr<DiskBlock> SimRawDisks::Allocate(std::size_t size_bytes) {
  context_.scheduler.Spend(1);
  return std::make_unique<PageBlock>(size_bytes);
}

}  // namespace panelglow::platform::sim
