// The machine's threads: those of the scheduler.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <utility>

#include "platform/Threads.h"
#include "platform/sim/base/Scheduler.h"

namespace panelglow::platform::sim {

class SimThreads : public Threads {
 public:
  explicit SimThreads(Scheduler& scheduler) : scheduler_(scheduler) {}
  ThreadHandle Start(const std::string& name, std::function<void()> body) override {
    if (refused_ != 0) {
      --refused_;
      return 0;
    }
    const ThreadHandle thread = scheduler_.Start(name, std::move(body));
    scheduler_.Spend(10);
    return thread;
  }
  bool Wait(ThreadHandle thread, std::uint32_t limit_ms) override {
    if (limit_ms == kNoLimit) {
      return scheduler_.WaitForEnd(thread, std::nullopt);
    }
    return scheduler_.WaitForEnd(thread, scheduler_.Now() + Microseconds{limit_ms} * 1000);
  }
  void Close(ThreadHandle /*thread*/) override {}
  void Terminate(ThreadHandle thread) override { scheduler_.Terminate(thread); }

  void RefuseNext(unsigned count) { refused_ = count; }

 private:
  Scheduler& scheduler_;
  unsigned refused_ = 0;
};

}  // namespace panelglow::platform::sim
