// Machines one after the other in one process, with stand-ins for some of their services.
#pragma once

#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Host.h"
#include "platform/sim/Simulation.h"

namespace panelglow::storagetest {

/// What takes the place of a service of the machine; null: nothing.
struct StandIns {
  platform::DeviceTree* tree = nullptr;
  platform::Management* management = nullptr;
  platform::ProfileFiles* profiles = nullptr;
};

/// A simulated machine with its files in memory, and nothing known of the one before. While it exists it is
/// TheHost().
class Machine {
 public:
  explicit Machine(std::string_view description = {}, const std::string& msctrl = {});
  ~Machine();
  Machine(const Machine&) = delete;
  Machine& operator=(const Machine&) = delete;

  void Use(const StandIns& standIns);
  void Put(const char* path, const std::string& content) { sim.DiskFiles().Put(path, content); }
  [[nodiscard]] std::string ContentOf(const char* path) { return sim.TheMachine().files.Read(path).value_or("none"); }

  platform::sim::Simulation sim;

 private:
  std::unique_ptr<platform::Host> host_;  // with stand-ins
};

/// A device tree of any shape, which notes what its lists are asked for.
class Tree : public platform::DeviceTree {
 public:
  using Node = platform::DeviceNode;
  struct Device {
    std::string id = {};
    Node child = 0;
    Node sibling = 0;
    Node parent = 0;
    std::string diskPath = {};  // empty: it is no disk
    std::map<std::uint32_t, platform::DeviceProperty> properties = {};
  };

  /// Appends a device, as the last child of `parent`.
  Node Add(Node parent, Device device);
  Device& At(Node node) { return devices[node - 1]; }

  Node Locate(std::string_view id) override;
  Node Child(Node node) override { return node == 0 ? 0 : At(node).child; }
  Node Sibling(Node node) override { return node == 0 ? 0 : At(node).sibling; }
  Node Parent(Node node) override { return node == 0 ? 0 : At(node).parent; }
  std::optional<std::string> InstanceId(Node node) override;
  std::optional<platform::DeviceProperty> NodeProperty(Node node, std::uint32_t property) override;
  std::unique_ptr<platform::DeviceList> Open(std::string_view enumerator, std::uint32_t flags,
                                             std::string_view interfaceClass) override;

  std::vector<Device> devices;
  std::vector<std::string> calls;
  bool refuses = false;  // every list

 private:
  class List;
  std::map<Node, Node> lastChild_;
  std::map<std::string, Node, std::less<>> byId_;
};

/// A property of texts, each ended by NUL.
platform::DeviceProperty TextProperty(const std::string& text);

}  // namespace panelglow::storagetest
