// The privileged driver of a simulated machine: its service, its device link, and its answers to requests, byte by
// byte, from the machine's buses.
#pragma once

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>

#include "platform/DriverDevice.h"
#include "platform/ServiceManager.h"
#include "platform/sim/DriverTrace.h"
#include "platform/sim/MachineDescription.h"
#include "platform/sim/SimCpu.h"
#include "platform/sim/base/Scheduler.h"
#include "platform/sim/silicon/Buses.h"

namespace panelglow::platform::sim {

class SimDriver : public DriverDevices, public ServiceManager {
 public:
  /// `moved` is called after every access that may have moved a pin.
  SimDriver(const DriverDescription& description, const SimCpu& cpu, Buses& buses, Scheduler& scheduler,
            DriverTrace& trace, std::function<void()> moved);
  ~SimDriver() override;

  // ---- DriverDevices
  std::unique_ptr<DriverDevice> Open(std::string_view linkName, std::uint32_t& error) override;

  // ---- ServiceManager
  ServiceHandle OpenManager(std::uint32_t access, std::uint32_t& error) override;
  ServiceHandle OpenService(ServiceHandle manager, std::string_view name, std::uint32_t access,
                            std::uint32_t& error) override;
  ServiceHandle CreateService(ServiceHandle manager, const ServiceDefinition& definition,
                              std::uint32_t& error) override;
  std::uint32_t Start(ServiceHandle service) override;
  std::uint32_t Delete(ServiceHandle service) override;
  void Close(ServiceHandle handle) override;

  [[nodiscard]] bool IsRegistered(const std::string& name) const { return services_.count(name) != 0; }
  [[nodiscard]] std::size_t OpenHandles() const { return handles_.size(); }

 private:
  struct Service {
    bool running = false;
    std::uint32_t startError = 0;
  };
  class LinkedDevice;

  std::uint32_t Answer(std::uint32_t code, std::span<std::byte> in, std::span<std::byte> out);
  std::uint32_t CarryOut(std::uint32_t code, std::span<std::byte> in, std::span<std::byte> out);
  std::uint32_t AnswerInPlace(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out);
  std::uint32_t AnswerPort(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out);
  std::uint32_t AnswerPci(std::uint32_t code, std::span<std::byte> record);
  std::uint32_t AnswerPciSearch(std::uint32_t code, std::span<std::byte> record);
  std::uint32_t MapMemory(std::span<std::byte> record);
  std::uint32_t AnswerFirmware(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out);
  [[nodiscard]] std::uint64_t PhysicalAddress(std::uint64_t mapped) const;

  [[nodiscard]] std::optional<std::uint64_t> ModelRegister(std::uint32_t index) const;

  DriverDescription description_;
  const SimCpu& cpu_;
  Buses& buses_;
  Scheduler& scheduler_;
  DriverTrace& trace_;
  std::function<void()> moved_;
  std::map<std::string, Service> services_;
  std::map<ServiceHandle, std::string> handles_;  // the manager's handle has an empty name
  ServiceHandle nextHandle_ = 1;
  std::map<std::uint64_t, std::pair<std::uint64_t, std::uint64_t>> mappings_;  // mapped address to address and length
  std::uint64_t nextMapping_ = 0x10000000;
};

}  // namespace panelglow::platform::sim
