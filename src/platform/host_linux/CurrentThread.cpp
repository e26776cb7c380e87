#include "platform/host_linux/CurrentThread.h"

#include <poll.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <ctime>
#include <exception>
#include <mutex>
#include <utility>
#include <vector>

#include "platform/Threads.h"

namespace panelglow::platform::host_linux {

namespace {

std::atomic<std::uint64_t> g_lastId{0};

struct BlockAction {
  std::atomic<bool> isSet{false};
  std::mutex guard;
  std::function<void()> action;
};

BlockAction& TheBlockAction() {
  static BlockAction* const kept = new BlockAction;  // threads may outlive the program's static objects
  return *kept;
}

void RunBlockAction() {
  BlockAction& pending = TheBlockAction();
  if (!pending.isSet) {
    return;
  }
  std::function<void()> action;
  {
    const std::lock_guard<std::mutex> lock(pending.guard);
    action = std::exchange(pending.action, nullptr);
    pending.isSet = false;
  }
  if (action) {
    action();
  }
}

std::timespec TimeUntil(CurrentThread::Deadline deadline) {
  constexpr std::int64_t kSecond_ns = 1'000'000'000;
  const std::chrono::nanoseconds left = deadline - std::chrono::steady_clock::now();
  const std::int64_t left_ns = std::max<std::int64_t>(left.count(), 0);
  return {static_cast<std::time_t>(left_ns / kSecond_ns), static_cast<long>(left_ns % kSecond_ns)};
}

}  // namespace

struct CurrentThread::State {
  ~State() { RunEndActions(); }

  void RunEndActions() {
    while (!endActions.empty()) {
      const std::function<void()> action = std::move(endActions.back().second);
      endActions.pop_back();
      action();
    }
  }

  std::uint64_t id = ++g_lastId;
  ThreadControl* control = nullptr;  // null for a thread that nothing interrupts, or nothing any more
  std::vector<std::pair<const void*, std::function<void()>>> endActions;
};

CurrentThread::State& CurrentThread::Self() {
  static thread_local State state;
  return state;
}

std::uint64_t CurrentThread::Id() { return Self().id; }

void CurrentThread::Adopt(ThreadControl& control) { Self().control = &control; }

void CurrentThread::Finish() {
  Self().control = nullptr;
  Self().RunEndActions();
}

void CurrentThread::CheckEndRequest() {
  State& self = Self();
  if (self.control != nullptr && self.control->IsEndRequested() && std::uncaught_exceptions() == 0) {
    self.control = nullptr;
    throw ThreadTerminated{};
  }
}

bool CurrentThread::Await(int fd, std::optional<Deadline> deadline) {
  RunBlockAction();
  for (;;) {
    CheckEndRequest();
    // A request that has to wait for the end of an unwinding must not end this call.
    const ThreadControl* control = std::uncaught_exceptions() == 0 ? Self().control : nullptr;
    const int request = control == nullptr ? -1 : control->EndRequestDescriptor();
    std::array<pollfd, 2> watched{{{fd, POLLIN, 0}, {request, POLLIN, 0}}};
    const std::timespec limit = deadline ? TimeUntil(*deadline) : std::timespec{};
    ::ppoll(watched.data(), watched.size(), deadline ? &limit : nullptr, nullptr);
    if (watched[0].revents != 0) {
      return true;
    }
    if (deadline && std::chrono::steady_clock::now() >= *deadline) {
      return false;
    }
  }
}

void CurrentThread::SleepFor(std::chrono::milliseconds duration) {
  Await(-1, std::chrono::steady_clock::now() + duration);
}

void CurrentThread::AtEnd(const void* key, std::function<void()> action) {
  auto& actions = Self().endActions;
  if (std::none_of(actions.begin(), actions.end(), [&](const auto& entry) { return entry.first == key; })) {
    actions.emplace_back(key, std::move(action));
  }
}

void CurrentThread::BeforeNextBlock(std::function<void()> action) {
  BlockAction& pending = TheBlockAction();
  const std::lock_guard<std::mutex> lock(pending.guard);
  pending.action = std::move(action);
  pending.isSet = true;
}

}  // namespace panelglow::platform::host_linux
