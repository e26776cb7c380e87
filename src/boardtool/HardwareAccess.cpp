#include "boardtool/HardwareAccess.h"

#include <array>
#include <cstdio>

#include "platform/DriverRecords.h"

namespace panelglow::boardtool {

namespace {

namespace driver = platform::driver;
using Kind = HardwareAccess::Kind;

// Configuration registers of a Super-I/O.
constexpr std::uint8_t kSelectDevice = 0x07;
constexpr std::uint8_t kFirstOfDevices = 0x30;

std::string WidthOf(const HardwareAccess& access) {
  return access.width <= 1 ? std::string() : " (" + std::to_string(8 * access.width) + " bit)";
}

int DigitsOf(const HardwareAccess& access) { return static_cast<int>(access.width < 1 ? 2 : 2 * access.width); }

}  // namespace

std::optional<HardwareAccess> DecodeRequest(std::uint32_t code, std::span<const std::byte> in,
                                            std::span<const std::byte> out) {
  HardwareAccess access;
  const auto port = [&](Kind kind, unsigned width) {
    access.kind = kind;
    access.width = width;
    access.address = driver::NumberAt(in, driver::kPortNumber, 4) & 0xFFFFU;
    access.value = kind == Kind::kPortWrite ? driver::NumberAt(in, driver::kPortValue, width)
                   : out.size() >= width    ? driver::NumberAt(out, 0, width)
                                            : 0;
    return access;
  };
  const auto pci = [&](Kind kind, unsigned width) {
    access.kind = kind;
    access.width = width;
    access.address =
        driver::NumberAt(in, driver::kPciLocation, 2) << 16U | driver::NumberAt(in, driver::kPciRegister, 2);
    access.value = driver::NumberAt(kind == Kind::kPciWrite || out.empty() ? in : out, driver::kPciValue, width);
    return access;
  };
  switch (code) {
    case driver::kInportByte:
      return port(Kind::kPortRead, 1);
    case driver::kInportWord:
      return port(Kind::kPortRead, 2);
    case driver::kInportDword:
      return port(Kind::kPortRead, 4);
    case driver::kOutportByte:
      return port(Kind::kPortWrite, 1);
    case driver::kOutportWord:
      return port(Kind::kPortWrite, 2);
    case driver::kOutportDword:
      return port(Kind::kPortWrite, 4);
    case driver::kReadPciConfigByte:
      return pci(Kind::kPciRead, 1);
    case driver::kReadPciConfigWord:
      return pci(Kind::kPciRead, 2);
    case driver::kReadPciConfigDword:
      return pci(Kind::kPciRead, 4);
    case driver::kWritePciConfigByte:
      return pci(Kind::kPciWrite, 1);
    case driver::kWritePciConfigWord:
      return pci(Kind::kPciWrite, 2);
    case driver::kWritePciConfigDword:
      return pci(Kind::kPciWrite, 4);
    case driver::kReadMsr:
      access.kind = Kind::kMsrRead;
      access.width = 8;
      access.address = driver::NumberAt(in, driver::kMsrIndex, 4);
      access.value = out.size() >= 8 ? driver::NumberAt(out, 0, 8) : 0;
      return access;
    default:
      return std::nullopt;
  }
}

// A port behind one that was written is the data port of that index.
void IndexTracker::Follow(HardwareAccess& access) {
  if (access.kind != Kind::kPortRead && access.kind != Kind::kPortWrite) {
    return;
  }
  const auto port = static_cast<std::uint16_t>(access.address);
  const auto byte = static_cast<std::uint8_t>(access.value);
  const bool isByteWrite = access.kind == Kind::kPortWrite && access.width == 1;
  const auto index = port == 0 ? index_.end() : index_.find(static_cast<std::uint16_t>(port - 1));
  if (index == index_.end()) {
    if (isByteWrite) {
      index_[port] = byte;
    }
    return;
  }
  access.indexPort = index->first;
  access.reg = index->second;
  // Registers below those of the devices belong to the whole part.
  if (const auto device = logicalDevice_.find(index->first);
      device != logicalDevice_.end() && index->second >= kFirstOfDevices) {
    access.logicalDevice = device->second;
  }
  if (isByteWrite && index->second == kSelectDevice) {
    logicalDevice_[index->first] = byte;
  }
}

std::string Hex(std::uint64_t value, int digits) {
  std::array<char, 24> text{};
  std::snprintf(text.data(), text.size(), "0x%0*llX", digits, static_cast<unsigned long long>(value));
  return text.data();
}

std::string PlaceOf(const HardwareAccess& access) {
  switch (access.kind) {
    case Kind::kPortRead:
    case Kind::kPortWrite:
      return "port " + Hex(access.address, 4) + WidthOf(access);
    case Kind::kMemoryRead:
    case Kind::kMemoryWrite:
      return "memory " + Hex(access.address, 8) + WidthOf(access);
    case Kind::kPciRead:
    case Kind::kPciWrite: {
      const std::uint64_t location = access.address >> 16U;
      std::array<char, 64> text{};
      std::snprintf(text.data(), text.size(), "PCI %02X:%02X.%u register 0x%02X",
                    static_cast<unsigned>(location >> 8U), static_cast<unsigned>(location >> 3U & 0x1FU),
                    static_cast<unsigned>(location & 7U), static_cast<unsigned>(access.address & 0xFFFFU));
      return text.data() + WidthOf(access);
    }
    case Kind::kMsrRead:
      return "model-specific register " + Hex(access.address);
    case Kind::kFirmwareCall:
      return "firmware call, command " + Hex(access.address) + ", type " + Hex(access.value);
    case Kind::kWait:
      return "wait";
  }
  return {};
}

std::string Describe(const HardwareAccess& access) {
  std::string text = PlaceOf(access);
  if (access.kind == Kind::kWait) {
    return text + " " + std::to_string(access.value) + " ms";
  }
  if (access.kind == Kind::kFirmwareCall) {
    text += access.bytes.empty() ? "" : ", data";
    for (const std::uint8_t byte : access.bytes) {
      text += " " + Hex(byte);
    }
    return text;
  }
  return IsRead(access.kind) ? text + " is read" : text + " <- " + Hex(access.value, DigitsOf(access));
}

std::string RegisterOf(const HardwareAccess& access) {
  if (access.reg < 0) {
    return {};
  }
  return "register " + Hex(static_cast<std::uint64_t>(access.reg)) +
         (access.logicalDevice < 0 ? std::string()
                                   : " of device " + Hex(static_cast<std::uint64_t>(access.logicalDevice)));
}

}  // namespace panelglow::boardtool
