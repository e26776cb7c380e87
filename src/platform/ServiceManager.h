// The system's service manager, as far as a driver service needs it.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace panelglow::platform {

/// An open service manager or service; 0 names none.
using ServiceHandle = std::uint32_t;

// Error numbers that the driver's loader tells apart.
inline constexpr std::uint32_t kErrorFileNotFound = 2;
inline constexpr std::uint32_t kErrorAccessDenied = 5;
inline constexpr std::uint32_t kErrorServiceAlreadyRunning = 1056;
inline constexpr std::uint32_t kErrorServiceDoesNotExist = 1060;

/// What CreateService registers.
struct ServiceDefinition {
  std::string service_name;
  std::string display_name;
  std::uint32_t access = 0;
  std::uint32_t type = 0;
  std::uint32_t start_type = 0;
  std::uint32_t error_control = 0;
  std::string image_path;
};

/// Operations that give a handle return 0 and set `error` on failure; the others return the error number, 0 for
/// success.
class ServiceManager {
 public:
  virtual ~ServiceManager() = default;

  virtual ServiceHandle OpenManager(std::uint32_t access, std::uint32_t& error) = 0;
  virtual ServiceHandle OpenService(ServiceHandle manager, std::string_view name, std::uint32_t access,
                                    std::uint32_t& error) = 0;
  virtual ServiceHandle CreateService(ServiceHandle manager, const ServiceDefinition& definition,
                                      std::uint32_t& error) = 0;
  virtual std::uint32_t Start(ServiceHandle service) = 0;
  virtual std::uint32_t Delete(ServiceHandle service) = 0;
  virtual void Close(ServiceHandle handle) = 0;
};

}  // namespace panelglow::platform
