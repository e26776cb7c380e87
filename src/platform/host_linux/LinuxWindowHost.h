// The window logic's lock, and how its threads wait: one lock around all of it, given up while a thread waits for a
// message or runs a window's own code.
#pragma once

#include <condition_variable>
#include <cstdint>
#include <functional>
#include <list>
#include <mutex>
#include <string>

#include "platform/desktop/WindowHost.h"

namespace panelglow::platform::host_linux {

class LinuxWindowHost : public desktop::WindowHost {
 public:
  /// Holds the lock for its life; on one thread these may nest.
  class Guard {
   public:
    explicit Guard(LinuxWindowHost& host) : host_(host) { host_.Enter(); }
    ~Guard() { host_.Leave(); }
    Guard(const Guard&) = delete;
    Guard& operator=(const Guard&) = delete;

   private:
    LinuxWindowHost& host_;
  };

  std::uint32_t CurrentThread() override;
  std::uint64_t Now_ms() override;
  void Block(const void* key, const std::string& what, std::optional<std::uint64_t> deadline_ms) override;
  void Wake(const void* key) override;
  void Spend() override;
  void RunProcedure(const std::function<void()>& procedure) override;
  void RunInside(const std::function<void()>& action) override;

 private:
  struct Waiter {
    const void* key = nullptr;
    int event = -1;  // becomes readable when the waiter is woken
  };

  /// Gives the lock up, however deep it is held, and takes it again as deep at the end of its life.
  class Outside;

  void Enter();
  void Leave();

  std::mutex guard_;  // of the two members below
  std::condition_variable free_;
  std::uint64_t owner_ = 0;  // thread that holds the lock
  unsigned depth_ = 0;

  std::list<Waiter> waiters_;  // under the lock
};

}  // namespace panelglow::platform::host_linux
