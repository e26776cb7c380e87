#include "hw/SMBIOSDiscovery.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <exception>

#include "harness/base/CDMException.h"
#include "harness/base/CDMUtil.h"
#include "hw/WMIDiscovery.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr int kTableNotHandled = 990405;
constexpr std::size_t kHeaderSize = 4;  // type, length, handle
constexpr std::size_t kMostStrings = 256;
constexpr std::size_t kProductCharacters = 4;

// Names of a memory device's type, by the published code, from 1.
constexpr std::array<std::string_view, 25> kMemoryTypes{
    "Other",  "Unknown",  "DRAM",     "EDRAM",    "VRAM",     "SRAM",  "RAM",   "ROM",   "FLASH",
    "EEPROM", "FEPROM",   "EPROM",    "CDRAM",    "3DRAM",    "SDRAM", "SGRAM", "RDRAM", "DDR",
    "DDR2",   "DDR2-FBD", "Reserved", "Reserved", "Reserved", "DDR3",  "FBD2"};

// Names of a memory array's error correction, by the published code, from 1.
constexpr std::array<std::string_view, 7> kErrorCorrections{"Other",          "Unknown",       "None", "Parity",
                                                            "Single-bit ECC", "Multi-bit ECC", "CRC"};

template <std::size_t Size>
std::string NameOf(const std::array<std::string_view, Size>& names, unsigned code) {
  return std::string(code >= 1 && code <= Size ? names[code - 1] : "Unknown");
}

template <class... Values>
std::string Format(const char* format, Values... values) {
  std::array<char, 64> text{};
  std::snprintf(text.data(), text.size(), format, values...);
  return text.data();
}

}  // namespace

// A structure of the table: its formatted area and its strings. A field behind the formatted area reads as 0.
class SMBIOSDiscovery::Structure {
 public:
  explicit Structure(std::span<const std::uint8_t> formatted) : formatted_(formatted), strings_(1) {}

  [[nodiscard]] std::uint8_t Byte(std::size_t offset) const {
    return offset < formatted_.size() ? formatted_[offset] : std::uint8_t{0};
  }
  [[nodiscard]] std::uint16_t Word(std::size_t offset) const {
    return static_cast<std::uint16_t>(Byte(offset) | Byte(offset + 1) << 8U);
  }
  [[nodiscard]] std::uint32_t Dword(std::size_t offset) const {
    return Word(offset) | static_cast<std::uint32_t>(Word(offset + 2)) << 16U;
  }

  /// The string whose number stands at `offset`; number 0 and numbers without a string read as empty.
  [[nodiscard]] std::string Text(std::size_t offset) const {
    const std::size_t number = Byte(offset);
    return number < strings_.size() ? strings_[number] : std::string();
  }

  void AddString(std::string text) { strings_.push_back(std::move(text)); }

 private:
  std::span<const std::uint8_t> formatted_;
  std::vector<std::string> strings_;  // by number
};

SMBIOSDiscovery& SMBIOSDiscovery::Instance() {
  static SMBIOSDiscovery machine;
  return machine;
}

SMBIOSDiscovery::SMBIOSDiscovery(std::span<const std::uint8_t> table) { Walk(table); }

SMBIOSDiscovery::SMBIOSDiscovery() {
  WMIDiscovery management("ROOT\\WMI");
  double size = 0;
  management.QueryNumber(u"select Size from MSSmBios_RawSMBiosTables", u"Size", size);
  if (size < 1) {
    return;
  }
  std::vector<std::uint8_t> table;
  management.GetBinaryProperty(u"MSSmBios_RawSMBiosTables", u"SMBiosData", table);
  if (static_cast<double>(table.size()) > size) {
    table.resize(static_cast<std::size_t>(size));
  }
  Walk(table);
}

void SMBIOSDiscovery::Walk(std::span<const std::uint8_t> table) {
  try {
    while (!table.empty()) {
      table = table.subspan(ParseStructure(table));
    }
  } catch (const std::exception&) {
    CDMException failure(kTableNotHandled);
    failure.addMessage(LogOptions::Unknown, -1, "SMBIOS Exception");
    throw failure;
  }
}

