#include "hw/DriverLoader.h"

namespace panelglow {

namespace {

// Rights and kinds as the service manager's interface numbers them.
constexpr std::uint32_t kManagerAllAccess = 0xF003F;
constexpr std::uint32_t kServiceAllAccess = 0xF01FF;
constexpr std::uint32_t kKernelDriver = 1;
constexpr std::uint32_t kDemandStart = 3;
constexpr std::uint32_t kErrorNormal = 1;

// Closes a service manager or service handle.
class OpenHandle {
 public:
  OpenHandle(platform::ServiceManager& services, platform::ServiceHandle handle)
      : services_(services), handle_(handle) {}
  ~OpenHandle() {
    if (handle_ != 0) {
      services_.Close(handle_);
    }
  }
  OpenHandle(const OpenHandle&) = delete;
  OpenHandle& operator=(const OpenHandle&) = delete;
  [[nodiscard]] platform::ServiceHandle Get() const { return handle_; }

 private:
  platform::ServiceManager& services_;
  platform::ServiceHandle handle_;
};

}  // namespace

DriverNames DriverLoader::PresentNames(bool is64BitSystem) {
  return {"tmbhalcyon", "tmbhalcyon", "tmbhalcyon",
          is64BitSystem ? "system32\\drivers\\tmb64halcyon.sys" : "system32\\drivers\\tmb32halcyon.sys"};
}

DriverNames DriverLoader::OlderNames() {
  return {"Nvntsk", "Norvane Tsk", "Nvntsk", "System32\\drivers\\nvntsk.sys"};
}

platform::ServiceHandle DriverLoader::OpenOrCreate(platform::ServiceHandle manager, const DriverNames& names) {
  std::uint32_t error = 0;
  const platform::ServiceHandle handle = services.OpenService(manager, names.service, kServiceAllAccess, error);
  if (handle != 0 || error != platform::kErrorServiceDoesNotExist) {
    return handle;
  }
  return services.CreateService(
      manager,
      {names.service, names.display, kServiceAllAccess, kKernelDriver, kDemandStart, kErrorNormal, names.image},
      error);
}

std::unique_ptr<platform::DriverDevice> DriverLoader::Load(const DriverNames& names, DriverLoadState& state) {
  std::uint32_t error = 0;
  const OpenHandle manager(services, services.OpenManager(kManagerAllAccess, error));
  if (manager.Get() == 0) {
    return nullptr;
  }
  const OpenHandle service(services, OpenOrCreate(manager.Get(), names));
  if (service.Get() == 0) {
    return nullptr;
  }
  error = services.Start(service.Get());
  if (error == platform::kErrorFileNotFound) {
    state = DriverLoadState::kNoBinary;
    services.Delete(service.Get());
    return nullptr;
  }
  if (error != 0 && error != platform::kErrorServiceAlreadyRunning) {
    state = DriverLoadState::kStartFailed;
    return nullptr;
  }
  state = DriverLoadState::kRunning;
  return drivers.Open(names.device, error);
}

std::unique_ptr<platform::DriverDevice> DriverLoader::LoadPresentOrOlder(bool is64BitSystem, DriverNames& names,
                                                                         DriverLoadState& state) {
  names = PresentNames(is64BitSystem);
  std::unique_ptr<platform::DriverDevice> device = Load(names, state);
  if (state == DriverLoadState::kNoBinary) {
    names = OlderNames();
    device = Load(names, state);
  }
  return device;
}

}  // namespace panelglow
