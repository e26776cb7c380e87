// The wire format of requests to the privileged driver, which the program sends and a driver answers: control codes,
// record sizes, field offsets. Numbers are little-endian.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>
#include <stdexcept>

namespace panelglow::platform::driver {

// ---- control codes (device type 0x22, any access, buffered)
inline constexpr std::uint32_t kGetVersion = 0x220000;
inline constexpr std::uint32_t kInportByte = 0x220004;
inline constexpr std::uint32_t kInportWord = 0x220008;
inline constexpr std::uint32_t kInportDword = 0x22000C;
inline constexpr std::uint32_t kOutportByte = 0x220010;
inline constexpr std::uint32_t kOutportWord = 0x220014;
inline constexpr std::uint32_t kOutportDword = 0x220018;
inline constexpr std::uint32_t kReadFirmwareWord = 0x22001C;
inline constexpr std::uint32_t kReadFirmwareByte = 0x220020;
inline constexpr std::uint32_t kFindPciDevice = 0x22003C;
inline constexpr std::uint32_t kReadPciConfigByte = 0x220040;
inline constexpr std::uint32_t kReadPciConfigWord = 0x220044;
inline constexpr std::uint32_t kReadPciConfigDword = 0x220048;
inline constexpr std::uint32_t kWritePciConfigByte = 0x22004C;
inline constexpr std::uint32_t kWritePciConfigWord = 0x220050;
inline constexpr std::uint32_t kWritePciConfigDword = 0x220054;
inline constexpr std::uint32_t kFindPciClass = 0x220058;
inline constexpr std::uint32_t kMapPhysicalMemory = 0x2200A8;
inline constexpr std::uint32_t kUnmapPhysicalMemory = 0x2200C8;
inline constexpr std::uint32_t kReadMsr = 0x222498;

// ---- port I/O request: port u32, width in bytes u32, value u32
inline constexpr std::size_t kPortSize = 12;
inline constexpr std::size_t kPortNumber = 0;
inline constexpr std::size_t kPortWidth = 4;
inline constexpr std::size_t kPortValue = 8;

// ---- PCI configuration request
inline constexpr std::size_t kPciSize = 16;
inline constexpr std::size_t kPciValue = 0;     // u32
inline constexpr std::size_t kPciLocation = 4;  // u16: bus, device, function as the PCI BIOS packs them
inline constexpr std::size_t kPciRegister = 6;  // u16
inline constexpr std::size_t kPciStatus = 8;    // u8, preset; 0 is success

// ---- PCI search request
inline constexpr std::size_t kSearchSize = 16;
inline constexpr std::size_t kSearchClass = 0;      // u32
inline constexpr std::size_t kSearchVendor = 4;     // u16
inline constexpr std::size_t kSearchDevice = 6;     // u16
inline constexpr std::size_t kSearchIndex = 8;      // u16
inline constexpr std::size_t kSearchLocation = 10;  // u16, answer
inline constexpr std::size_t kSearchStatus = 12;    // u8, preset; 0 is success

// ---- physical memory mapping request, by word size of the system: address, length, mapped address, each a word of
// it
inline constexpr std::size_t kMapSize32 = 20;
inline constexpr std::size_t kMapSize64 = 40;

// ---- model-specific register request: 0 and the register's index, u32 each; the answer is its 64 bits
inline constexpr std::size_t kMsrSize = 8;
inline constexpr std::size_t kMsrIndex = 4;

// ---- firmware segment request: segment u16, offset u16, 0
inline constexpr std::size_t kFirmwareSize = 6;
inline constexpr std::size_t kFirmwareAnswerSize = 2;

/// Throws std::out_of_range for a field that a record does not have: the numbers above are wrong then.
inline void RequireField(std::span<const std::byte> record, std::size_t offset, std::size_t width) {
  if (offset + width > record.size()) {
    throw std::out_of_range("a field behind the end of a driver's record");
  }
}

/// The number of `width` bytes at `offset` of a record.
inline std::uint64_t NumberAt(std::span<const std::byte> record, std::size_t offset, std::size_t width) {
  RequireField(record, offset, width);
  std::uint64_t value = 0;
  for (std::size_t i = 0; i < width; ++i) {
    value |= std::to_integer<std::uint64_t>(record[offset + i]) << (8 * i);
  }
  return value;
}

/// Stores the low `width` bytes of `value` there.
inline void PutNumber(std::span<std::byte> record, std::size_t offset, std::size_t width, std::uint64_t value) {
  RequireField(record, offset, width);
  for (std::size_t i = 0; i < width; ++i) {
    record[offset + i] = static_cast<std::byte>(value >> (8 * i));
  }
}

/// What a status field holds before the driver has answered, and what an absent driver answers.
inline constexpr std::uint8_t kNoAnswer = 0x81;

/// A request or answer of fixed size.
template <std::size_t Size>
class DriverRecord {
 public:
  /// Stores the low `width` bytes of `value`.
  DriverRecord& Set(std::size_t offset, std::size_t width, std::uint64_t value) {
    PutNumber(bytes_, offset, width, value);
    return *this;
  }

  [[nodiscard]] std::uint64_t Get(std::size_t offset, std::size_t width) const {
    return NumberAt(bytes_, offset, width);
  }

  [[nodiscard]] std::span<std::byte> Bytes() { return bytes_; }

 private:
  std::array<std::byte, Size> bytes_{};
};

}  // namespace panelglow::platform::driver
