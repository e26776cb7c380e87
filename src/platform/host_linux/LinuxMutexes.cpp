#include "platform/host_linux/LinuxMutexes.h"

#include <sys/socket.h>
#include <sys/un.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <chrono>
#include <cstddef>
#include <cstdio>
#include <cstring>
#include <optional>
#include <utility>

#include "platform/host_linux/CurrentThread.h"

namespace panelglow::platform::host_linux {

namespace {

using posix::Descriptor;

constexpr std::string_view kAddressPrefix = "panelglow-mutex/";
constexpr std::size_t kLongestAddress = sizeof(sockaddr_un::sun_path) - 1;  // less the NUL that makes it abstract

// How long to wait before another look when the owner cannot be asked to tell its end: it is between binding and
// listening, it has just gone, or the process is out of descriptors.
constexpr std::chrono::milliseconds kNextLook{5};

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

// False, with a line for people, on a system that gives no local sockets at all; being short of descriptors passes.
bool CanMakeSockets() {
  if (MakeSocket() || errno == EMFILE || errno == ENFILE || errno == ENOMEM || errno == ENOBUFS) {
    return true;
  }
  std::fprintf(stderr, "locks between processes are not available: %s\n", std::strerror(errno));
  return false;
}

// The owner's socket, or none while somebody else owns the address.
Descriptor TryToOwn(const std::string& address) {
  Descriptor socket = MakeSocket();
  const bool owned = socket && WithAddress(address, [&](const sockaddr* bound, socklen_t length) {
                       return ::bind(socket.Get(), bound, length);
                     });
  if (!owned) {
    return {};
  }
  ::listen(socket.Get(), SOMAXCONN);
  return socket;
}

// Returns when the present owner may have gone. Nobody accepts the connection; it hangs up with the owner's socket.
void AwaitOwner(const std::string& address) {
  const Descriptor socket = MakeSocket();
  const bool connected = socket && WithAddress(address, [&](const sockaddr* owner, socklen_t length) {
                           return ::connect(socket.Get(), owner, length);
                         });
  if (connected) {
    CurrentThread::Await(socket.Get(), std::nullopt);
  } else {
    CurrentThread::SleepFor(kNextLook);
  }
}

}  // namespace

MutexHandle LinuxMutexes::Create(std::string_view name) {
  if (!CanMakeSockets()) {
    return 0;
  }
  const std::string address = AddressOf(name);
  const std::lock_guard<std::mutex> lock(guard_);
  for (const auto& [handle, mutex] : mutexes_) {
    if (mutex.address == address) {
      return handle;
    }
  }
  const auto handle = static_cast<MutexHandle>(mutexes_.size() + 1);
  mutexes_[handle].address = address;
  return handle;
}

void LinuxMutexes::WaitFor(MutexHandle handle) {
  CurrentThread::CheckEndRequest();
  const std::uint64_t self = CurrentThread::Id();
  Mutex* mutex = nullptr;
  {
    const std::lock_guard<std::mutex> lock(guard_);
    const auto found = mutexes_.find(handle);
    if (found == mutexes_.end()) {
      return;
    }
    mutex = &found->second;
    if (mutex->owner == self) {
      ++mutex->count;
      return;
    }
  }
  CurrentThread::AtEnd(this, [this, self] { Abandon(self); });
  for (;;) {
    if (Descriptor socket = TryToOwn(mutex->address)) {
      const std::lock_guard<std::mutex> lock(guard_);
      mutex->owner = self;
      mutex->count = 1;
      mutex->socket = std::move(socket);
      return;
    }
    AwaitOwner(mutex->address);
  }
}

bool LinuxMutexes::Release(MutexHandle handle) {
  const std::lock_guard<std::mutex> lock(guard_);
  const auto found = mutexes_.find(handle);
  if (found == mutexes_.end() || found->second.owner != CurrentThread::Id()) {
    return false;
  }
  Mutex& mutex = found->second;
  if (--mutex.count == 0) {
    mutex.owner = 0;
    mutex.socket.Close();
  }
  return true;
}

void LinuxMutexes::Abandon(std::uint64_t thread) {
  const std::lock_guard<std::mutex> lock(guard_);
  for (auto& [handle, mutex] : mutexes_) {
    if (mutex.owner == thread) {
      mutex.owner = 0;
      mutex.count = 0;
      mutex.socket.Close();
    }
  }
}

}  // namespace panelglow::platform::host_linux
