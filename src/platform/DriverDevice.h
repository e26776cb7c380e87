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

  /// One access to device memory at a mapped address that the driver gave out. `width` is 1 or 4 bytes.
  virtual std::uint32_t ReadMapped(std::uint64_t mapped_address, std::size_t width) = 0;
  virtual void WriteMapped(std::uint64_t mapped_address, std::size_t width, std::uint32_t value) = 0;
};

class DriverDevices {
 public:
  virtual ~DriverDevices() = default;

  /// Opens the device link (as "tmbhalcyon") for reading and writing. Null, with the error number in `error`, when
  /// there is none.
  virtual std::unique_ptr<DriverDevice> Open(std::string_view link_name, std::uint32_t& error) = 0;
};

}  // namespace panelglow::platform
