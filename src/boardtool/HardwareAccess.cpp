#include "boardtool/HardwareAccess.h"

#include <array>
#include <cstdio>

namespace panelglow::boardtool {

namespace {

using Kind = HardwareAccess::Kind;

std::string WidthOf(const HardwareAccess& access) {
  return access.width <= 1 ? std::string() : " (" + std::to_string(8 * access.width) + " bit)";
}

int DigitsOf(const HardwareAccess& access) { return static_cast<int>(access.width < 1 ? 2 : 2 * access.width); }

}  // namespace

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
