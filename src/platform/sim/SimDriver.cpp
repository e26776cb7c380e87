#include "platform/sim/SimDriver.h"

#include <algorithm>
#include <array>

#include "platform/DriverRecords.h"

namespace panelglow::platform::sim {

using driver::NumberAt;
using driver::PutNumber;

namespace {

// What a request costs the machine: an I/O port cycle over the low-pin-count bus, with the way through the kernel.
constexpr Microseconds kRequestCost_us = 2;

constexpr std::uint32_t kErrorInvalidFunction = 1;
constexpr std::uint32_t kErrorInvalidParameter = 87;
constexpr std::uint8_t kPciNotFound = 0x86;

// What a driver reports for a request that its hardware did not carry out.
constexpr std::uint32_t kErrorGeneralFailure = 31;

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

  std::uint32_t ReadMapped(std::uint64_t mapped, std::size_t width) override {
    driver_.scheduler_.Spend(kRequestCost_us);
    const std::uint64_t address = driver_.PhysicalAddress(mapped);
    std::vector<std::byte> bytes(width);
    for (std::size_t i = 0; i < width; ++i) {
      bytes[i] = static_cast<std::byte>(driver_.buses_.ReadMemory(address + i));
    }
    Note(DriverRequest::kMappedRead, address, bytes);
    return static_cast<std::uint32_t>(NumberAt(bytes, 0, width));
  }

  void WriteMapped(std::uint64_t mapped, std::size_t width, std::uint32_t value) override {
    driver_.scheduler_.Spend(kRequestCost_us);
    const std::uint64_t address = driver_.PhysicalAddress(mapped);
    std::vector<std::byte> bytes(width);
    PutNumber(bytes, 0, width, value);
    for (std::size_t i = 0; i < width; ++i) {
      driver_.buses_.WriteMemory(address + i, std::to_integer<std::uint8_t>(bytes[i]));
    }
    Note(DriverRequest::kMappedWrite, address, bytes);
    driver_.moved_();
  }

