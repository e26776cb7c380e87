#include "platform/host_linux/LinuxMutexes.h"

#include <chrono>
#include <optional>
#include <utility>

#include "platform/host_linux/CurrentThread.h"

namespace panelglow::platform::host_linux {

namespace {

using posix::Descriptor;
using posix::OwnedName;

// How long to wait before another look when the owner cannot be asked to tell its end: it is between binding and
// listening, it has just gone, or the process is out of descriptors.
constexpr std::chrono::milliseconds kNextLook{5};

// Returns when the present owner may have gone.
void AwaitOwner(const OwnedName& name) {
  if (const Descriptor owner = name.WatchOwner()) {
    CurrentThread::Await(owner.Get(), std::nullopt);
  } else {
    CurrentThread::SleepFor(kNextLook);
  }
}

}  // namespace

MutexHandle LinuxMutexes::Create(std::string_view name) {
  if (!OwnedName::IsAvailable()) {
    return 0;
  }
  const OwnedName owned(name);
  const std::lock_guard<std::mutex> lock(guard_);
  for (const auto& [handle, mutex] : mutexes_) {
    if (mutex.name.Address() == owned.Address()) {
      return handle;
    }
  }
  const auto handle = static_cast<MutexHandle>(mutexes_.size() + 1);
  mutexes_.emplace(handle, Mutex{owned});
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
    if (Descriptor socket = mutex->name.TryToOwn()) {
      const std::lock_guard<std::mutex> lock(guard_);
      mutex->owner = self;
      mutex->count = 1;
      mutex->socket = std::move(socket);
      return;
    }
    AwaitOwner(mutex->name);
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
