// Named mutexes over the abstract addresses of local sockets.
//
// Owning a mutex is having a socket bound to the address that the name makes. Binding is atomic and exclusive among
// all processes of the machine, whoever runs them; the kernel frees the address with the last descriptor, so a killed
// owner leaves nothing behind; and a waiter that connects to the owner's socket is told the moment it closes. There
// is no file: no folder that all users have to be able to write, nothing that a cleaner of temporary files may take
// away from under its owner, no write to a disk.
#pragma once

#include <cstdint>
#include <map>
#include <mutex>

#include "platform/NamedMutexes.h"
#include "platform/posix/Descriptor.h"
#include "platform/posix/OwnedName.h"

namespace panelglow::platform::host_linux {

/// Has to outlive every thread that ever owned a mutex of it.
class LinuxMutexes : public NamedMutexes {
 public:
  MutexHandle Create(std::string_view name) override;
  void WaitFor(MutexHandle mutex) override;
  bool Release(MutexHandle mutex) override;

 private:
  struct Mutex {
    posix::OwnedName name;
    std::uint64_t owner = 0;  // CurrentThread::Id()
    unsigned count = 0;
    posix::Descriptor socket = {};  // open while owned
  };

  void Abandon(std::uint64_t thread);

  std::mutex guard_;
  std::map<MutexHandle, Mutex> mutexes_;  // entries are never removed
};

}  // namespace panelglow::platform::host_linux
