#include "platform/host_linux/AbsentDriver.h"

namespace panelglow::platform::host_linux {

std::unique_ptr<DriverDevice> AbsentDriver::Open(std::string_view /*linkName*/, std::uint32_t& error) {
  error = kErrorFileNotFound;
  return nullptr;
}

ServiceHandle AbsentDriver::OpenManager(std::uint32_t /*access*/, std::uint32_t& error) {
  error = kErrorFileNotFound;
  return 0;
}

// Without a manager there is no valid handle for any of the others.

ServiceHandle AbsentDriver::OpenService(ServiceHandle /*manager*/, std::string_view /*name*/,
                                        std::uint32_t /*access*/, std::uint32_t& error) {
  error = kErrorInvalidHandle;
  return 0;
}

ServiceHandle AbsentDriver::CreateService(ServiceHandle /*manager*/, const ServiceDefinition& /*definition*/,
                                          std::uint32_t& error) {
  error = kErrorInvalidHandle;
  return 0;
}

std::uint32_t AbsentDriver::Start(ServiceHandle /*service*/) { return kErrorInvalidHandle; }

std::uint32_t AbsentDriver::Delete(ServiceHandle /*service*/) { return kErrorInvalidHandle; }

void AbsentDriver::Close(ServiceHandle /*handle*/) {}

}  // namespace panelglow::platform::host_linux
