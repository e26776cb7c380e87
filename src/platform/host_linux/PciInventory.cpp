#include "platform/host_linux/PciInventory.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstdio>
#include <string_view>
#include <utility>

namespace panelglow::platform::host_linux {

namespace {

// "00:1f" and the like behind the domain 0, as it names a slot's place; with ".2" behind it, a function's.
std::optional<std::uint16_t> ReadLocation(std::string_view name, bool withFunction) {
  constexpr std::string_view kDomain = "0000:";
  const auto number = [&](std::size_t at, std::size_t length, unsigned largest) -> std::optional<unsigned> {
    unsigned value = 0;
    const char* const begin = name.data() + at;
    const auto [end, error] = std::from_chars(begin, begin + length, value, 16);
    return error == std::errc() && end == begin + length && value <= largest ? std::optional(value) : std::nullopt;
  };
  const std::size_t length = kDomain.size() + (withFunction ? 7 : 5);
  if (name.size() != length || name.substr(0, kDomain.size()) != kDomain || name[7] != ':' ||
      (withFunction && name[10] != '.')) {
    return std::nullopt;
  }
  const auto bus = number(5, 2, 0xFF);
  const auto device = number(8, 2, 0x1F);
  const auto function = withFunction ? number(11, 1, 7) : std::optional(0U);
  if (!bus || !device || !function) {
    return std::nullopt;
  }
  return static_cast<std::uint16_t>(*bus << 8U | *device << 3U | *function);
}

std::optional<PciFunctionIds> ReadIdentity(const std::string& folder) {
  constexpr std::uint64_t kWord = 0xFFFF;
  const auto word = [&](const char* name) { return ReadKernelNumber(folder + name, kWord); };
  const auto vendor = word("/vendor");
  const auto device = word("/device");
  const auto classCode = ReadKernelNumber(folder + "/class", 0xFFFFFF);
  if (!vendor || !device || !classCode) {
    return std::nullopt;
  }
  return PciFunctionIds{
      .vendorId = static_cast<std::uint16_t>(*vendor),
      .deviceId = static_cast<std::uint16_t>(*device),
      .subVendorId = static_cast<std::uint16_t>(word("/subsystem_vendor").value_or(0)),
      .subDeviceId = static_cast<std::uint16_t>(word("/subsystem_device").value_or(0)),
      .classCode = static_cast<std::uint32_t>(*classCode),
      .revision = static_cast<std::uint8_t>(ReadKernelNumber(folder + "/revision", 0xFF).value_or(0))};
}

// Slots whose names are no numbers have none.
std::map<std::uint16_t, std::uint32_t> ReadSlots(const std::string& folder) {
  std::map<std::uint16_t, std::uint32_t> slots;
  for (const std::string& name : KernelNames(folder)) {
    std::uint32_t number = 0;
    const auto [end, error] = std::from_chars(name.data(), name.data() + name.size(), number);
    const auto location = ReadLocation(ReadKernelText(folder + "/" + name + "/address"), false);
    if (error == std::errc() && end == name.data() + name.size() && location) {
      slots.emplace(*location, number);
    }
  }
  return slots;
}

}  // namespace

std::string KernelName(std::uint16_t location) {
  std::array<char, 32> name{};
  std::snprintf(name.data(), name.size(), "0000:%02x:%02x.%u", static_cast<unsigned>(location >> 8U),
                static_cast<unsigned>(location >> 3U & 0x1FU), static_cast<unsigned>(location & 7U));
  return name.data();
}

PciInventory::PciInventory(const KernelFolders& folders) {
  const std::string devices = folders.sys + "/bus/pci/devices/";
  std::vector<std::pair<std::uint16_t, std::string>> found;
  for (const std::string& name : KernelNames(devices)) {
    if (const auto location = ReadLocation(name, true)) {
      found.emplace_back(*location, name);
    }
  }
  std::sort(found.begin(), found.end());
  const std::map<std::uint16_t, std::uint32_t> slots =
      found.empty() ? std::map<std::uint16_t, std::uint32_t>() : ReadSlots(folders.sys + "/bus/pci/slots");
  for (const auto& [location, name] : found) {
    const std::string folder = devices + name;
    const std::optional<PciFunctionIds> identity = ReadIdentity(folder);
    if (!identity) {
      continue;
    }
    SysfsPciFunction function{.location = location, .identity = *identity, .driver = LinkName(folder + "/driver")};
    const auto slot = slots.find(location & 0xFFF8U);
    if (slot != slots.end()) {
      function.slotNumber = slot->second;
    }
    places_.emplace(name, functions_.size());
    functions_.push_back(std::move(function));
  }
  for (const auto& [name, place] : places_) {
    const std::string path = RealPath(devices + name);
    const std::size_t own = path.rfind('/');
    const std::optional<std::size_t> parent = own == std::string::npos ? std::nullopt : OwnerOf(path.substr(0, own));
    // What is behind a bridge has a bus of a higher number, so that nothing is behind itself.
    if (parent && functions_[*parent].location >> 8U < functions_[place].location >> 8U) {
      functions_[place].parent = parent;
    }
  }
}

std::optional<std::size_t> PciInventory::OwnerOf(const std::string& realPath) const {
  std::vector<std::string> names = PathNames(realPath);
  std::reverse(names.begin(), names.end());  // the nearest function is the owner
  for (const std::string& name : names) {
    if (const auto found = places_.find(name); found != places_.end()) {
      return found->second;
    }
  }
  return std::nullopt;
}

}  // namespace panelglow::platform::host_linux
