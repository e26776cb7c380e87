// The answers of a machine on which the suite's driver is not installed.
#pragma once

#include "platform/DriverDevice.h"
#include "platform/ServiceManager.h"

namespace panelglow::platform::host_linux {

/// There is no service manager that could start the driver, and no device link: a load of the driver stops at its
/// first step, and the tests report their own "driver not loaded".
class AbsentDriver : public DriverDevices, public ServiceManager {
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
};

}  // namespace panelglow::platform::host_linux
