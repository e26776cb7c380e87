#include "platform/posix/OwnedName.h"

#include <sys/socket.h>
#include <sys/un.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <mutex>
#include <string>
#include <system_error>

#include "platform/posix/TellPeople.h"

namespace panelglow::platform::posix {

namespace {

constexpr std::string_view kAddressPrefix = "panelglow-mutex/";
constexpr std::size_t kLongestAddress = sizeof(sockaddr_un::sun_path) - 1;  // less the NUL that makes it abstract

// The same in every process and every build, unlike std::hash (64-bit FNV-1a).
std::uint64_t HashOf(std::string_view text) {
  std::uint64_t hash = 0xCBF29CE484222325;
  for (const char c : text) {
    hash = (hash ^ static_cast<unsigned char>(c)) * 0x100000001B3;
  }
  return hash;
}

// A name that is too long, as one made of a path may be, keeps its end and a hash of the whole.
std::string AddressOf(std::string_view name) {
  std::string address(kAddressPrefix);
  if (address.size() + name.size() > kLongestAddress) {
    std::array<char, 20> hash{};
    std::snprintf(hash.data(), hash.size(), "%016llx~", static_cast<unsigned long long>(HashOf(name)));
    address += hash.data();
    name.remove_prefix(name.size() - (kLongestAddress - address.size()));
  }
  return address.append(name);
}

template <class Call>
bool WithAddress(const std::string& address, Call call) {
  sockaddr_un socketAddress{};
  socketAddress.sun_family = AF_UNIX;
  std::copy(address.begin(), address.end(), socketAddress.sun_path + 1);
  const std::size_t length = offsetof(sockaddr_un, sun_path) + 1 + address.size();
  return call(reinterpret_cast<const sockaddr*>(&socketAddress), static_cast<socklen_t>(length)) == 0;
}

Descriptor MakeSocket() { return Descriptor(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0)); }

}  // namespace

OwnedName::OwnedName(std::string_view name) : address_(AddressOf(name)) {}

// Being short of descriptors passes; having no local sockets does not.
bool OwnedName::IsAvailable() {
  if (MakeSocket() || errno == EMFILE || errno == ENFILE || errno == ENOMEM || errno == ENOBUFS) {
    return true;
  }
  static std::once_flag told;
  std::call_once(told, [error = errno] {
    TellPeople("Other runs on this machine cannot be kept waiting, as there are no local sockets: " +
               std::generic_category().message(error) + ". Run one at a time.");
  });
  return false;
}

Descriptor OwnedName::TryToOwn() const {
  Descriptor socket = MakeSocket();
  const bool owned = socket && WithAddress(address_, [&](const sockaddr* bound, socklen_t length) {
                       return ::bind(socket.Get(), bound, length);
                     });
  if (!owned) {
    return {};
  }
  ::listen(socket.Get(), SOMAXCONN);
  return socket;
}

// Nobody accepts the connection; it hangs up with the owner's socket.
Descriptor OwnedName::WatchOwner() const {
  Descriptor socket = MakeSocket();
  const bool connected = socket && WithAddress(address_, [&](const sockaddr* owner, socklen_t length) {
                           return ::connect(socket.Get(), owner, length);
                         });
  return connected ? std::move(socket) : Descriptor();
}

}  // namespace panelglow::platform::posix
