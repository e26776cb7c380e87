// Named mutexes of the real host, between threads and between processes.
#include <gtest/gtest.h>

#include <atomic>
#include <future>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "platform/Host.h"
#include "platform/host_linux/ChildProcess.h"

namespace panelglow::platform {
namespace {

constexpr std::uint32_t kMeet_ms = 5;

NamedMutexes& mutexes() { return TheHost().mutexes; }

// One name a test and process, so that tests that run at the same time do not meet.
std::string Name(const std::string& test) { return "mutexes-test-" + test + "-" + std::to_string(::getpid()); }

/// A thread that waits for the mutex and keeps it until it is told to go on.
class Taker {
 public:
  explicit Taker(MutexHandle mutex)
      : thread_(TheHost().threads.Start("taker", [this, mutex] {
          mutexes().WaitFor(mutex);
          isOwner_ = true;
          taken_.set_value();
          leave_.get_future().wait();
          mutexes().Release(mutex);
        })) {}
  ~Taker() {
    leave_.set_value();
    TheHost().threads.Wait(thread_, Threads::kNoLimit);
  }
  Taker(const Taker&) = delete;
  Taker& operator=(const Taker&) = delete;
  [[nodiscard]] bool IsOwner() const { return isOwner_; }
  void AwaitOwnership() { taken_.get_future().wait(); }

 private:
  std::atomic<bool> isOwner_{false};
  std::promise<void> taken_;
  std::promise<void> leave_;
  ThreadHandle thread_;
};

TEST(MutexesTest, AnOwnerMayTakeItAgainAndGivesItUpAsOften) {
  const MutexHandle mutex = mutexes().Create(Name("recursion"));
  EXPECT_FALSE(mutexes().Release(mutex));
  mutexes().WaitFor(mutex);
  mutexes().WaitFor(mutex);
  EXPECT_TRUE(mutexes().Release(mutex));
  {
    Taker taker(mutex);
    TheHost().clock.Sleep(kMeet_ms);
    EXPECT_FALSE(taker.IsOwner());
    EXPECT_TRUE(mutexes().Release(mutex));
    taker.AwaitOwnership();
    EXPECT_FALSE(mutexes().Release(mutex)) << "another thread's";
  }
  EXPECT_FALSE(mutexes().Release(mutex));
}

TEST(MutexesTest, TheNameMakesTheMutex) {
  const std::string tail(200, 'x');  // longer than what an address holds
  const std::vector<std::string> names{Name("a"), Name("b"), Name("a") + tail, Name("b") + tail, tail, ""};
  std::set<MutexHandle> different;
  for (const std::string& name : names) {
    const MutexHandle mutex = mutexes().Create(name);
    different.insert(mutex);
    EXPECT_EQ(mutexes().Create(name), mutex) << name;
    mutexes().WaitFor(mutex);
  }
  EXPECT_EQ(different.size(), names.size());
  EXPECT_EQ(different.count(0), 0U);
  for (const MutexHandle mutex : different) {
    EXPECT_TRUE(mutexes().Release(mutex));
    EXPECT_FALSE(mutexes().Release(mutex));
  }
  EXPECT_FALSE(mutexes().Release(0));
  mutexes().WaitFor(0);
}

TEST(MutexesTest, OneThreadAtATimeIsInside) {
  const MutexHandle mutex = mutexes().Create(Name("exclusion"));
  int inside = 0;  // guarded by the mutex alone
  int total = 0;
  std::vector<ThreadHandle> threads;
  for (int i = 0; i < 4; ++i) {
    threads.push_back(TheHost().threads.Start("counter", [&] {
      for (int turn = 0; turn < 50; ++turn) {
        mutexes().WaitFor(mutex);
        EXPECT_EQ(++inside, 1);
        ++total;
        --inside;
        mutexes().Release(mutex);
      }
    }));
  }
  for (const ThreadHandle thread : threads) {
    TheHost().threads.Wait(thread, Threads::kNoLimit);
  }
  EXPECT_EQ(total, 200);
}

TEST(MutexesTest, AThreadThatEndsWithoutReleasingFreesIt) {
  const MutexHandle mutex = mutexes().Create(Name("abandoned"));
  const auto take = [mutex] {
    mutexes().WaitFor(mutex);
    mutexes().WaitFor(mutex);
  };
  const auto expectFree = [mutex] {
    mutexes().WaitFor(mutex);
    EXPECT_TRUE(mutexes().Release(mutex));
  };
  TheHost().threads.Wait(TheHost().threads.Start("abandoner", take), Threads::kNoLimit);
  expectFree();
  std::thread(take).join();  // one that the host did not start
  expectFree();
  std::promise<void> taken;
  const ThreadHandle terminated = TheHost().threads.Start("terminated", [&] {
    take();
    taken.set_value();
    TheHost().clock.Sleep(60'000);
  });
  taken.get_future().wait();
  TheHost().threads.Terminate(terminated);
  expectFree();
}

TEST(MutexesTest, AnotherProcessKeepsItUntilItReleasesOrDies) {
  enum class End { kRelease, kExit, kKill };
  for (const End end : {End::kRelease, End::kExit, End::kKill}) {
    const std::string name = Name("process");
    int goOn[2] = {-1, -1};
    ASSERT_EQ(::pipe(goOn), 0);
    ChildProcess child([&](int pipe) {
      const MutexHandle mutex = mutexes().Create(name);
      mutexes().WaitFor(mutex);
      mutexes().WaitFor(mutex);
      mutexes().Release(mutex);
      Tell(pipe, 'o');
      char go = 0;
      if (::read(goOn[0], &go, 1) == 1 && end == End::kRelease) {
        mutexes().Release(mutex);
        ::pause();  // until it is killed
      }
      return end == End::kKill ? ::raise(SIGKILL) : 3;
    });
    ASSERT_EQ(child.Read(1), "o");
    Taker taker(mutexes().Create(name));
    TheHost().clock.Sleep(kMeet_ms);
    EXPECT_FALSE(taker.IsOwner()) << static_cast<int>(end);
    Tell(goOn[1], 'g');
    taker.AwaitOwnership();
    if (end == End::kRelease) {
      child.Signal(SIGKILL);
    }
    EXPECT_EQ(child.Wait(), end == End::kExit ? 3 : -SIGKILL) << static_cast<int>(end);
    ::close(goOn[0]);
    ::close(goOn[1]);
  }
}

}  // namespace
}  // namespace panelglow::platform
