// The two signals between a started thread and those who hold its handle: "end" and "has ended". Both are descriptors
// beside their flags, so that one poll waits for them together with whatever else a thread waits for.
#pragma once

#include <atomic>

#include "platform/posix/Descriptor.h"

namespace panelglow::platform::host_linux {

class ThreadControl {
 public:
  /// False when the process is out of descriptors.
  [[nodiscard]] bool IsUsable() const { return endRequest_ && end_; }

  void RequestEnd();
  [[nodiscard]] bool IsEndRequested() const { return endRequested_; }

  /// To be called by the thread itself as its last act.
  void MarkEnded();
  [[nodiscard]] bool HasEnded() const { return ended_; }

  /// Become readable, and stay so, with the signal.
  [[nodiscard]] int EndRequestDescriptor() const { return endRequest_.Get(); }
  [[nodiscard]] int EndDescriptor() const { return end_.Get(); }

 private:
  static posix::Descriptor MakeEvent();

  std::atomic<bool> endRequested_{false};
  std::atomic<bool> ended_{false};
  posix::Descriptor endRequest_ = MakeEvent();
  posix::Descriptor end_ = MakeEvent();
};

}  // namespace panelglow::platform::host_linux
