#include "platform/host_linux/DeviceEvents.h"

#include <linux/netlink.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <string_view>

#include "platform/Desktop.h"

namespace panelglow::platform::host_linux {

namespace {

constexpr unsigned kKernelGroup = 1;
constexpr std::size_t kLongestEvent = 8192;

}  // namespace

DeviceEvents::DeviceEvents()
    : socket_(::socket(AF_NETLINK, SOCK_DGRAM | SOCK_CLOEXEC | SOCK_NONBLOCK, NETLINK_KOBJECT_UEVENT)) {
  sockaddr_nl address{};
  address.nl_family = AF_NETLINK;
  address.nl_groups = kKernelGroup;
  if (socket_ >= 0 && ::bind(socket_, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) {
    ::close(socket_);
    socket_ = -1;
  }
}

DeviceEvents::~DeviceEvents() {
  if (socket_ >= 0) {
    ::close(socket_);
  }
}

std::vector<std::uint32_t> DeviceEvents::Take() {
  std::vector<std::uint32_t> events;
  std::array<char, kLongestEvent> bytes{};
  for (;;) {
    const ssize_t length = socket_ < 0 ? -1 : ::recv(socket_, bytes.data(), bytes.size(), 0);
    if (length <= 0) {
      return events;
    }
    // "add@/devices/...", then the event's variables.
    const std::string_view text(bytes.data(), static_cast<std::size_t>(length));
    if (text.starts_with("add@")) {
      events.insert(events.end(), {device_event::kNodesChanged, device_event::kArrival});
    } else if (text.starts_with("remove@")) {
      events.insert(events.end(), {device_event::kNodesChanged, device_event::kRemoveComplete});
    }
  }
}

}  // namespace panelglow::platform::host_linux
