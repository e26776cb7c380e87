#include "hw/CDevio.h"

#include <algorithm>
#include <cstdio>
#include <utility>

#include "harness/base/CDMout.h"
#include "hw/PciDeviceList.h"
#include "platform/DriverRecords.h"
#include "platform/Host.h"

namespace panelglow {

namespace driver = platform::driver;
using driver::DriverRecord;

namespace {

// Base address register flags.
constexpr std::uint32_t kBarIsIo = 1U << 0U;
constexpr std::uint32_t kBarIs64Bit = 1U << 2U;
constexpr std::uint64_t kIoBarMask = ~std::uint64_t{3};
constexpr std::uint64_t kMemoryBarMask = ~std::uint64_t{15};

// From here on a version word is in the new form.
constexpr std::uint32_t kFirstNewVersion = 0xFFF;

constexpr std::uint64_t AddressOf(std::uint32_t low, std::uint32_t high) { return std::uint64_t{high} << 32U | low; }

// Of an access to mapped memory with so many bytes to go.
constexpr std::size_t AccessWidth(std::size_t left_bytes) { return left_bytes >= 4 ? 4 : 1; }

DriverLoader Loader() { return {platform::TheHost().services, platform::TheHost().drivers}; }

}  // namespace

CDevio::CDevio() { LoadOnce(); }

CDevio::CDevio(LoadLater /*later*/) : names(DriverLoader::PresentNames(platform::TheHost().cpu.Is64BitSystem())) {}

CDevio::CDevio(std::string service, std::string display, std::string deviceLink, std::string image)
    : CDevio(DriverNames{std::move(service), std::move(display), std::move(deviceLink), std::move(image)}) {}

CDevio::CDevio(const std::string& service, const std::string& display, const std::string& deviceLink)
    : CDevio(DriverNames{service, display, deviceLink, "system32\\drivers\\" + service + ".sys"}) {}

CDevio::CDevio(DriverNames given) : names(std::move(given)) { LoadDriver(); }

bool CDevio::LoadOnce() {
  if (!IsDriverLoaded() && loadState == LoadState::kNotStarted) {
    device = Loader().LoadPresentOrOlder(platform::TheHost().cpu.Is64BitSystem(), names, loadState);
  }
  return IsDriverLoaded();
}

bool CDevio::LoadDriver() {
  device.reset();
  device = Loader().Load(names, loadState);
  return IsDriverLoaded();
}

void CDevio::LogDriverVersion() {
  DriverRecord<4> record;
  if (device) {
    device->Control(driver::kGetVersion, record.Bytes(), record.Bytes());
  }
  const auto word = static_cast<std::uint32_t>(record.Get(0, 4));
  std::array<char, 64> version{};
  std::string line;
  if (word < kFirstNewVersion) {
    std::snprintf(version.data(), version.size(), "%u.%u", word / 100, word % 100);
    line = names.display + ".sys version " + version.data() + ".\n";
  } else {
    const unsigned major = word >> 24U;
    const unsigned minor = word >> 16U & 0xFFU;
    const unsigned build = word >> 12U & 0xFU;
    const unsigned marker = word >> 8U & 0xFU;
    constexpr unsigned kBetaMarker = 9;
    constexpr unsigned kBuild32Bit = 3;
    if (marker == kBetaMarker) {
      std::snprintf(version.data(), version.size(), "version %2u.%02u beta %u", major, minor, word & 0xFFU);
    } else {
      std::snprintf(version.data(), version.size(), "version %2u.%02u", major, minor);
    }
    line = names.device + ".sys " + version.data() + (build == kBuild32Bit ? " 32bit.\n" : " 64bit.\n");
  }
  CDMout::LogMessage(LogOptions::Debug, kFreeText, line);
}

// ---- I/O ports

std::uint32_t CDevio::Inport(std::uint32_t code, std::uint16_t port, std::uint32_t width) {
  if (!device) {
    return 0;
  }
  DriverRecord<driver::kPortSize> request;
  request.Set(driver::kPortNumber, 4, port).Set(driver::kPortWidth, 4, width);
  DriverRecord<4> answer;
  if (device->Control(code, request.Bytes(), answer.Bytes()) != 0) {
    return 0;
  }
  return static_cast<std::uint32_t>(answer.Get(0, 4));
}

bool CDevio::Outport(std::uint32_t code, std::uint16_t port, std::uint32_t width, std::uint32_t value,
                     std::size_t answerSize) {
  if (!device) {
    return false;
  }
  DriverRecord<driver::kPortSize> request;
  request.Set(driver::kPortNumber, 4, port).Set(driver::kPortWidth, 4, width).Set(driver::kPortValue, 4, value);
  DriverRecord<1> ignored;
  return device->Control(code, request.Bytes(), ignored.Bytes().first(answerSize)) == 0;
}

std::uint8_t CDevio::InportByte(std::uint16_t port) {
  return static_cast<std::uint8_t>(Inport(driver::kInportByte, port, 1));
}

std::uint16_t CDevio::InportWord(std::uint16_t port) {
  return static_cast<std::uint16_t>(Inport(driver::kInportWord, port, 2));
}

std::uint32_t CDevio::InportDword(std::uint16_t port) { return Inport(driver::kInportDword, port, 4); }

bool CDevio::OutportByte(std::uint16_t port, std::uint8_t value) {
  return Outport(driver::kOutportByte, port, 1, value, 1);
}

bool CDevio::OutportWord(std::uint16_t port, std::uint16_t value) {
  return Outport(driver::kOutportWord, port, 2, value, 0);
}

void CDevio::OutportDword(std::uint16_t port, std::uint32_t value) {
  Outport(driver::kOutportDword, port, 4, value, 0);
}

// ---- PCI

std::uint8_t CDevio::PciRequest(std::uint32_t code, std::uint16_t location, std::uint16_t reg, std::uint32_t& value) {
  if (!device) {
    return driver::kNoAnswer;
  }
  DriverRecord<driver::kPciSize> record;
  record.Set(driver::kPciValue, 4, value)
      .Set(driver::kPciLocation, 2, location)
      .Set(driver::kPciRegister, 2, reg)
      .Set(driver::kPciStatus, 1, driver::kNoAnswer);
  const bool answered = device->Control(code, record.Bytes(), record.Bytes()) == 0;
  const auto status = static_cast<std::uint8_t>(record.Get(driver::kPciStatus, 1));
  if (answered && status == 0) {
    value = static_cast<std::uint32_t>(record.Get(driver::kPciValue, 4));
  }
  return status;
}

std::uint8_t CDevio::ReadPciConfigByte(std::uint16_t location, std::uint16_t reg, std::uint8_t& value) {
  std::uint32_t wide = 0;
  const std::uint8_t status = PciRequest(driver::kReadPciConfigByte, location, reg, wide);
  value = static_cast<std::uint8_t>(wide);
  return status;
}

std::uint8_t CDevio::ReadPciConfigWord(std::uint16_t location, std::uint16_t reg, std::uint16_t& value) {
  std::uint32_t wide = 0;
  const std::uint8_t status = PciRequest(driver::kReadPciConfigWord, location, reg, wide);
  value = static_cast<std::uint16_t>(wide);
  return status;
}

std::uint8_t CDevio::ReadPciConfigDword(std::uint16_t location, std::uint16_t reg, std::uint32_t& value) {
  value = 0;
  return PciRequest(driver::kReadPciConfigDword, location, reg, value);
}

std::uint8_t CDevio::WritePciConfigByte(std::uint16_t location, std::uint16_t reg, std::uint8_t value) {
  std::uint32_t wide = value;
  return PciRequest(driver::kWritePciConfigByte, location, reg, wide);
}

std::uint8_t CDevio::WritePciConfigWord(std::uint16_t location, std::uint16_t reg, std::uint16_t value) {
  std::uint32_t wide = value;
  return PciRequest(driver::kWritePciConfigWord, location, reg, wide);
}

std::uint8_t CDevio::WritePciConfigDword(std::uint16_t location, std::uint16_t reg, std::uint32_t value) {
  return PciRequest(driver::kWritePciConfigDword, location, reg, value);
}

std::uint8_t CDevio::PciSearch(std::uint32_t code, std::uint32_t classCode, std::uint16_t vendor,
                               std::uint16_t deviceId, std::uint16_t index, std::uint16_t& location) {
  location = 0;
  if (!device) {
    return driver::kNoAnswer;
  }
  DriverRecord<driver::kSearchSize> record;
  record.Set(driver::kSearchClass, 4, classCode)
      .Set(driver::kSearchVendor, 2, vendor)
      .Set(driver::kSearchDevice, 2, deviceId)
      .Set(driver::kSearchIndex, 2, index)
      .Set(driver::kSearchStatus, 1, driver::kNoAnswer);
  const bool answered = device->Control(code, record.Bytes(), record.Bytes()) == 0;
  const auto status = static_cast<std::uint8_t>(record.Get(driver::kSearchStatus, 1));
  if (answered && status == 0) {
    location = static_cast<std::uint16_t>(record.Get(driver::kSearchLocation, 2));
  }
  return status;
}

std::uint8_t CDevio::FindPciDevice(std::uint16_t vendor, std::uint16_t deviceId, std::uint16_t index,
                                   std::uint16_t& location) {
  return PciSearch(driver::kFindPciDevice, 0, vendor, deviceId, index, location);
}

std::uint8_t CDevio::FindPciClass(std::uint32_t classCode, std::uint16_t index, std::uint16_t& location) {
  return PciSearch(driver::kFindPciClass, classCode, 0, 0, index, location);
}

std::uint8_t CDevio::ReadPciBar(std::uint16_t location, std::uint16_t reg, std::uint64_t& base) {
  base = 0;
  std::uint32_t low = 0;
  std::uint8_t status = ReadPciConfigDword(location, reg, low);
  if (status != 0) {
    return status;
  }
  std::uint32_t high = 0;
  if ((low & kBarIs64Bit) != 0) {
    status = ReadPciConfigDword(location, static_cast<std::uint16_t>(reg + 4), high);
    if (status != 0) {
      return status;
    }
  }
  base = AddressOf(low, high) & ((low & kBarIsIo) != 0 ? kIoBarMask : kMemoryBarMask);
  return 0;
}

template <class Wanted>
bool CDevio::FindPciFunction(std::uint32_t classCode, std::uint16_t& location, Wanted isWanted) {
  constexpr PciIds kIdRegisters{0x00, 0x02, 0x2C, 0x2E};
  constexpr std::uint32_t kMostFunctions = 0x10000;  // every location once
  for (std::uint32_t index = 0;
       index < kMostFunctions && FindPciClass(classCode, static_cast<std::uint16_t>(index), location) == 0; ++index) {
    PciIds ids{};
    for (std::size_t i = 0; i < ids.size(); ++i) {
      ReadPciConfigWord(location, kIdRegisters[i], ids[i]);
    }
    if (isWanted(ids)) {
      return true;
    }
  }
  location = 0;
  return false;
}

bool CDevio::FindPciDeviceByIds(std::uint32_t classCode, std::uint16_t vendor, std::uint16_t deviceId,
                                std::uint16_t subVendor, std::uint16_t subDevice, std::uint16_t& location) {
  const PciIds wanted{vendor, deviceId, subVendor, subDevice};
  return FindPciFunction(classCode, location, [&](const PciIds& ids) { return ids == wanted; });
}

bool CDevio::FindPciDeviceByName(std::uint32_t classCode, const std::string& name, unsigned occurrence,
                                 std::uint16_t& location) {
  return FindPciFunction(classCode, location, [&](const PciIds& ids) {
    PciDevice entry;
    try {
      PciDeviceList::Instance().FindDevice(ids[0], ids[1], ids[2], ids[3], 1, entry);
    } catch (int) {  // no inventory, and so no description
      return false;
    }
    return entry.description.find(name) != std::string::npos && !entry.description.empty() && occurrence-- == 0;
  });
}

// ---- physical memory

std::uint64_t CDevio::Map32(std::uint32_t address, std::uint32_t length, MappingRecord* out) {
  if (!device) {
    return 0;
  }
  DriverRecord<driver::kMapSize32> record;
  record.Set(0, 4, address).Set(4, 4, length);
  if (device->Control(driver::kMapPhysicalMemory, record.Bytes(), record.Bytes()) != 0) {
    return 0;
  }
  if (out != nullptr) {
    for (std::size_t i = 0; i < out->size(); ++i) {
      (*out)[i] = static_cast<std::uint32_t>(record.Get(4 * i, 4));
    }
  }
  return record.Get(8, 4);
}

// The whole 64-bit address counts: this program is not a 32-bit process that could only use the low half.
std::uint64_t CDevio::Map64(std::uint64_t address, std::uint32_t length) {
  if (!device) {
    return 0;
  }
  DriverRecord<driver::kMapSize64> record;
  record.Set(0, 8, address).Set(8, 8, length);
  if (device->Control(driver::kMapPhysicalMemory, record.Bytes(), record.Bytes()) != 0) {
    return 0;
  }
  return record.Get(16, 8);
}

// Where the machine's memory is mapped, by the form of the request that the system's word size asks for: one of 32
// bits has no high half.
std::uint64_t CDevio::Map(std::uint64_t address, std::uint32_t length) {
  return platform::TheHost().cpu.Is64BitSystem() ? Map64(address, length)
                                                 : Map32(static_cast<std::uint32_t>(address), length, nullptr);
}

// Device memory is accessed four bytes at a time, what is left over byte by byte.
std::uint32_t CDevio::CopyFrom(std::uint64_t mapped, std::span<std::byte> buffer) {
  if (mapped == 0) {
    return 0;
  }
  for (std::size_t at = 0; at < buffer.size();) {
    const std::size_t width = AccessWidth(buffer.size() - at);
    driver::PutNumber(buffer, at, width, device->ReadMapped(mapped + at, width));
    at += width;
  }
  return static_cast<std::uint32_t>(buffer.size());
}

std::uint32_t CDevio::CopyTo(std::uint64_t mapped, std::span<const std::byte> buffer) {
  if (mapped == 0) {
    return 0;
  }
  for (std::size_t at = 0; at < buffer.size();) {
    const std::size_t width = AccessWidth(buffer.size() - at);
    device->WriteMapped(mapped + at, width, static_cast<std::uint32_t>(driver::NumberAt(buffer, at, width)));
    at += width;
  }
  return static_cast<std::uint32_t>(buffer.size());
}

std::uint32_t CDevio::ReadPhysicalMemory(std::uint32_t address, std::uint32_t length, std::span<std::byte> buffer) {
  return ReadPhysicalMemory64(address, 0, length, buffer);
}

std::uint32_t CDevio::ReadPhysicalMemory64(std::uint32_t low, std::uint32_t high, std::uint32_t length,
                                           std::span<std::byte> buffer) {
  buffer = buffer.first(std::min<std::size_t>(length, buffer.size()));
  return CopyFrom(Map(AddressOf(low, high), static_cast<std::uint32_t>(buffer.size())), buffer);
}

std::uint32_t CDevio::WritePhysicalMemory(std::uint32_t address, std::uint32_t length,
                                          std::span<const std::byte> buffer) {
  buffer = buffer.first(std::min<std::size_t>(length, buffer.size()));
  return CopyTo(Map(address, static_cast<std::uint32_t>(buffer.size())), buffer);
}

std::uint32_t CDevio::WritePhysicalMemory64(std::uint32_t low, std::uint32_t high, std::uint32_t length,
                                            std::span<const std::byte> buffer) {
  buffer = buffer.first(std::min<std::size_t>(length, buffer.size()));
  return CopyTo(Map64(AddressOf(low, high), static_cast<std::uint32_t>(buffer.size())), buffer);
}

std::uint32_t CDevio::MapPhysicalMemory(std::uint32_t address, std::uint32_t length, MappingRecord* record) {
  return static_cast<std::uint32_t>(Map32(address, length, record));
}

bool CDevio::UnmapPhysicalMemory(MappingRecord& mapping) {
  DriverRecord<driver::kMapSize32> record;
  for (std::size_t i = 0; i < mapping.size(); ++i) {
    record.Set(4 * i, 4, mapping[i]);
  }
  if (!device || device->Control(driver::kUnmapPhysicalMemory, record.Bytes(), record.Bytes()) != 0) {
    return false;
  }
  mapping.fill(0);
  return true;
}

// ---- others

std::uint32_t CDevio::ReadMsr(std::uint64_t& value) {
  if (!device) {
    return platform::kErrorInvalidHandle;
  }
  DriverRecord<driver::kMsrSize> record;
  record.Set(driver::kMsrIndex, 4, value);
  const std::uint32_t error = device->Control(driver::kReadMsr, record.Bytes(), record.Bytes());
  if (error == 0) {
    value = record.Get(0, 8);
  }
  return error;
}

std::uint16_t CDevio::ReadFirmware(std::uint32_t code, std::uint16_t segment, std::uint16_t offset) {
  if (!device) {
    return 0;
  }
  DriverRecord<driver::kFirmwareSize> request;
  request.Set(0, 2, segment).Set(2, 2, offset);
  DriverRecord<driver::kFirmwareAnswerSize> answer;
  device->Control(code, request.Bytes(), answer.Bytes());
  return static_cast<std::uint16_t>(answer.Get(0, 2));
}

std::uint8_t CDevio::ReadFirmwareByte(std::uint16_t segment, std::uint16_t offset) {
  return static_cast<std::uint8_t>(ReadFirmware(driver::kReadFirmwareByte, segment, offset));
}

std::uint16_t CDevio::ReadFirmwareWord(std::uint16_t segment, std::uint16_t offset) {
  return ReadFirmware(driver::kReadFirmwareWord, segment, offset);
}

}  // namespace panelglow
