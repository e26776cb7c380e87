// The system's registry: single values by key and name.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string_view>

namespace panelglow::platform {

/// Of a read that needs more room; `size` then names it.
inline constexpr std::uint32_t kMoreData = 0xEA;

/// A key that is open for reading; closed with the object.
class RegistryKey {
 public:
  virtual ~RegistryKey() = default;

  /// Reads a value into `room` as its bytes, a text with its NUL. `size`: the bytes read, or needed. Returns 0 or the
  /// system's error number.
  virtual std::uint32_t Read(std::string_view value, std::span<char> room, std::size_t& size) = 0;
};

class Registry {
 public:
  virtual ~Registry() = default;

  /// A key below the machine's root. Null when there is none.
  virtual std::unique_ptr<RegistryKey> OpenMachineKey(std::string_view path) = 0;
};

}  // namespace panelglow::platform
