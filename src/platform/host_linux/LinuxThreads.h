// Threads of the system. They are never joined: a handle that nobody closes costs nothing once its thread has ended.
#pragma once

#include <map>
#include <memory>
#include <mutex>

#include "platform/Threads.h"
#include "platform/host_linux/ThreadControl.h"

namespace panelglow::platform::host_linux {

/// Has to outlive every thread that it started.
class LinuxThreads : public Threads {
 public:
  ThreadHandle Start(const std::string& name, std::function<void()> body) override;
  bool Wait(ThreadHandle thread, std::uint32_t limit_ms) override;
  void Close(ThreadHandle thread) override { Forget(thread); }
  void Terminate(ThreadHandle thread) override;

 private:
  using Control = std::shared_ptr<ThreadControl>;

  /// Null for a handle that was closed, or whose thread has ended.
  Control Find(ThreadHandle thread);
  void Forget(ThreadHandle thread);
  void RunThread(ThreadHandle thread, const std::string& name, ThreadControl& control, std::function<void()> body);

  std::mutex guard_;
  std::map<ThreadHandle, Control> running_;
  ThreadHandle last_ = 0;
};

}  // namespace panelglow::platform::host_linux
