#include "platform/host_linux/RouteSocket.h"

#include <linux/if_addr.h>
#include <linux/neighbour.h>
#include <linux/netlink.h>
#include <linux/rtnetlink.h>
#include <net/if.h>
#include <sys/socket.h>
#include <sys/time.h>

#include <array>
#include <cerrno>
#include <cstring>

namespace panelglow::platform::host_linux {

namespace {

constexpr std::size_t kLargestAnswer = std::size_t{1} << 16U;
constexpr int kPatience_s = 5;
constexpr std::size_t kLengthAlignment = 4;

std::size_t Aligned(std::size_t length) { return (length + kLengthAlignment - 1) & ~(kLengthAlignment - 1); }

template <class Body>
RouteSocket::Message MessageOf(std::uint16_t type, std::uint16_t flags, const Body& body) {
  RouteSocket::Message message(sizeof(nlmsghdr) + sizeof body);
  nlmsghdr header{};
  header.nlmsg_len = static_cast<std::uint32_t>(message.size());
  header.nlmsg_type = type;
  header.nlmsg_flags = flags;
  std::memcpy(message.data(), &header, sizeof header);
  std::memcpy(message.data() + sizeof header, &body, sizeof body);
  return message;
}

template <class Body>
std::optional<Body> BodyOf(std::span<const std::byte> message) {
  if (message.size() < sizeof(nlmsghdr) + sizeof(Body)) {
    return std::nullopt;
  }
  Body body{};
  std::memcpy(&body, message.data() + sizeof(nlmsghdr), sizeof body);
  return body;
}

nlmsghdr HeaderOf(std::span<const std::byte> message) {
  nlmsghdr header{};
  std::memcpy(&header, message.data(), sizeof header);
  return header;
}

// A 32-bit attribute of a message whose fixed part has `fixed` bytes.
std::optional<std::uint32_t> NumberAttribute(std::span<const std::byte> message, std::size_t fixed,
                                             std::uint16_t type) {
  std::size_t at = Aligned(sizeof(nlmsghdr) + fixed);
  while (at + sizeof(rtattr) <= message.size()) {
    rtattr attribute{};
    std::memcpy(&attribute, message.data() + at, sizeof attribute);
    if (attribute.rta_len < sizeof attribute || at + attribute.rta_len > message.size()) {
      break;
    }
    if (attribute.rta_type == type && attribute.rta_len >= sizeof attribute + sizeof(std::uint32_t)) {
      std::uint32_t value = 0;
      std::memcpy(&value, message.data() + at + sizeof attribute, sizeof value);
      return value;
    }
    at += Aligned(attribute.rta_len);
  }
  return std::nullopt;
}

bool IsAddressToKeep(std::span<const std::byte> message, unsigned interfaceIndex) {
  const auto body = BodyOf<ifaddrmsg>(message);
  return body && body->ifa_index == interfaceIndex;
}

bool IsNeighbourToKeep(std::span<const std::byte> message, unsigned interfaceIndex) {
  const auto body = BodyOf<ndmsg>(message);
  return body && body->ndm_ifindex == static_cast<int>(interfaceIndex) && (body->ndm_state & NUD_PERMANENT) != 0;
}

bool IsRouteToKeep(std::span<const std::byte> message, unsigned interfaceIndex) {
  const auto body = BodyOf<rtmsg>(message);
  return body && body->rtm_protocol != RTPROT_KERNEL && (body->rtm_flags & RTM_F_CLONED) == 0 &&
         NumberAttribute(message, sizeof(rtmsg), RTA_OIF) == interfaceIndex;
}

// A route is told with the state of its link, and with that it would be refused.
void ForgetState(std::span<std::byte> message) {
  auto body = BodyOf<rtmsg>(message);
  if (body) {
    body->rtm_flags &= RTNH_F_ONLINK;
    std::memcpy(message.data() + sizeof(nlmsghdr), &*body, sizeof *body);
  }
}

}  // namespace

RouteSocket::RouteSocket() : socket_(::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC, NETLINK_ROUTE)) {
  const timeval patience{kPatience_s, 0};
  if (socket_) {
    ::setsockopt(socket_.Get(), SOL_SOCKET, SO_RCVTIMEO, &patience, sizeof patience);
  }
}