// Reads the structure at the beginning of `rest` and returns its length, strings included. A formatted length that is
// shorter than the header, or longer than what is left, ends the walk: nothing behind it can be trusted.
std::size_t SMBIOSDiscovery::ParseStructure(std::span<const std::uint8_t> rest) {
  if (rest.size() < kHeaderSize || rest[1] < kHeaderSize || rest[1] > rest.size()) {
    return rest.size();
  }
  Structure structure(rest.first(rest[1]));
  std::size_t at = rest[1];
  if (at < rest.size() && rest[at] == 0) {
    at += at + 1 < rest.size() && rest[at + 1] == 0 ? 2 : 1;
  } else {
    // Strings past the last number that a field can hold are passed over.
    for (std::size_t number = 1; at < rest.size() && rest[at] != 0; ++number) {
      const auto end = std::find(rest.begin() + static_cast<std::ptrdiff_t>(at), rest.end(), std::uint8_t{0});
      std::string text(rest.begin() + static_cast<std::ptrdiff_t>(at), end);
      at += text.size() + 1;
      if (text.find_first_not_of(' ') == std::string::npos) {
        text.clear();  // keeps its number
      }
      if (number < kMostStrings) {
        structure.AddString(std::move(text));
      }
    }
    ++at;
  }
  switch (rest[0]) {
    case 1:
      ReadSystem(structure);
      break;
    case 2:
      ReadBaseBoard(structure);
      break;
    case 3:
      ReadEnclosure(structure);
      break;
    case 4:
      ReadProcessor(structure);
      break;
    case 7:
      ReadCache(structure);
      break;
    case 16:
      ReadMemoryArray(structure);
      break;
    case 17:
      ReadMemoryDevice(structure);
      break;
    case 208:
      ReadVendorDefined(structure);
      break;
    case 0:
      ReadBios(structure);
      break;
    default:
      break;
  }
  return std::min(at, rest.size());
}

void SMBIOSDiscovery::ReadBios(const Structure& s) {
  biosInfo = {s.Word(2), s.Text(4), s.Text(5), s.Text(8), s.Dword(10)};
}

void SMBIOSDiscovery::ReadSystem(const Structure& s) {
  // The first three fields are little-endian numbers, the rest stands in stored order.
  systemInfo.uuid =
      Format("%08X-%04X-%04X-%02X%02X-%02X%02X%02X%02X%02X%02X", s.Dword(8), s.Word(12), s.Word(14), s.Byte(16),
             s.Byte(17), s.Byte(18), s.Byte(19), s.Byte(20), s.Byte(21), s.Byte(22), s.Byte(23));
  systemInfo.manufacturer = s.Text(4);
  systemInfo.productName = s.Text(5);
  systemInfo.version = s.Text(6);
  systemInfo.serialNumber = s.Text(7);
  systemInfo.sku = s.Text(25);
  systemInfo.family = s.Text(26);
}

void SMBIOSDiscovery::ReadBaseBoard(const Structure& s) {
  productText = s.Text(5).substr(0, kProductCharacters);
  boardSerial = s.Text(7);
}

void SMBIOSDiscovery::ReadEnclosure(const Structure& s) { chassisType = s.Byte(5) & 0x7FU; }