 private:
  void Note(std::uint32_t code, std::uint64_t address, std::span<const std::byte> bytes) {
    if (driver_.trace_.IsWanted()) {
      std::vector<std::byte> where(8);
      PutNumber(where, 0, 8, address);
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

SimDriver::SimDriver(const DriverDescription& description, const SimCpu& cpu, Buses& buses, Scheduler& scheduler,
                     DriverTrace& trace, std::function<void()> moved)
    : description_(description),
      cpu_(cpu),
      buses_(buses),
      scheduler_(scheduler),
      trace_(trace),
      moved_(std::move(moved)) {
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

// A refused request is carried out all the same: whoever does not look at the result takes what stands in the record.
std::uint32_t SimDriver::Answer(std::uint32_t code, std::span<std::byte> in, std::span<std::byte> out) {
  const std::uint32_t result = CarryOut(code, in, out);
  const std::vector<std::uint32_t>& refused = description_.refused;
  return std::find(refused.begin(), refused.end(), code) == refused.end() ? result : kErrorGeneralFailure;
}

std::uint32_t SimDriver::CarryOut(std::uint32_t code, std::span<std::byte> in, std::span<std::byte> out) {
  switch (code) {
    case driver::kGetVersion:
      if (out.size() < 4) {
        return kErrorInvalidParameter;
      }
      PutNumber(out, 0, 4, description_.version);
      return 0;
    case driver::kInportByte:
    case driver::kInportWord:
    case driver::kInportDword:
    case driver::kOutportByte:
    case driver::kOutportWord:
    case driver::kOutportDword:
      return AnswerPort(code, in, out);
    case driver::kReadFirmwareWord:
    case driver::kReadFirmwareByte:
      return AnswerFirmware(code, in, out);
    case driver::kUnmapPhysicalMemory:
      return in.size() == driver::kMapSize32 && mappings_.erase(NumberAt(in, 8, 4)) != 0 ? 0 : kErrorInvalidParameter;
    default:
      return AnswerInPlace(code, in, out);
  }
}

// Requests whose answer stands in the record that was sent.
std::uint32_t SimDriver::AnswerInPlace(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) {
  const auto copied = [&](std::initializer_list<std::size_t> sizes) {
    const bool fits = in.size() == out.size() && std::find(sizes.begin(), sizes.end(), in.size()) != sizes.end();
    if (fits) {
      std::copy(in.begin(), in.end(), out.begin());
    }
    return fits;
  };
  switch (code) {
    case driver::kFindPciDevice:
    case driver::kFindPciClass:
      return copied({driver::kSearchSize}) ? AnswerPciSearch(code, out) : kErrorInvalidParameter;
    case driver::kReadPciConfigByte:
    case driver::kReadPciConfigWord:
    case driver::kReadPciConfigDword:
    case driver::kWritePciConfigByte:
    case driver::kWritePciConfigWord:
    case driver::kWritePciConfigDword:
      return copied({driver::kPciSize}) ? AnswerPci(code, out) : kErrorInvalidParameter;
    case driver::kMapPhysicalMemory:
      return copied({driver::kMapSize32, driver::kMapSize64}) ? MapMemory(out) : kErrorInvalidParameter;
    case driver::kReadMsr: {
      const std::optional<std::uint64_t> value =
          in.size() == driver::kMsrSize
              ? ModelRegister(static_cast<std::uint32_t>(NumberAt(in, driver::kMsrIndex, 4)))
              : std::nullopt;
      if (!value || !copied({driver::kMsrSize})) {
        return kErrorInvalidParameter;
      }
      PutNumber(out, 0, driver::kMsrSize, *value);
      return 0;
    }
    default:
      return kErrorInvalidFunction;
  }
}

// Of the core that asks.
std::optional<std::uint64_t> SimDriver::ModelRegister(std::uint32_t index) const {
  if (cpu_.Core() < description_.cores.size()) {
    const DriverDescription::Registers& own = description_.cores[cpu_.Core()];
    if (const auto found = own.find(index); found != own.end()) {
      return found->second;
    }
  }
  const auto found = description_.registers.find(index);
  return found == description_.registers.end() ? std::nullopt : std::optional(found->second);
}

std::uint32_t SimDriver::AnswerPort(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) {
  if (in.size() != driver::kPortSize) {
    return kErrorInvalidParameter;
  }
  const auto port = static_cast<std::uint16_t>(NumberAt(in, driver::kPortNumber, 4));
  const auto width = static_cast<unsigned>(NumberAt(in, driver::kPortWidth, 4));
  constexpr std::array<unsigned, 3> kWidths{1, 2, 4};
  if (width != kWidths[((code - driver::kInportByte) / 4) % 3]) {
    return kErrorInvalidParameter;
  }
  if (code >= driver::kOutportByte) {
    buses_.WritePort(port, width, static_cast<std::uint32_t>(NumberAt(in, driver::kPortValue, 4)));
    return 0;
  }
  if (out.size() != 4) {
    return kErrorInvalidParameter;
  }
  PutNumber(out, 0, 4, buses_.ReadPort(port, width));
  return 0;
}

std::uint32_t SimDriver::AnswerPci(std::uint32_t code, std::span<std::byte> record) {
  const auto location = static_cast<std::uint16_t>(NumberAt(record, driver::kPciLocation, 2));
  const auto offset = static_cast<std::uint16_t>(NumberAt(record, driver::kPciRegister, 2));
  if (buses_.FindPci(location) == nullptr) {
    PutNumber(record, driver::kPciStatus, 1, kPciNotFound);
    return 0;
  }
  const bool write = code >= driver::kWritePciConfigByte;
  const unsigned width = 1U << ((code - (write ? driver::kWritePciConfigByte : driver::kReadPciConfigByte)) / 4);
  std::uint32_t value = 0;
  for (unsigned i = 0; i < width; ++i) {
    const auto at = static_cast<std::uint16_t>(offset + i);
    if (write) {
      buses_.WritePciByte(location, at, static_cast<std::uint8_t>(NumberAt(record, driver::kPciValue + i, 1)));
    } else {
      value |= static_cast<std::uint32_t>(buses_.ReadPciByte(location, at)) << (8 * i);
    }
  }
  if (!write) {
    PutNumber(record, driver::kPciValue, 4, value);
  }
  PutNumber(record, driver::kPciStatus, 1, 0);
  return 0;
}

std::uint32_t SimDriver::AnswerPciSearch(std::uint32_t code, std::span<std::byte> record) {
  auto index = static_cast<unsigned>(NumberAt(record, driver::kSearchIndex, 2));
  for (const PciFunction& function : buses_.PciFunctions()) {
    const auto dword = [&](std::uint16_t offset) {
      const auto found = function.registers.find(offset);
      return found == function.registers.end() ? 0U : found->second;
    };
    const bool matches = code == driver::kFindPciClass
                             ? (dword(8) >> 8U) == NumberAt(record, driver::kSearchClass, 4)
                             : dword(0) == (NumberAt(record, driver::kSearchVendor, 2) |
                                            NumberAt(record, driver::kSearchDevice, 2) << 16U);
    if (matches && index-- == 0) {
      PutNumber(record, driver::kSearchLocation, 2, function.location);
      PutNumber(record, driver::kSearchStatus, 1, 0);
      return 0;
    }
  }
  PutNumber(record, driver::kSearchStatus, 1, kPciNotFound);
  return 0;
}

std::uint32_t SimDriver::MapMemory(std::span<std::byte> record) {
  const bool wide = record.size() == driver::kMapSize64;
  const std::size_t field = wide ? 8 : 4;
  const std::uint64_t address = NumberAt(record, 0, field);
  const std::uint64_t length = NumberAt(record, field, field);
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
  PutNumber(record, 2 * field, field, mapped);
  return 0;
}

std::uint32_t SimDriver::AnswerFirmware(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) {
  if (in.size() != driver::kFirmwareSize || out.size() != driver::kFirmwareAnswerSize) {
    return kErrorInvalidParameter;
  }
  const std::uint64_t address = NumberAt(in, 0, 2) * 16 + NumberAt(in, 2, 2);
  std::uint64_t value = buses_.ReadMemory(address);
  if (code == driver::kReadFirmwareWord) {
    value |= static_cast<std::uint64_t>(buses_.ReadMemory(address + 1)) << 8U;
  }
  PutNumber(out, 0, 2, value);
  return 0;
}

}  // namespace panelglow::platform::sim
