#include "platform/DeviceIds.h"

#include <algorithm>
#include <array>
#include <cstdio>

#include "platform/AsciiCase.h"
#include "platform/DeviceTree.h"

namespace panelglow::platform {

namespace {

constexpr std::size_t kLongestText = 96;

template <class... Values>
std::string Format(const char* format, Values... values) {
  std::array<char, kLongestText> text{};
  std::snprintf(text.data(), text.size(), format, values...);
  return text.data();
}

std::string DeviceText(const PciFunctionIds& identity) {
  return Format("PCI\\VEN_%04X&DEV_%04X", unsigned{identity.vendorId}, unsigned{identity.deviceId});
}

std::string SubsystemText(const PciFunctionIds& identity) {
  return DeviceText(identity) +
         Format("&SUBSYS_%04X%04X", unsigned{identity.subDeviceId}, unsigned{identity.subVendorId});
}

std::string RevisionText(const PciFunctionIds& identity) {
  return SubsystemText(identity) + Format("&REV_%02X", unsigned{identity.revision});
}

}  // namespace

std::vector<std::string> PciHardwareIds(const PciFunctionIds& identity) {
  return {RevisionText(identity), SubsystemText(identity),
          DeviceText(identity) + Format("&CC_%06X", static_cast<unsigned>(identity.classCode)),
          DeviceText(identity) + Format("&CC_%04X", static_cast<unsigned>(identity.classCode >> 8U))};
}

std::string PciLocationText(std::uint16_t location) {
  return Format("PCI bus %u, device %u, function %u", location >> 8U, location >> 3U & 31U, location & 7U);
}

std::string PciInstanceId(const PciFunctionIds& identity, std::uint16_t location) {
  const unsigned bus = location >> 8U;
  const std::string way = bus == 0 ? "3&11583659" : Format("4&%08X", bus);  // from the host bridge on
  return RevisionText(identity) + "\\" + way + Format("&0&%02X", location & 0xFFU);
}

std::string DiskInterfacePath(std::string_view instanceId) {
  std::string path = Lowered(instanceId);
  std::replace(path.begin(), path.end(), '\\', '#');
  return "\\\\?\\" + path + "#{" + Lowered(kDiskInterface) + "}";
}

std::string DeviceIdOf(const std::string& instanceId) { return instanceId.substr(0, instanceId.rfind('\\')); }

}  // namespace panelglow::platform