void SMBIOSDiscovery::ReadProcessor(const Structure& s) {
  constexpr std::uint8_t kSocketPopulated = 1U << 6U;
  constexpr std::uint32_t kHyperThreadingBit = 1U << 28U;  // leaf 1, EDX
  constexpr std::uint32_t kLongModeBit = 1U << 29U;        // leaf 0x80000001, EDX
  constexpr std::uint32_t kAmdVendor = 0x444D4163;         // "cAMD", the vendor id's last word

  platform::Cpu& cpu = platform::TheHost().cpu;
  isAmd = isAmd || cpu.Cpuid(0).ecx == kAmdVendor;
  const platform::CpuidRegisters features = cpu.Cpuid(1);
  const std::uint32_t extended = features.eax >> 16U & 15U;
  if ((s.Byte(24) & kSocketPopulated) != 0) {
    ++populatedSockets;
  }
  if (processors.size() == kMostProcessors) {
    return;
  }
  ProcessorInfo info;
  info.family = s.Byte(6);
  info.manufacturer = s.Text(7);
  info.coreCount = s.Byte(35);
  info.externalClock = s.Word(18);
  info.maximumSpeed = s.Word(20);
  info.currentSpeed = s.Word(22);
  info.processorId = Format("%08X", s.Dword(8));
  info.version = s.Text(16);
  info.model = (features.eax >> 4U & 15U) + 10 * extended;
  info.hyperThreading = CDMUtil::ToString((features.edx & kHyperThreadingBit) != 0);
  info.longMode = (cpu.Cpuid(0x80000001).edx & kLongModeBit) != 0 ? "yes" : "no";
  processors.push_back(std::move(info));
}

void SMBIOSDiscovery::ReadCache(const Structure& s) {
  constexpr std::uint16_t kIn64KB = 1U << 15U;  // otherwise in KB
  const std::uint16_t configuration = s.Word(5);
  const std::uint16_t size = s.Word(9);
  const unsigned size_KB = (size & 0x7FFFU) * ((size & kIn64KB) != 0 ? 64U : 1U);
  caches.push_back({Format("L%d", (configuration & 7) + 1), Format("%u", size_KB), s.Text(4)});
}

void SMBIOSDiscovery::ReadMemoryArray(const Structure& s) {
  constexpr std::uint32_t kUnknownCapacity = 0x80000000;
  std::uint32_t capacity = s.Dword(7);  // KB
  MemoryArrayInfo info;
  info.errorCorrection = NameOf(kErrorCorrections, s.Byte(6));
  info.maximumCapacity = "Unknown";
  if (capacity < kUnknownCapacity) {
    constexpr std::string_view kUnits = "KMGT";
    std::size_t unit = 0;
    for (; capacity != 0 && capacity % 1024 == 0; capacity /= 1024) {
      ++unit;
    }
    info.maximumCapacity = Format("%d %cB", static_cast<int>(capacity), kUnits[unit]);
  }
  memoryArrays.push_back(std::move(info));
}

void SMBIOSDiscovery::ReadMemoryDevice(const Structure& s) {
  constexpr std::uint16_t kUnknown = 0xFFFF;
  constexpr std::uint16_t kInExtendedField = 0x7FFF;
  constexpr std::uint16_t kInKB = 1U << 15U;  // otherwise in MB
  const auto number = [](std::uint16_t value) {
    return value == kUnknown ? "Unknown" : Format("%u", static_cast<unsigned>(value));
  };
  const std::uint16_t size = s.Word(12);
  MemoryDeviceInfo info;
  info.totalWidth = number(s.Word(8));
  info.dataWidth = number(s.Word(10));
  if (size == kUnknown) {
    info.size = "Unknown";
  } else if (size == kInExtendedField) {
    info.size = Format("%u", s.Dword(28) & 0x7FFFFFFFU);
  } else {
    info.size = Format("%u", (size & kInKB) != 0 ? (size & 0x7FFFU) / 1024U : unsigned{size});
  }
  info.installed = size == 0 ? "Not Installed" : "Installed";
  info.type = NameOf(kMemoryTypes, s.Byte(18));
  info.speed = s.Word(21) == 0 ? "Unknown" : number(s.Word(21));
  info.deviceLocator = s.Text(16);
  info.bankLocator = s.Text(17);
  info.manufacturer = s.Text(23);
  info.serial = s.Text(24);
  info.assetTag = s.Text(25);
  info.partNumber = s.Text(26);
  // Flash is not counted as memory.
  if (memoryDevices.size() < kMostMemoryDevices && !CDMUtil::EqualIgnoreCase(info.type, "flash")) {
    memoryDevices.push_back(std::move(info));
  }
}

void SMBIOSDiscovery::ReadVendorDefined(const Structure& s) { oemByte = s.Byte(4); }

}  // namespace panelglow
