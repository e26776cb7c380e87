#include "platform/sim/silicon/Buses.h"

#include <algorithm>

namespace panelglow::platform::sim {

namespace {

bool AnyContains(const std::vector<AddressRange>& ranges, std::uint64_t address) {
  return std::any_of(ranges.begin(), ranges.end(),
                     [&](const AddressRange& range) { return range.Contains(address); });
}

}  // namespace

void Buses::Attach(const std::string& name, std::unique_ptr<Device> device) {
  devices_.push_back({name, std::move(device)});
}

Device* Buses::Find(const std::string& name) const {
  for (const Attached& attached : devices_) {
    if (attached.name == name) {
      return attached.device.get();
    }
  }
  return nullptr;
}

void Buses::Remove(const std::string& name) {
  for (Attached& attached : devices_) {
    attached.isRemoved = attached.isRemoved || attached.name == name;
  }
}

bool Buses::IsRemoved(const std::string& name) const {
  return std::any_of(devices_.begin(), devices_.end(),
                     [&](const Attached& attached) { return attached.isRemoved && attached.name == name; });
}

const Buses::Attached* Buses::AtPort(std::uint16_t port) const {
  for (const Attached& attached : devices_) {
    if (!attached.isRemoved && AnyContains(attached.device->PortRanges(), port)) {
      return &attached;
    }
  }
  return nullptr;
}

const Buses::Attached* Buses::AtMemory(std::uint64_t address) const {
  for (const Attached& attached : devices_) {
    if (AnyContains(attached.device->MemoryRanges(), address)) {
      return &attached;
    }
  }
  return nullptr;
}

std::uint32_t Buses::ReadPort(std::uint16_t port, unsigned width) {
  std::uint32_t value = 0;
  for (unsigned i = 0; i < width; ++i) {
    const auto at = static_cast<std::uint16_t>(port + i);
    const Attached* attached = AtPort(at);
    const std::uint8_t byte = attached == nullptr ? std::uint8_t{0xFF} : attached->device->ReadPort(at);
    value |= static_cast<std::uint32_t>(byte) << (8 * i);
  }
  return value;
}

void Buses::WritePort(std::uint16_t port, unsigned width, std::uint32_t value) {
  for (unsigned i = 0; i < width; ++i) {
    const auto at = static_cast<std::uint16_t>(port + i);
    const Attached* attached = AtPort(at);
    if (attached != nullptr && !IsIgnored(attached->name, at)) {
      attached->device->WritePort(at, static_cast<std::uint8_t>(value >> (8 * i)));
    }
  }
}

std::uint8_t Buses::ReadMemory(std::uint64_t address) {
  if (const Attached* attached = AtMemory(address)) {
    return attached->isRemoved ? std::uint8_t{0xFF} : attached->device->ReadMemory(address);
  }
  const auto page = ram_.find(address / kPage);
  return page == ram_.end() ? std::uint8_t{0} : page->second[address % kPage];
}

void Buses::WriteMemory(std::uint64_t address, std::uint8_t value) {
  if (const Attached* attached = AtMemory(address)) {
    if (!attached->isRemoved && !IsIgnored(attached->name, address)) {
      attached->device->WriteMemory(address, value);
    }
    return;
  }
  ram_.try_emplace(address / kPage).first->second[address % kPage] = value;
}

void Buses::LoadMemory(std::uint64_t address, std::span<const std::uint8_t> bytes) {
  while (!bytes.empty()) {
    const std::uint64_t offset = address % kPage;
    const std::size_t length = std::min<std::size_t>(bytes.size(), kPage - offset);
    std::copy_n(bytes.begin(), length,
                ram_.try_emplace(address / kPage).first->second.begin() + static_cast<std::ptrdiff_t>(offset));
    address += length;
    bytes = bytes.subspan(length);
  }
}

const PciFunction* Buses::FindPci(std::uint16_t location) const {
  const auto found = std::find_if(functions_.begin(), functions_.end(),
                                  [&](const PciFunction& f) { return f.location == location; });
  return found == functions_.end() ? nullptr : &*found;
}

std::uint8_t Buses::ReadPciByte(std::uint16_t location, std::uint16_t offset) const {
  const PciFunction* function = FindPci(location);
  if (function == nullptr) {
    return 0xFF;
  }
  const auto value = function->registers.find(static_cast<std::uint16_t>(offset & ~3U));
  return value == function->registers.end() ? std::uint8_t{0}
                                            : static_cast<std::uint8_t>(value->second >> (8 * (offset & 3U)));
}

void Buses::WritePciByte(std::uint16_t location, std::uint16_t offset, std::uint8_t value) {
  for (PciFunction& function : functions_) {
    if (function.location == location) {
      std::uint32_t& dword = function.registers[static_cast<std::uint16_t>(offset & ~3U)];
      const unsigned shift = 8 * (offset & 3U);
      dword = (dword & ~(0xFFU << shift)) | static_cast<std::uint32_t>(value) << shift;
    }
  }
}

std::string Buses::State() const {
  std::string text;
  for (const Attached& attached : devices_) {
    text += attached.device->State();
  }
  return text;
}

}  // namespace panelglow::platform::sim
