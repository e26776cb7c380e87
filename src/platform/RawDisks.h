// Disks by their raw content, past every cache, so that each request reaches the drive.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string_view>

namespace panelglow::platform {

/// Memory for unbuffered requests, aligned as they demand; given back with the object.
class DiskBlock {
 public:
  virtual ~DiskBlock() = default;
  [[nodiscard]] virtual std::span<std::byte> Bytes() = 0;
};

/// An open disk; closed with the object. Positions and lengths are multiples of the disk's sector.
class RawDisk {
 public:
  virtual ~RawDisk() = default;

  /// Sets the position of the next request, in bytes from the start of the disk.
  virtual bool Seek(std::uint64_t position) = 0;

  // The bytes that went through, which may be fewer than asked for; 0 on failure. The position moves on by as many.
  virtual std::size_t Read(std::span<std::byte> bytes) = 0;
  virtual std::size_t Write(std::span<const std::byte> bytes) = 0;
};

class RawDisks {
 public:
  virtual ~RawDisks() = default;

  /// Opens an existing disk for reading and writing, shared with everybody, without buffering. Null on failure.
  virtual std::unique_ptr<RawDisk> Open(std::string_view path) = 0;

  /// Zeroes. Null when there is no memory.
  virtual std::unique_ptr<DiskBlock> Allocate(std::size_t size_bytes) = 0;
};

}  // namespace panelglow::platform