int RouteSocket::Ask(Message& message) {
  nlmsghdr header = HeaderOf(message);
  header.nlmsg_seq = ++sequence_;
  header.nlmsg_pid = 0;
  std::memcpy(message.data(), &header, sizeof header);
  if (::send(socket_.Get(), message.data(), message.size(), 0) != static_cast<ssize_t>(message.size())) {
    return errno;
  }
  if ((header.nlmsg_flags & NLM_F_ACK) == 0) {
    return 0;
  }
  std::array<std::byte, kLargestAnswer> answer{};
  for (;;) {
    const ssize_t count = ::recv(socket_.Get(), answer.data(), answer.size(), 0);
    if (count < 0 && errno == EINTR) {
      continue;
    }
    if (count < 0) {
      return errno;
    }
    const std::span<const std::byte> received(answer.data(), static_cast<std::size_t>(count));
    const auto error = BodyOf<nlmsgerr>(received);
    if (error && HeaderOf(received).nlmsg_seq == sequence_ && HeaderOf(received).nlmsg_type == NLMSG_ERROR) {
      return -error->error;
    }
  }
}

int RouteSocket::SetUp(unsigned interfaceIndex, bool isUp) {
  ifinfomsg body{};
  body.ifi_family = AF_UNSPEC;
  body.ifi_index = static_cast<int>(interfaceIndex);
  body.ifi_flags = isUp ? IFF_UP : 0;
  body.ifi_change = IFF_UP;
  Message message = MessageOf(RTM_NEWLINK, NLM_F_REQUEST | NLM_F_ACK, body);
  return Ask(message);
}

std::optional<std::vector<RouteSocket::Message>> RouteSocket::Dump(std::uint16_t type, std::uint8_t family) {
  rtgenmsg body{};
  body.rtgen_family = family;
  Message request = MessageOf(type, NLM_F_REQUEST | NLM_F_DUMP, body);
  std::vector<Message> messages;
  if (Ask(request) != 0) {
    return std::nullopt;
  }
  std::vector<std::byte> answer(kLargestAnswer);
  for (;;) {
    const ssize_t count = ::recv(socket_.Get(), answer.data(), answer.size(), 0);
    if (count < 0 && errno == EINTR) {
      continue;
    }
    if (count <= 0) {
      return std::nullopt;
    }
    std::span<const std::byte> rest(answer.data(), static_cast<std::size_t>(count));
    while (rest.size() >= sizeof(nlmsghdr)) {
      const nlmsghdr header = HeaderOf(rest);
      if (header.nlmsg_len < sizeof header || header.nlmsg_len > rest.size()) {
        break;
      }
      const bool isAnswer = header.nlmsg_seq == sequence_;  // and no late one to a question that was given up
      if (isAnswer && (header.nlmsg_type == NLMSG_DONE || header.nlmsg_type == NLMSG_ERROR)) {
        return messages;
      }
      if (isAnswer) {
        messages.emplace_back(rest.begin(), rest.begin() + header.nlmsg_len);
      }
      rest = rest.subspan(std::min(Aligned(header.nlmsg_len), rest.size()));
    }
  }
}

std::optional<std::vector<RouteSocket::Message>> RouteSocket::WhatGoesWithTheLink(unsigned interfaceIndex) {
  struct Table {
    std::uint16_t request;
    std::uint8_t family;
    bool (*isToKeep)(std::span<const std::byte> message, unsigned interfaceIndex);
  };
  constexpr std::array<Table, 5> kTables{{{RTM_GETADDR, AF_INET6, IsAddressToKeep},
                                          {RTM_GETNEIGH, AF_INET, IsNeighbourToKeep},
                                          {RTM_GETNEIGH, AF_INET6, IsNeighbourToKeep},
                                          {RTM_GETROUTE, AF_INET, IsRouteToKeep},
                                          {RTM_GETROUTE, AF_INET6, IsRouteToKeep}}};
  std::vector<Message> kept;
  for (const Table& table : kTables) {
    auto messages = Dump(table.request, table.family);
    if (!messages) {
      return std::nullopt;
    }
    for (Message& message : *messages) {
      if (table.isToKeep(message, interfaceIndex)) {
        if (table.request == RTM_GETROUTE) {
          ForgetState(message);
        }
        kept.push_back(std::move(message));
      }
    }
  }
  for (Message& message : kept) {
    nlmsghdr header = HeaderOf(message);
    header.nlmsg_flags = NLM_F_REQUEST | NLM_F_ACK | NLM_F_CREATE;
    std::memcpy(message.data(), &header, sizeof header);
  }
  return kept;
}

// A route by way of a neighbour can only be set when there is one to that neighbour, which may stand behind it.
std::vector<RouteSocket::Message> RouteSocket::Restore(std::vector<Message> messages) {
  for (std::size_t before = messages.size() + 1; !messages.empty() && messages.size() < before;) {
    before = messages.size();
    std::erase_if(messages, [&](Message& message) {
      const int error = Ask(message);
      return error == 0 || error == EEXIST;  // somebody who looks after the network was faster
    });
  }
  return messages;
}

}  // namespace panelglow::platform::host_linux
