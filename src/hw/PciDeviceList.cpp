#include "hw/PciDeviceList.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <mutex>
#include <optional>
#include <string_view>
#include <utility>

#include "hw/CDevio.h"
#include "hw/SetupDI.h"

namespace panelglow {

namespace {

constexpr std::size_t kPropertyBuffer = 1024;
constexpr std::uint32_t kUnknownClass = 0xFFFFFF;  // all 24 bits

// PCI\VEN_vvvv&DEV_dddd&SUBSYS_ssssuuuu&REV_rr: texts of fixed length, and a number behind each. What stands behind a
// number that is none is not read.
void ParseHardwareIds(const std::string& texts, PciDevice& device) {
  std::array<char, 9> between{};
  unsigned vendor = 0;
  unsigned id = 0;
  unsigned subsystem = 0;
  unsigned revision = 0;
  // NOLINTNEXTLINE(cert-err34-c): the widths keep every number in range
  std::sscanf(texts.c_str(), "%8s%4X%5s%4X%8s%8X%5s%2X", between.data(), &vendor, between.data(), &id, between.data(),
              &subsystem, between.data(), &revision);
  device.vendorId = static_cast<std::uint16_t>(vendor);
  device.deviceId = static_cast<std::uint16_t>(id);
  device.subVendorId = static_cast<std::uint16_t>(subsystem & 0xFFFFU);
  device.subDeviceId = static_cast<std::uint16_t>(subsystem >> 16U);
  device.revision = static_cast<std::uint8_t>(revision);
  constexpr std::string_view kClassMark = "CC_";
  if (const std::size_t mark = texts.find(kClassMark); mark != std::string::npos) {
    // NOLINTNEXTLINE(cert-err34-c)
    std::sscanf(texts.c_str() + mark + kClassMark.size(), "%6X", &device.classCode);
    device.classCode &= kUnknownClass;  // a number may have a sign
  }
}

// A property of the list's present device; nothing when it has none.
std::optional<std::string> ReadText(SetupDI& list, std::uint32_t property) {
  std::array<std::uint8_t, kPropertyBuffer> buffer{};
  std::uint32_t size = 0;
  std::uint32_t type = 0;
  if (!list.ReadDeviceProperty(property, buffer, size, type)) {
    return std::nullopt;
  }
  return std::string(reinterpret_cast<const char*>(buffer.data()), size);
}

std::string ReadFirstText(SetupDI& list, std::uint32_t property) {
  const std::string texts = ReadText(list, property).value_or("");
  return texts.substr(0, texts.find('\0'));
}

std::uint32_t ReadNumber(SetupDI& list, std::uint32_t property) {
  std::array<std::uint8_t, 4> bytes{};
  std::uint32_t size = 0;
  std::uint32_t type = 0;
  if (!list.ReadDeviceProperty(property, bytes, size, type) || size != bytes.size()) {
    return 0;
  }
  return static_cast<std::uint32_t>(bytes[0] | bytes[1] << 8U | bytes[2] << 16U) |
         static_cast<std::uint32_t>(bytes[3]) << 24U;
}

// The last three numbers of "PCI bus 0, device 31, function 2", whose words are of the system's language and may hold
// numbers themselves; otherwise the driver is asked where the device is.
void ReadPlace(SetupDI& list, std::optional<CDevio>& driver, PciDevice& device) {
  const std::string text = ReadFirstText(list, platform::kLocationProperty);
  std::vector<unsigned long> numbers;
  constexpr const char* kDigits = "0123456789";
  for (std::size_t at = text.find_first_of(kDigits); at != std::string::npos;
       at = text.find_first_of(kDigits, std::min(text.find_first_not_of(kDigits, at), text.size()))) {
    numbers.push_back(std::strtoul(text.c_str() + at, nullptr, 10));
  }
  if (numbers.size() >= 3) {
    const unsigned long* const place = &numbers[numbers.size() - 3];
    if (place[0] <= 255 && place[1] <= 31 && place[2] <= 7) {
      device.bus = static_cast<std::uint8_t>(place[0]);
      device.device = static_cast<std::uint8_t>(place[1]);
      device.function = static_cast<std::uint8_t>(place[2]);
      return;
    }
  }
  if (!driver) {
    driver.emplace();
  }
  std::uint16_t location = 0;
  if (driver->FindPciDevice(device.vendorId, device.deviceId, static_cast<std::uint16_t>(device.earlierEqual),
                            location) == 0) {
    device.bus = static_cast<std::uint8_t>(location >> 8U);
    device.device = static_cast<std::uint8_t>(location >> 3U & 31U);
    device.function = static_cast<std::uint8_t>(location & 7U);
  }
}

struct Shared {
  std::mutex guard;
  std::unique_ptr<const PciDeviceList> list;  // by guard
};

Shared& TheShared() {
  static Shared shared;
  return shared;
}

}  // namespace

const PciDeviceList& PciDeviceList::Instance() {
  Shared& shared = TheShared();
  {
    const std::lock_guard<std::mutex> lock(shared.guard);
    if (shared.list) {
      return *shared.list;
    }
  }
  auto list = std::make_unique<const PciDeviceList>();  // not under the lock: others run meanwhile
  const std::lock_guard<std::mutex> lock(shared.guard);
  if (!shared.list) {
    shared.list = std::move(list);
  }
  return *shared.list;
}

void PciDeviceList::Forget() {
  Shared& shared = TheShared();
  const std::lock_guard<std::mutex> lock(shared.guard);
  shared.list.reset();
}

PciDeviceList::PciDeviceList() {
  SetupDI list;
  if (!list.OpenDeviceList("PCI", platform::kPresentDevices | platform::kAllDeviceClasses, "")) {
    throw int{kNoInventory};
  }
  std::optional<CDevio> driver;  // loaded when it is needed
  while (devices.size() < kMostDevices && list.NextDevice()) {
    const std::optional<std::string> hardwareIds = ReadText(list, platform::kHardwareIdProperty);
    if (!hardwareIds) {
      throw int{kNoInventory};
    }
    PciDevice device;
    ParseHardwareIds(*hardwareIds, device);
    device.earlierEqual =
        static_cast<unsigned>(std::count_if(devices.begin(), devices.end(), [&](const PciDevice& other) {
          return other.vendorId == device.vendorId && other.deviceId == device.deviceId;
        }));
    device.driverKey = ReadFirstText(list, platform::kDriverProperty);
    device.description = ReadFirstText(list, platform::kDescriptionProperty);
    device.slot = ReadNumber(list, platform::kUiNumberProperty);
    device.instanceId = list.GetDeviceInstanceId();
    ReadPlace(list, driver, device);
    Add(std::move(device));
  }
}

void PciDeviceList::Add(PciDevice device) {
  places[{device.vendorId, device.deviceId, device.subVendorId, device.subDeviceId}].push_back(devices.size());
  devices.push_back(std::move(device));
}

int PciDeviceList::CountDevices(std::uint32_t vendorId, std::uint32_t deviceId, std::uint32_t subVendorId,
                                std::uint32_t subDeviceId) const {
  const auto found = places.find({vendorId, deviceId, subVendorId, subDeviceId});
  return found == places.end() ? 0 : static_cast<int>(found->second.size());
}

bool PciDeviceList::FindDevice(std::uint32_t vendorId, std::uint32_t deviceId, std::uint32_t subVendorId,
                               std::uint32_t subDeviceId, int n, PciDevice& out) const {
  const auto found = places.find({vendorId, deviceId, subVendorId, subDeviceId});
  if (found == places.end() || n < 1 || static_cast<std::size_t>(n) > found->second.size()) {
    return false;
  }
  out = devices[found->second[static_cast<std::size_t>(n) - 1]];
  return true;
}

}  // namespace panelglow
