// The kernel's routing socket (rtnetlink), as far as taking an adapter down and up needs it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

#include "platform/posix/Descriptor.h"

namespace panelglow::platform::host_linux {

class RouteSocket {
 public:
  /// A message as it is on the wire, header included.
  using Message = std::vector<std::byte>;

  RouteSocket();

  /// Switches an adapter on or off. 0, or the kernel's error number.
  int SetUp(unsigned interfaceIndex, bool isUp);

  /// What the kernel forgets when the adapter goes down: its routes but those that the kernel makes itself, its IPv6
  /// addresses, and neighbours that somebody entered. Ready to be sent; nothing when the kernel does not tell.
  std::optional<std::vector<Message>> WhatGoesWithTheLink(unsigned interfaceIndex);

  /// Sends messages of that list again, addresses before routes; what is there already stays. What the kernel does
  /// not take comes back.
  std::vector<Message> Restore(std::vector<Message> messages);

 private:
  int Ask(Message& message);
  std::optional<std::vector<Message>> Dump(std::uint16_t type, std::uint8_t family);

  posix::Descriptor socket_;
  std::uint32_t sequence_ = 0;
};

}  // namespace panelglow::platform::host_linux
