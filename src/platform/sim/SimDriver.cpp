#include "platform/sim/SimDriver.h"

#include <algorithm>
#include <array>

namespace panelglow::platform::sim {

namespace {

// What a request costs the machine: an I/O port cycle over the low-pin-count bus, with the way through the kernel.
constexpr Microseconds kRequestCost_us = 2;

constexpr std::uint32_t kErrorInvalidFunction = 1;
constexpr std::uint32_t kErrorInvalidParameter = 87;
constexpr std::uint8_t kPciNotFound = 0x86;

// Wire format of the requests that this machine answers.
constexpr std::uint32_t kVersion = 0x220000;
constexpr std::uint32_t kReadFirmwareWord = 0x22001C;
constexpr std::uint32_t kReadFirmwareByte = 0x220020;
constexpr std::uint32_t kFindPciDevice = 0x22003C;
constexpr std::uint32_t kFindPciClass = 0x220058;
constexpr std::uint32_t kMapMemory = 0x2200A8;
constexpr std::uint32_t kUnmapMemory = 0x2200C8;
constexpr std::uint32_t kReadMsr = 0x222498;

std::uint64_t Get(std::span<const std::byte> bytes, std::size_t offset, std::size_t width) {
  std::uint64_t value = 0;
  for (std::size_t i = 0; i < width; ++i) {
    value |= std::to_integer<std::uint64_t>(bytes[offset + i]) << (8 * i);
  }
  return value;
}

void Put(std::span<std::byte> bytes, std::size_t offset, std::size_t width, std::uint64_t value) {
  for (std::size_t i = 0; i < width; ++i) {
    bytes[offset + i] = static_cast<std::byte>(value >> (8 * i));
  }
}

}  // namespace

// One open handle of the device link.
class SimDriver::LinkedDevice : public DriverDevice {
 public:
  explicit LinkedDevice(SimDriver& driver) : driver_(driver) {}

  std::uint32_t Control(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) override {
    driver_.scheduler_.Spend(kRequestCost_us);
    std::vector<std::byte> request(in.begin(),
                                   in.end());  // buffered transfer: the answer never overlaps the question
    const std::uint32_t result = driver_.Answer(code, request, out);
    if (driver_.trace_.IsWanted()) {
      driver_.trace_.Add({driver_.scheduler_.Now(),
                          driver_.scheduler_.Current(),
                          code,
                          result,
                          std::move(request),
                          {out.begin(), out.end()}});
    }
    driver_.moved_();
    return result;
  }

  void ReadMapped(std::uint64_t mapped, std::span<std::byte> bytes) override {
    driver_.scheduler_.Spend(kRequestCost_us);
    const std::uint64_t address = driver_.PhysicalAddress(mapped);
    for (std::size_t i = 0; i < bytes.size(); ++i) {
      bytes[i] = static_cast<std::byte>(driver_.buses_.ReadMemory(address + i));
    }
    Note(DriverRequest::kMappedRead, address, bytes);
  }

  void WriteMapped(std::uint64_t mapped, std::span<const std::byte> bytes) override {
    driver_.scheduler_.Spend(kRequestCost_us);
    const std::uint64_t address = driver_.PhysicalAddress(mapped);
    for (std::size_t i = 0; i < bytes.size(); ++i) {
      driver_.buses_.WriteMemory(address + i, std::to_integer<std::uint8_t>(bytes[i]));
    }
    Note(DriverRequest::kMappedWrite, address, bytes);
    driver_.moved_();
  }

 private:
  void Note(std::uint32_t code, std::uint64_t address, std::span<const std::byte> bytes) {
    if (driver_.trace_.IsWanted()) {
      std::vector<std::byte> where(8);
      Put(where, 0, 8, address);
      driver_.trace_.Add({driver_.scheduler_.Now(),
                          driver_.scheduler_.Current(),
                          code,
                          0,
                          std::move(where),
                          {bytes.begin(), bytes.end()}});
    }
  }

