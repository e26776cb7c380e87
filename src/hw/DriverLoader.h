// Registers, starts and opens the privileged driver. Nobody installs it: the first program that needs it registers
// its service, and later ones find it there. It stays registered and running when the program ends.
#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "platform/DriverDevice.h"
#include "platform/ServiceManager.h"

namespace panelglow {

struct DriverNames {
  std::string service;
  std::string display;
  std::string device;  // of the device link
  std::string image;   // the binary, relative to the system's root
};

/// How the last load of the driver's service ended.
enum class DriverLoadState : std::uint32_t {
  kNotStarted = 0,   // nothing tried yet, or stopped before the start
  kRunning = 1,      // started now, or ran already
  kStartFailed = 2,  // for another reason than a missing file
  kNoBinary = 3,     // the driver's file is missing; the service was deleted again
};

class DriverLoader {
 public:
  DriverLoader(platform::ServiceManager& serviceManager, platform::DriverDevices& driverDevices)
      : services(serviceManager), drivers(driverDevices) {}

  /// The names that the driver goes by today, by the system's word size.
  static DriverNames PresentNames(bool is64BitSystem);

  /// Those that it went by before.
  static DriverNames OlderNames();

  /// Loads under names as they are given. The open device, or null; why not, no one is told: callers report an absent
  /// driver in their own way. `state` stays as it is when the load stops before the start. A service that exists is
  /// used as it stands. Two processes may race here: the loser finds the service running.
  std::unique_ptr<platform::DriverDevice> Load(const DriverNames& names, DriverLoadState& state);

  /// Loads under the present names, and when their file is missing under the older ones. `names` become those that
  /// were tried last.
  std::unique_ptr<platform::DriverDevice> LoadPresentOrOlder(bool is64BitSystem, DriverNames& names,
                                                             DriverLoadState& state);

 private:
  [[nodiscard]] platform::ServiceHandle OpenOrCreate(platform::ServiceHandle manager, const DriverNames& names);

  platform::ServiceManager& services;
  platform::DriverDevices& drivers;
};

}  // namespace panelglow
