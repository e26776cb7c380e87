#include "platform/sim/SimMutexes.h"

#include <poll.h>

#include <algorithm>

#include "platform/posix/OwnedName.h"

namespace panelglow::platform::sim {

namespace {

constexpr std::string_view kFileLockSuffix = "_HalcyonFileParser";
constexpr int kNextLook_ms = 5;

}  // namespace

SimMutexes::SimMutexes(Scheduler& scheduler, const std::vector<Peer>& peers, bool filesAreReal)
    : scheduler_(scheduler), filesAreReal_(filesAreReal) {
  for (const Peer& peer : peers) {
    const MutexHandle handle = SimMutexes::Create(peer.mutex);
    scheduler_.At(peer.from, [this, handle] {
      Mutex& mutex = mutexes_[handle];
      if (mutex.count == 0) {
        mutex.owner = kPeer;
        mutex.count = 1;
      }
    });
    scheduler_.At(peer.until, [this, handle] {
      Mutex& mutex = mutexes_[handle];
      if (mutex.owner == kPeer) {
        mutex.owner = 0;
        mutex.count = 0;
        scheduler_.Wake(&mutex);
      }
    });
  }
}

MutexHandle SimMutexes::Create(std::string_view name) {
  for (const auto& [handle, mutex] : mutexes_) {
    if (mutex.name == name) {
      return handle;
    }
  }
  const auto handle = static_cast<MutexHandle>(mutexes_.size() + 1);
  mutexes_[handle].name = std::string(name);
  return handle;
}

void SimMutexes::WaitFor(MutexHandle handle) {
  scheduler_.Spend(1);
  const auto found = mutexes_.find(handle);
  if (found == mutexes_.end()) {
    return;
  }
  Mutex& mutex = found->second;
  const ThreadId self = scheduler_.Current();
  while (mutex.count != 0 && mutex.owner != self) {
    scheduler_.Block(&mutex, "the mutex \"" + mutex.name + "\"", std::nullopt);
  }
  mutex.owner = self;
  if (++mutex.count == 1 && filesAreReal_ && mutex.name.ends_with(kFileLockSuffix)) {
    OwnAmongProcesses(mutex);
  }
}

// The machine's time stands still meanwhile: it knows nothing of those processes.
void SimMutexes::OwnAmongProcesses(Mutex& mutex) const {
  const posix::OwnedName name(mutex.name);
  while (posix::OwnedName::IsAvailable() && !(mutex.amongProcesses = name.TryToOwn())) {
    const posix::Descriptor owner = name.WatchOwner();
    pollfd watched{owner.Get(), POLLIN, 0};  // a negative descriptor is a mere wait
    ::poll(&watched, 1, owner ? -1 : kNextLook_ms);
  }
}

bool SimMutexes::Release(MutexHandle handle) {
  const auto found = mutexes_.find(handle);
  if (found == mutexes_.end() || found->second.count == 0 || found->second.owner != scheduler_.Current()) {
    return false;
  }
  Mutex& mutex = found->second;
  if (--mutex.count == 0) {
    mutex.owner = 0;
    mutex.amongProcesses.Close();
    scheduler_.Wake(&mutex);
  }
  return true;
}

void SimMutexes::Abandon(ThreadId thread) {
  for (auto& [handle, mutex] : mutexes_) {
    if (mutex.count != 0 && mutex.owner == thread) {
      mutex.owner = 0;
      mutex.count = 0;
      mutex.amongProcesses.Close();
      scheduler_.Wake(&mutex);
    }
  }
}

bool SimMutexes::IsOwned(std::string_view name) const {
  return std::any_of(mutexes_.begin(), mutexes_.end(),
                     [&](const auto& entry) { return entry.second.name == name && entry.second.count != 0; });
}

}  // namespace panelglow::platform::sim
