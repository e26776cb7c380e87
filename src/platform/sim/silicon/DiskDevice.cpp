#include "platform/sim/silicon/DiskDevice.h"

#include <algorithm>
#include <cstdio>
#include <cstring>

#include "platform/sim/base/MachineError.h"
#include "platform/sim/silicon/DoorContext.h"

namespace panelglow::platform::sim {

namespace {

constexpr std::uint64_t kHashStart = 0xCBF29CE484222325;
constexpr std::uint64_t kHashFactor = 0x100000001B3;
constexpr std::uint64_t kContentFactor = 0x9E3779B97F4A7C15;

std::uint64_t Hashed(std::uint64_t hash, std::span<const std::byte> bytes) {
  for (const std::byte byte : bytes) {
    hash = (hash ^ std::to_integer<std::uint64_t>(byte)) * kHashFactor;
  }
  return hash;
}

}  // namespace

DiskDevice::DiskDevice(DiskSetup setup, const Scheduler& time) : setup_(std::move(setup)), time_(time) {
  if (setup_.file.empty()) {
    return;
  }
  file_.reset(std::fopen(setup_.file.c_str(), "r+b"));
  if (!file_ || std::setvbuf(file_.get(), nullptr, _IONBF, 0) != 0 || std::fseek(file_.get(), 0, SEEK_END) != 0 ||
      static_cast<std::uint64_t>(std::ftell(file_.get())) != setup_.size_bytes) {
    throw MachineError("the disk \"" + setup_.name + "\" lives in the file " + setup_.file +
                       ", which must be there and have the disk's size, " + std::to_string(setup_.size_bytes) +
                       " bytes");
  }
}

void DiskDevice::EndRequest() {
  --underWay_;
  litUntil_ = std::max(litUntil_, time_.Now() + setup_.glow_us);
}

DiskDevice::Page DiskDevice::OriginalPage(std::uint64_t number) const {
  Page page(kPageBytes);
  std::uint64_t word = number * kPageBytes + setup_.instanceId.size();
  for (std::size_t at = 0; at < kPageBytes; at += sizeof word) {
    word = (word ^ word >> 29U) * kContentFactor + 1;
    std::memcpy(page.data() + at, &word, sizeof word);
  }
  return page;
}

bool DiskDevice::SeekFile(std::uint64_t position) const {
  return std::fseek(file_.get(), static_cast<long>(position), SEEK_SET) == 0;
}

// Shorter than a page at the end of the file.
DiskDevice::Page DiskDevice::PageInFile(std::uint64_t number) const {
  Page page(kPageBytes);
  page.resize(SeekFile(number * kPageBytes) ? std::fread(page.data(), 1, page.size(), file_.get()) : 0);
  return page;
}

DiskDevice::Page& DiskDevice::PageAt(std::uint64_t number) {
  const auto found = pages_.find(number);
  return found != pages_.end()
             ? found->second
             : pages_.emplace(number, file_ ? PageInFile(number) : OriginalPage(number)).first->second;
}

bool DiskDevice::Load(std::uint64_t position, std::span<std::byte> bytes) {
  if (file_) {
    return SeekFile(position) && std::fread(bytes.data(), 1, bytes.size(), file_.get()) == bytes.size();
  }
  while (!bytes.empty()) {
    const std::size_t offset = position % kPageBytes;
    const std::size_t part = std::min(bytes.size(), kPageBytes - offset);
    std::memcpy(bytes.data(), PageAt(position / kPageBytes).data() + offset, part);
    bytes = bytes.subspan(part);
    position += part;
  }
  return true;
}

bool DiskDevice::Store(std::uint64_t position, std::span<const std::byte> bytes) {
  if (file_) {
    for (std::uint64_t page = position / kPageBytes; page * kPageBytes < position + bytes.size(); ++page) {
      PageAt(page);  // as it was
    }
    return SeekFile(position) && std::fwrite(bytes.data(), 1, bytes.size(), file_.get()) == bytes.size();
  }
  while (!bytes.empty()) {
    const std::size_t offset = position % kPageBytes;
    const std::size_t part = std::min(bytes.size(), kPageBytes - offset);
    std::memcpy(PageAt(position / kPageBytes).data() + offset, bytes.data(), part);
    bytes = bytes.subspan(part);
    position += part;
  }
  return true;
}

void DiskDevice::NoteForbiddenWrite(std::uint64_t position, std::size_t size_bytes) {
  if (forbiddenWrites_++ == 0) {
    char text[64];
    std::snprintf(text, sizeof text, "%zu bytes at 0x%llX", size_bytes, static_cast<unsigned long long>(position));
    firstForbidden_ = text;
  }
}

std::optional<bool> DiskDevice::Signal(std::string_view pin) const {
  if (pin != "activity") {
    return std::nullopt;
  }
  return !IsGone() && (underWay_ != 0 || time_.Now() < litUntil_);
}

std::optional<Microseconds> DiskDevice::NextEvent() const {
  std::optional<Microseconds> next;
  for (const Microseconds event : {litUntil_, setup_.goneAt.value_or(0)}) {
    if (event > time_.Now()) {
      next = std::min(next.value_or(event), event);
    }
  }
  return next;
}

std::optional<std::uint64_t> DiskDevice::RegisterOf(std::string_view pin) const {
  return pin == "activity" ? std::optional<std::uint64_t>(DoorContext::kOrders) : std::nullopt;
}

// Of the pages that differ from the start, so that an untouched disk need not be read to know that it is as it was.
std::uint64_t DiskDevice::ContentHash() const {
  std::uint64_t hash = kHashStart;
  for (const auto& [number, page] : pages_) {
    const Page other = file_ ? PageInFile(number) : OriginalPage(number);
    if (page != other) {
      hash = Hashed(hash, std::as_bytes(std::span(&number, 1)));
      hash = Hashed(hash, file_ ? other : page);
    }
  }
  return hash;
}

std::string DiskDevice::State() const {
  char hash[24];
  std::snprintf(hash, sizeof hash, "%016llX", static_cast<unsigned long long>(ContentHash()));
  const std::string writes = forbiddenWrites_ == 0
                                 ? std::string("only what was read just before, at 0x100000 to 0x107FFF")
                                 : std::to_string(forbiddenWrites_) + " forbidden, the first of " + firstForbidden_;
  return "disk " + setup_.name + " content = " + hash + "\ndisk " + setup_.name + " writes = " + writes + "\n";
}

}  // namespace panelglow::platform::sim
