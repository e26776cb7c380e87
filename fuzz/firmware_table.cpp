// The firmware's structure table in both its walkers. The first six bytes are the entry point's version, length and
// count for the one that looks for the table by itself.
#include <cstdint>
#include <span>

#include "FuzzTarget.h"
#include "harness/base/CDMException.h"
#include "hw/SMBIOSDiscovery.h"
#include "hw/SmbiosScanner.h"

namespace panelglow::fuzz {
namespace {

constexpr std::size_t kHeader = 6;
constexpr std::uint32_t kSegmentBase = 0xF0000;

std::uint8_t ByteOf(std::string_view bytes, std::size_t at) {
  return at < bytes.size() ? static_cast<std::uint8_t>(bytes[at]) : std::uint8_t{0};
}

// A firmware segment: an entry point, and the table behind it.
std::string SegmentOf(std::string_view bytes) {
  std::string segment("_SM_\0\0", 6);
  segment.resize(0x20);
  segment.replace(6, 2, bytes.substr(0, 2));
  segment[22] =
      bytes[2];  // the table's length: no more than twice what an input holds, or most runs walk over zeroes
  segment[23] = static_cast<char>(bytes[3] & 0x07);
  segment[24] = 0x20;  // physical address 0x000F0020
  segment[26] = 0x0F;
  segment.replace(28, 2, bytes.substr(4, 2));
  return segment.append(bytes.substr(kHeader));
}

void Run(std::string_view bytes) {
  if (bytes.size() < kHeader) {
    return;
  }
  const std::string_view table = bytes.substr(kHeader);
  try {
    const SMBIOSDiscovery machine({reinterpret_cast<const std::uint8_t*>(table.data()), table.size()});
    Check(machine.GetProductText().size() <= 4, "a product text has four characters at most");
    Check(machine.processors.size() <= SMBIOSDiscovery::kMostProcessors, "processors past the limit are left out");
  } catch (const CDMException&) {
  }
  const std::string segment = SegmentOf(bytes);
  const auto readByte = [&](std::uint16_t base, std::uint16_t offset) {
    return ByteOf(segment, std::size_t{base} * 16 + offset - kSegmentBase);
  };
  SmbiosScanner scanner;
  scanner.Scan({readByte, [&](std::uint16_t base, std::uint16_t offset) {
                  return static_cast<std::uint16_t>(readByte(base, offset) |
                                                    readByte(base, static_cast<std::uint16_t>(offset + 1)) << 8U);
                }});
  for (const std::uint8_t type : {std::uint8_t{2}, std::uint8_t{5}, ByteOf(table, 0)}) {
    const std::span<const std::uint8_t> structure = scanner.At(scanner.Find(type));
    for (const unsigned index : {0U, 1U, 2U, 255U}) {
      SmbiosScanner::StringOf(structure, static_cast<std::uint8_t>(index));
    }
  }
}

const Registered kTarget("firmware_table", Run);

}  // namespace
}  // namespace panelglow::fuzz
