// The network adapters that are devices, each taken down and up by the kernel's routing socket.
#pragma once

#include <string>

#include "platform/Connections.h"
#include "platform/posix/TellPeople.h"

namespace panelglow::platform::host_linux {

class LinuxConnections : public Connections {
 public:
  explicit LinuxConnections(std::string netFolder = "/sys/class/net") : folder_(std::move(netFolder)) {}

  /// The adapters by their index. A connection's device name is its interface's and its driver's, with the word
  /// "Wireless" for one with a radio: "eth0 e1000e", "wlan0 iwlwifi Wireless".
  std::unique_ptr<ConnectionList> Enumerate() override;

 private:
  std::string folder_;
  posix::OnceTeller teller_;
};

}  // namespace panelglow::platform::host_linux
