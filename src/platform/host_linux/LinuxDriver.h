// What stands for the suite's privileged driver under Linux: the kernel's own doors to ports, memory, configuration
// space and model-specific registers, behind the driver's requests.
//
// "Starting the driver's service" is asking the kernel for the ports and for /dev/mem. Where it refuses, the service
// does not start, and people are told once what the bench lacks; nothing is ever lit on a machine that refused, by
// the door that is open neither.
#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <set>
#include <string_view>

#include "platform/DriverDevice.h"
#include "platform/ServiceManager.h"
#include "platform/host_linux/MemoryMap.h"
#include "platform/host_linux/PciConfiguration.h"
#include "platform/host_linux/PhysicalMemory.h"
#include "platform/posix/TellPeople.h"

namespace panelglow::platform::host_linux {

class LinuxDriver : public DriverDevices, public ServiceManager {
 public:
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

 private:
  class Device;

  struct Refused {
    std::string_view door;
    int error;  // 0: nothing is refused
  };

  /// Whether the calling thread has all doors without which the service does not start.
  Refused Refusal();

  /// Who answers at the memory of a request, by its page; looked up once for each.
  MemoryOwner OwnerOf(std::uint64_t address, std::uint64_t length);

  /// At most one sentence about each page that was asked for: refused, or with an owner that answers nothing. `error`
  /// is what came of the request.
  void TellOfMemory(std::uint64_t address, MemoryOwner owner, int error);

  PhysicalMemory memory_;
  PciConfiguration pci_;
  std::mutex guard_;
  std::map<std::uint64_t, MemoryOwner> owners_;  // by number of the page
  std::set<std::uint64_t> toldPages_;
  posix::OnceTeller teller_;
};

/// The error number of the program's home system for one of this kernel.
std::uint32_t HomeErrorOf(int error);

}  // namespace panelglow::platform::host_linux
