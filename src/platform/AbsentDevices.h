// Device services of a machine that has none of these devices.
#pragma once

#include "platform/Cameras.h"
#include "platform/Connections.h"
#include "platform/DeviceTree.h"
#include "platform/Modules.h"
#include "platform/RawDisks.h"
#include "platform/Registry.h"

namespace panelglow::platform {

/// Every search ends with nothing found, and no list can be opened.
class AbsentDevices : public DeviceTree,
                      public RawDisks,
                      public Cameras,
                      public Connections,
                      public Registry,
                      public Modules {
 public:
  DeviceNode Locate(std::string_view /*instanceId*/) override { return 0; }
  DeviceNode Child(DeviceNode /*node*/) override { return 0; }
  DeviceNode Sibling(DeviceNode /*node*/) override { return 0; }
  DeviceNode Parent(DeviceNode /*node*/) override { return 0; }
  std::optional<std::string> InstanceId(DeviceNode /*node*/) override { return std::nullopt; }
  std::optional<DeviceProperty> NodeProperty(DeviceNode /*node*/, std::uint32_t /*property*/) override {
    return std::nullopt;
  }
  std::unique_ptr<DeviceList> Open(std::string_view /*enumerator*/, std::uint32_t /*flags*/,
                                   std::string_view /*interfaceClass*/) override {
    return nullptr;
  }

  std::unique_ptr<RawDisk> Open(std::string_view /*path*/) override { return nullptr; }
  std::unique_ptr<DiskBlock> Allocate(std::size_t /*size_bytes*/) override { return nullptr; }

  std::unique_ptr<CaptureGraph> NewGraph() override { return nullptr; }
  std::unique_ptr<ConnectionList> Enumerate() override { return nullptr; }
  std::unique_ptr<RegistryKey> OpenMachineKey(std::string_view /*path*/) override { return nullptr; }
  bool CanLoad(std::string_view /*file*/) override { return false; }
  std::unique_ptr<GraphicsLibrary> LoadGraphics(std::string_view /*file*/, GraphicsInterface /*interface*/) override {
    return nullptr;
  }
};

}  // namespace panelglow::platform
