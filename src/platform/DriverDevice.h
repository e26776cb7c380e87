// The privileged driver's device: byte records in, byte records out, no interpretation here.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string_view>

namespace panelglow::platform {

/// Error number of a call on a handle that is not valid (6 on the program's home system).
inline constexpr std::uint32_t kErrorInvalidHandle = 6;

class DriverDevice {
 public:
  virtual ~DriverDevice() = default;

  /// Sends one request. `in` and `out` may be the same memory. Returns 0 on success, otherwise the system's error
  /// number; bytes of `out` that the driver does not write stay as they are. Numbers are little-endian.
  virtual std::uint32_t Control(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) = 0;

  /// Copies between a mapped address that the driver gave out and `bytes`, in naturally ordered accesses of four
  /// bytes and the rest by single bytes, as device memory wants it.
  virtual void ReadMapped(std::uint64_t mapped_address, std::span<std::byte> bytes) = 0;
  virtual void WriteMapped(std::uint64_t mapped_address, std::span<const std::byte> bytes) = 0;
};

class DriverDevices {
 public:
  virtual ~DriverDevices() = default;

  /// Opens the device link (as "tmbhalcyon") for reading and writing. Null, with the error number in `error`, when
  /// there is none.
  virtual std::unique_ptr<DriverDevice> Open(std::string_view link_name, std::uint32_t& error) = 0;
};

}  // namespace panelglow::platform