  SimDriver& driver_;
};

SimDriver::SimDriver(const DriverDescription& description, Buses& buses, Scheduler& scheduler, DriverTrace& trace,
                     std::function<void()> moved)
    : description_(description), buses_(buses), scheduler_(scheduler), trace_(trace), moved_(std::move(moved)) {
  for (const ServiceDescription& service : description.services) {
    services_[service.name] = {service.running, service.startError};
  }
}

SimDriver::~SimDriver() = default;

// ---- service manager

ServiceHandle SimDriver::OpenManager(std::uint32_t /*access*/, std::uint32_t& error) {
  error = description_.managerError;
  if (error != 0) {
    return 0;
  }
  handles_.emplace(nextHandle_, std::string());
  return nextHandle_++;
}

ServiceHandle SimDriver::OpenService(ServiceHandle manager, std::string_view name, std::uint32_t /*access*/,
                                     std::uint32_t& error) {
  const auto opened = handles_.find(manager);
  if (opened == handles_.end()) {
    error = kErrorInvalidHandle;
    return 0;
  }
  if (services_.count(std::string(name)) == 0) {
    error = kErrorServiceDoesNotExist;
    return 0;
  }
  error = 0;
  handles_.emplace(nextHandle_, std::string(name));
  return nextHandle_++;
}

ServiceHandle SimDriver::CreateService(ServiceHandle manager, const ServiceDefinition& definition,
                                       std::uint32_t& error) {
  error = handles_.count(manager) == 0 ? kErrorInvalidHandle : description_.createError;
  if (error != 0) {
    return 0;
  }
  services_[definition.service_name] = {};
  handles_.emplace(nextHandle_, definition.service_name);
  return nextHandle_++;
}

std::uint32_t SimDriver::Start(ServiceHandle handle) {
  const auto opened = handles_.find(handle);
  if (opened == handles_.end() || services_.count(opened->second) == 0) {
    return kErrorInvalidHandle;
  }
  Service& service = services_[opened->second];
  if (service.running) {
    return kErrorServiceAlreadyRunning;
  }
  const std::uint32_t forced = service.startError != 0 ? service.startError : description_.startError;
  if (forced != 0) {
    return forced;
  }
  const bool isOlder = opened->second == "Nvntsk";
  if (!description_.present || isOlder != description_.olderSet) {
    return kErrorFileNotFound;
  }
  service.running = true;
  return 0;
}

std::uint32_t SimDriver::Delete(ServiceHandle handle) {
  const auto opened = handles_.find(handle);
  if (opened == handles_.end()) {
    return kErrorInvalidHandle;
  }
  services_.erase(opened->second);
  return 0;
}

void SimDriver::Close(ServiceHandle handle) { handles_.erase(handle); }

// ---- device link

std::unique_ptr<DriverDevice> SimDriver::Open(std::string_view linkName, std::uint32_t& error) {
  const auto service = services_.find(std::string(linkName));
  if (!description_.link || service == services_.end() || !service->second.running) {
    error = kErrorFileNotFound;
    return nullptr;
  }
  error = 0;
  return std::make_unique<LinkedDevice>(*this);
}

std::uint64_t SimDriver::PhysicalAddress(std::uint64_t mapped) const {
  auto mapping = mappings_.upper_bound(mapped);
  if (mapping == mappings_.begin()) {
    return 0;
  }
  --mapping;
  return mapping->second.first + (mapped - mapping->first);
}

// ---- requests

std::uint32_t SimDriver::Answer(std::uint32_t code, std::span<std::byte> in, std::span<std::byte> out) {
  if (code >= 0x220004 && code <= 0x220018) {
    return AnswerPort(code, in, out);
  }
  switch (code) {
    case kVersion:
      if (out.size() < 4) {
        return kErrorInvalidParameter;
      }
      Put(out, 0, 4, description_.version);
      return 0;
    case kReadFirmwareWord:
    case kReadFirmwareByte:
      return AnswerFirmware(code, in, out);
    case kFindPciDevice:
    case kFindPciClass:
      if (in.size() != 16 || out.size() != 16) {
        return kErrorInvalidParameter;
      }
      std::copy(in.begin(), in.end(), out.begin());
      return AnswerPciSearch(code, out);
    case kMapMemory:
      if ((in.size() != 20 && in.size() != 40) || out.size() != in.size()) {
        return kErrorInvalidParameter;
      }
      std::copy(in.begin(), in.end(), out.begin());
      return MapMemory(out);
    case kUnmapMemory:
      return in.size() == 20 && mappings_.erase(Get(in, 8, 4)) != 0 ? 0 : kErrorInvalidParameter;
    case kReadMsr:
      return kErrorInvalidParameter;
    default:
      break;
  }
  if (code >= 0x220040 && code <= 0x220054 && in.size() == 16 && out.size() == 16) {
    std::copy(in.begin(), in.end(), out.begin());
    return AnswerPci(code, out);
  }
  return kErrorInvalidFunction;
}

std::uint32_t SimDriver::AnswerPort(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) {
  if (in.size() != 12) {
    return kErrorInvalidParameter;
  }
  const auto port = static_cast<std::uint16_t>(Get(in, 0, 4));
  const auto width = static_cast<unsigned>(Get(in, 4, 4));
  constexpr std::array<unsigned, 3> kWidths{1, 2, 4};
  if (width != kWidths[((code - 0x220004) / 4) % 3]) {
    return kErrorInvalidParameter;
  }
  if (code >= 0x220010) {
    buses_.WritePort(port, width, static_cast<std::uint32_t>(Get(in, 8, 4)));
    return 0;
  }
  if (out.size() != 4) {
    return kErrorInvalidParameter;
  }
  Put(out, 0, 4, buses_.ReadPort(port, width));
  return 0;
}

std::uint32_t SimDriver::AnswerPci(std::uint32_t code, std::span<std::byte> record) {
  const auto location = static_cast<std::uint16_t>(Get(record, 4, 2));
  const auto offset = static_cast<std::uint16_t>(Get(record, 6, 2));
  if (buses_.FindPci(location) == nullptr) {
    Put(record, 8, 1, kPciNotFound);
    return 0;
  }
  const bool write = code >= 0x22004C;
  const unsigned width = 1U << ((code - (write ? 0x22004CU : 0x220040U)) / 4);
  std::uint32_t value = 0;
  for (unsigned i = 0; i < width; ++i) {
    const auto at = static_cast<std::uint16_t>(offset + i);
    if (write) {
      buses_.WritePciByte(location, at, static_cast<std::uint8_t>(Get(record, i, 1)));
    } else {
      value |= static_cast<std::uint32_t>(buses_.ReadPciByte(location, at)) << (8 * i);
    }
  }
  if (!write) {
    Put(record, 0, 4, value);
  }
  Put(record, 8, 1, 0);
  return 0;
}

std::uint32_t SimDriver::AnswerPciSearch(std::uint32_t code, std::span<std::byte> record) {
  auto index = static_cast<unsigned>(Get(record, 8, 2));
  for (const PciFunction& function : buses_.PciFunctions()) {
    const auto dword = [&](std::uint16_t offset) {
      const auto found = function.registers.find(offset);
      return found == function.registers.end() ? 0U : found->second;
    };
    const bool matches = code == kFindPciClass ? (dword(8) >> 8U) == Get(record, 0, 4)
                                               : dword(0) == (Get(record, 4, 2) | Get(record, 6, 2) << 16U);
    if (matches && index-- == 0) {
      Put(record, 10, 2, function.location);
      Put(record, 12, 1, 0);
      return 0;
    }
  }
  Put(record, 12, 1, kPciNotFound);
  return 0;
}

std::uint32_t SimDriver::MapMemory(std::span<std::byte> record) {
  const bool wide = record.size() == 40;
  const std::size_t field = wide ? 8 : 4;
  const std::uint64_t address = Get(record, 0, field);
  const std::uint64_t length = Get(record, field, field);
  constexpr std::uint64_t kLargestMapping = 1U << 20U;
  if (length == 0 || length > kLargestMapping) {
    return kErrorInvalidParameter;
  }
  const std::uint64_t mapped = nextMapping_;
  mappings_[mapped] = {address, length};
  nextMapping_ += (length + 0xFFF) & ~std::uint64_t{0xFFF};
  if (nextMapping_ > 0x70000000) {
    nextMapping_ = 0x10000000;  // the oldest mappings are long copied
  }
  Put(record, 2 * field, field, mapped);
  return 0;
}

std::uint32_t SimDriver::AnswerFirmware(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) {
  if (in.size() != 6 || out.size() != 2) {
    return kErrorInvalidParameter;
  }
  const std::uint64_t address = Get(in, 0, 2) * 16 + Get(in, 2, 2);
  std::uint64_t value = buses_.ReadMemory(address);
  if (code == kReadFirmwareWord) {
    value |= static_cast<std::uint64_t>(buses_.ReadMemory(address + 1)) << 8U;
  }
  Put(out, 0, 2, value);
  return 0;
}

}  // namespace panelglow::platform::sim
