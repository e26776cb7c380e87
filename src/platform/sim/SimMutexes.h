// Named mutexes of a simulated machine, with its other processes as peers that hold them for a while.
#pragma once

#include <map>
#include <string>
#include <vector>

#include "platform/NamedMutexes.h"
#include "platform/posix/Descriptor.h"
#include "platform/sim/MachineDescription.h"
#include "platform/sim/base/Scheduler.h"

namespace panelglow::platform::sim {

class SimMutexes : public NamedMutexes {
 public:
  /// `filesAreReal`: the locks of files, which the real processes of this computer share, hold among those processes
  /// too. The others guard what this machine alone has: its hardware and its screen.
  SimMutexes(Scheduler& scheduler, const std::vector<Peer>& peers, bool filesAreReal);

  MutexHandle Create(std::string_view name) override;
  void WaitFor(MutexHandle mutex) override;
  bool Release(MutexHandle mutex) override;

  /// What a thread still owned when it ended is free again.
  void Abandon(ThreadId thread);

  /// True while any thread or peer owns the mutex.
  [[nodiscard]] bool IsOwned(std::string_view name) const;

 private:
  static constexpr ThreadId kPeer = 0xFFFFFFFF;

  struct Mutex {
    std::string name;
    ThreadId owner = 0;
    unsigned count = 0;
    posix::Descriptor amongProcesses = {};  // open while owned, of a real file's lock
  };

  void OwnAmongProcesses(Mutex& mutex) const;

  Scheduler& scheduler_;
  bool filesAreReal_;
  std::map<MutexHandle, Mutex> mutexes_;
};

}  // namespace panelglow::platform::sim
