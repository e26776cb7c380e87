#include "storage/StandIn.h"

#include "harness/base/Notices.h"
#include "hw/PciDeviceList.h"
#include "hw/WMIDiscovery.h"
#include "storage/MSUtils.h"

namespace panelglow::storagetest {

namespace {

platform::Host* g_host = nullptr;  // of the machine with stand-ins

void ForgetMachine() {
  g_host = nullptr;
  MSUtils::Forget();
  PciDeviceList::Forget();
  WMIDiscovery::Forget();
  Notices::Forget();
}

}  // namespace

Machine::Machine(std::string_view description, const std::string& msctrl) : sim(description) {
  ForgetMachine();
  if (!msctrl.empty()) {
    Put("msctrl.ini", msctrl);
  }
}

Machine::~Machine() { ForgetMachine(); }

void Machine::Use(const StandIns& standIns) {
  platform::Host& own = sim.TheMachine();
  host_ = std::make_unique<platform::Host>(
      platform::Host{.cameras = own.cameras,
                     .clock = own.clock,
                     .connections = own.connections,
                     .console = own.console,
                     .cpu = own.cpu,
                     .desktop = own.desktop,
                     .deviceTree = standIns.tree != nullptr ? *standIns.tree : own.deviceTree,
                     .drivers = own.drivers,
                     .environment = own.environment,
                     .files = own.files,
                     .images = own.images,
                     .keyboard = own.keyboard,
                     .management = standIns.management != nullptr ? *standIns.management : own.management,
                     .modules = own.modules,
                     .mutexes = own.mutexes,
                     .profiles = standIns.profiles != nullptr ? *standIns.profiles : own.profiles,
                     .rawDisks = own.rawDisks,
                     .registry = own.registry,
                     .services = own.services,
                     .threads = own.threads,
                     .touchpad = own.touchpad,
                     .xmlDocuments = own.xmlDocuments});
  g_host = host_.get();
}

// ---- the tree

class Tree::List : public platform::DeviceList {
 public:
  List(Tree& owner, std::vector<Node> nodes) : owner_(owner), nodes_(std::move(nodes)) {}

  std::optional<Node> Device(std::uint32_t index) override {
    return index < nodes_.size() ? std::optional<Node>(nodes_[index]) : std::nullopt;
  }
  std::optional<platform::DeviceInterface> Interface(std::uint32_t index) override {
    return index < nodes_.size()
               ? std::optional<platform::DeviceInterface>({owner_.At(nodes_[index]).diskPath, nodes_[index]})
               : std::nullopt;
  }
  std::optional<platform::DeviceProperty> Property(Node device, std::uint32_t property) override {
    owner_.calls.push_back("property " + std::to_string(property));
    const auto& properties = owner_.At(device).properties;
    const auto found = properties.find(property);
    return found == properties.end() ? std::nullopt : std::optional<platform::DeviceProperty>(found->second);
  }

 private:
  Tree& owner_;
  std::vector<Node> nodes_;
};

Tree::Node Tree::Add(Node parent, Device device) {
  const auto node = static_cast<Node>(devices.size() + 1);
  device.parent = parent;
  byId_.emplace(device.id, node);
  devices.push_back(std::move(device));
  if (parent != 0) {
    (At(parent).child == 0 ? At(parent).child : At(lastChild_[parent]).sibling) = node;
    lastChild_[parent] = node;
  }
  return node;
}

Tree::Node Tree::Locate(std::string_view id) {
  const auto found = byId_.find(id);
  return found == byId_.end() ? 0 : found->second;
}

std::optional<std::string> Tree::InstanceId(Node node) {
  return node == 0 ? std::nullopt : std::optional<std::string>(At(node).id);
}

std::optional<platform::DeviceProperty> Tree::NodeProperty(Node node, std::uint32_t property) {
  calls.push_back("node property " + std::to_string(property));
  if (node == 0) {
    return std::nullopt;
  }
  const auto found = At(node).properties.find(property);
  return found == At(node).properties.end() ? std::nullopt : std::optional<platform::DeviceProperty>(found->second);
}

std::unique_ptr<platform::DeviceList> Tree::Open(std::string_view enumerator, std::uint32_t flags,
                                                 std::string_view interfaceClass) {
  calls.push_back("open " + std::string(enumerator) + " " + std::to_string(flags) + " " +
                  std::string(interfaceClass));
  if (refuses) {
    return nullptr;
  }
  const bool ofInterfaces = (flags & platform::kDeviceInterfaces) != 0;
  std::vector<Node> nodes;
  if (ofInterfaces && !enumerator.empty()) {
    const Node node = Locate(enumerator);
    if (node != 0 && !At(node).diskPath.empty()) {
      nodes.push_back(node);
    }
  } else {
    for (std::size_t i = 0; i < devices.size(); ++i) {
      if (ofInterfaces ? !devices[i].diskPath.empty() : devices[i].id.starts_with(std::string(enumerator) + "\\")) {
        nodes.push_back(static_cast<Node>(i + 1));
      }
    }
  }
  return std::make_unique<List>(*this, std::move(nodes));
}

platform::DeviceProperty TextProperty(const std::string& text) {
  return {platform::kMultipleTextType, {text.begin(), text.end()}};
}

}  // namespace panelglow::storagetest

namespace panelglow::platform {

// In place of the simulation's own.
Host& TheHost() {
  return storagetest::g_host != nullptr ? *storagetest::g_host : sim::CurrentSimulation().TheMachine();
}

}  // namespace panelglow::platform
