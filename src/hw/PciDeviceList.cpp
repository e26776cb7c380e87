#include "hw/PciDeviceList.h"

#include <algorithm>
#include <array>
#include <memory>
#include <mutex>
#include <span>
#include <string_view>

#include "hw/SetupDI.h"

namespace panelglow {

namespace {

constexpr std::size_t kPropertyBuffer = 1024;

std::string_view FirstText(std::string_view texts) { return texts.substr(0, texts.find('\0')); }

// Up to `digits` hexadecimal digits at the beginning of a text.
std::uint32_t HexAt(std::string_view text, std::size_t digits) {
  std::uint32_t value = 0;
  for (std::size_t i = 0; i < std::min(digits, text.size()); ++i) {
    const char c = text[i];
    const int digit = c >= '0' && c <= '9'   ? c - '0'
                      : c >= 'A' && c <= 'F' ? c - 'A' + 10
                      : c >= 'a' && c <= 'f' ? c - 'a' + 10
                                             : -1;
    if (digit < 0) {
      break;
    }
    value = value << 4U | static_cast<std::uint32_t>(digit);
  }
  return value;
}

std::string_view From(std::string_view text, std::size_t position) {
  return text.substr(std::min(position, text.size()));
}

// PCI\VEN_vvvv&DEV_dddd&SUBSYS_ssssuuuu&REV_rr: each number at its fixed place.
void ParseHardwareIds(std::string_view texts, PciDevice& device) {
  constexpr std::size_t kVendor = 8;
  constexpr std::size_t kDevice = 17;
  constexpr std::size_t kSubsystem = 29;
  constexpr std::size_t kRevision = 42;
  constexpr std::string_view kClassMark = "CC_";
  const std::string_view id = FirstText(texts);
  device.vendorId = static_cast<std::uint16_t>(HexAt(From(id, kVendor), 4));
  device.deviceId = static_cast<std::uint16_t>(HexAt(From(id, kDevice), 4));
  const std::uint32_t subsystem = HexAt(From(id, kSubsystem), 8);
  device.subVendorId = static_cast<std::uint16_t>(subsystem & 0xFFFFU);
  device.subDeviceId = static_cast<std::uint16_t>(subsystem >> 16U);
  device.revision = static_cast<std::uint8_t>(HexAt(From(id, kRevision), 2));
  if (const std::size_t mark = texts.find(kClassMark); mark != std::string_view::npos) {
    device.classCode = HexAt(texts.substr(mark + kClassMark.size()), 6);
  }
}

// A property's bytes as text; empty when the device has no such property.
std::string ReadText(SetupDI& list, std::uint32_t property) {
  std::array<std::uint8_t, kPropertyBuffer> buffer{};
  std::uint32_t size = 0;
  std::uint32_t type = 0;
  if (!list.ReadDeviceProperty(property, buffer, size, type)) {
    return {};
  }
  return {reinterpret_cast<const char*>(buffer.data()), size};
}

}  // namespace

const PciDeviceList& PciDeviceList::Instance() {
  static std::mutex guard;
  static std::unique_ptr<const PciDeviceList> list;
  const std::lock_guard<std::mutex> lock(guard);
  if (!list) {
    list = std::make_unique<const PciDeviceList>();
  }
  return *list;
}

PciDeviceList::PciDeviceList() {
  SetupDI list;
  if (!list.OpenDeviceList("PCI", platform::kPresentDevices | platform::kAllDeviceClasses, "")) {
    throw int{kNoInventory};
  }
  while (devices.size() < kMostDevices && list.NextDevice()) {
    const std::string hardwareIds = ReadText(list, platform::kHardwareIdProperty);
    if (hardwareIds.empty()) {
      throw int{kNoInventory};
    }
    PciDevice device;
    ParseHardwareIds(hardwareIds, device);
    device.earlierEqual =
        static_cast<unsigned>(std::count_if(devices.begin(), devices.end(), [&](const PciDevice& other) {
          return other.vendorId == device.vendorId && other.deviceId == device.deviceId;
        }));
    device.driverKey = FirstText(ReadText(list, platform::kDriverProperty));
    device.description = FirstText(ReadText(list, platform::kDescriptionProperty));
    device.location = FirstText(ReadText(list, platform::kLocationProperty));
    device.instanceId = list.GetDeviceInstanceId();
    std::array<std::uint8_t, 4> number{};
    std::uint32_t size = 0;
    std::uint32_t type = 0;
    if (list.ReadDeviceProperty(platform::kUiNumberProperty, number, size, type) && size == number.size()) {
      for (std::size_t i = number.size(); i-- > 0;) {
        device.uiNumber = device.uiNumber << 8U | number[i];
      }
    }
    devices.push_back(std::move(device));
  }
}

int PciDeviceList::CountDevices(std::uint32_t vendorId, std::uint32_t deviceId, std::uint32_t subVendorId,
                                std::uint32_t subDeviceId) const {
  int count = 0;
  PciDevice ignored;
  while (FindDevice(vendorId, deviceId, subVendorId, subDeviceId, count + 1, ignored)) {
    ++count;
  }
  return count;
}

bool PciDeviceList::FindDevice(std::uint32_t vendorId, std::uint32_t deviceId, std::uint32_t subVendorId,
                               std::uint32_t subDeviceId, int n, PciDevice& out) const {
  for (const PciDevice& device : devices) {
    if (device.vendorId == vendorId && device.deviceId == deviceId && device.subVendorId == subVendorId &&
        device.subDeviceId == subDeviceId && --n == 0) {
      out = device;
      return true;
    }
  }
  return false;
}

}  // namespace panelglow
