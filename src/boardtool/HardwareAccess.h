// One thing that the board library does to the hardware, as people and programs are told of it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <span>
#include <string>
#include <vector>

namespace panelglow::boardtool {

struct HardwareAccess {
  enum class Kind {
    kPortRead,
    kPortWrite,
    kMemoryRead,
    kMemoryWrite,
    kPciRead,
    kPciWrite,
    kMsrRead,
    kFirmwareCall,  // address: command, value: command type, bytes: the data
    kWait           // value: milliseconds
  };

  Kind kind = Kind::kWait;
  unsigned width = 0;         // bytes, of port, memory and PCI accesses
  std::uint64_t address = 0;  // port, physical address, PCI location and register, index of a model-specific register
  std::uint64_t value = 0;    // written or read
  std::vector<std::uint8_t> bytes = {};
  // Of an access to the data port of an index and data pair: what stands behind it.
  int indexPort = -1;
  int logicalDevice = -1;
  int reg = -1;

  bool operator==(const HardwareAccess&) const = default;
};

[[nodiscard]] constexpr bool IsRead(HardwareAccess::Kind kind) {
  return kind == HardwareAccess::Kind::kPortRead || kind == HardwareAccess::Kind::kMemoryRead ||
         kind == HardwareAccess::Kind::kPciRead || kind == HardwareAccess::Kind::kMsrRead;
}

[[nodiscard]] constexpr bool IsWrite(HardwareAccess::Kind kind) {
  return kind == HardwareAccess::Kind::kPortWrite || kind == HardwareAccess::Kind::kMemoryWrite ||
         kind == HardwareAccess::Kind::kPciWrite;
}

/// The access that a driver's record asks for; nothing for a record that is none, as that of a mapping. The value is
/// that of a write, or of a read that was answered (`out`).
std::optional<HardwareAccess> DecodeRequest(std::uint32_t code, std::span<const std::byte> in,
                                            std::span<const std::byte> out);

/// Knows which port was written as an index, and which logical device was selected behind it.
class IndexTracker {
 public:
  /// Says of an access to a data port which register it goes to, and learns from it.
  void Follow(HardwareAccess& access);

 private:
  std::map<std::uint16_t, std::uint8_t> index_;          // last byte written to a port
  std::map<std::uint16_t, std::uint8_t> logicalDevice_;  // by index port
};

/// At least `digits` hexadecimal digits behind "0x".
std::string Hex(std::uint64_t value, int digits = 2);

/// Where the access goes, as "port 0x0A20" or "memory 0xFE5C0400 (32 bit)".
std::string PlaceOf(const HardwareAccess& access);

/// The access in words, without the value of a read: "port 0x0A20 <- 0x31", "port 0x0A21 is read", "wait 30 ms".
std::string Describe(const HardwareAccess& access);

/// The register behind a data port, as "register 0xF9 of device 0x07"; empty for any other access.
std::string RegisterOf(const HardwareAccess& access);

}  // namespace panelglow::boardtool
