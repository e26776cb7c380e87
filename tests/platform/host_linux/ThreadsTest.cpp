// Threads of the real host: how they are waited for, and how they are ended from outside.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/file.h>
#include <unistd.h>

#include <atomic>
#include <filesystem>
#include <functional>
#include <future>
#include <memory>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "platform/Host.h"
#include "platform/posix/Descriptor.h"

namespace panelglow::platform {
namespace {

constexpr std::uint32_t kLong_ms = 60'000;
constexpr std::uint32_t kMeet_ms = 5;  // lets a thread that was just released reach its blocking call

Host& host() { return TheHost(); }

// One name a process, so that two runs of the tests do not meet.
std::string Name(const std::string& what) { return "threads-test-" + what + "-" + std::to_string(::getpid()); }

/// Does what a restore does: platform calls that block, in a destructor.
class Restore {
 public:
  explicit Restore(std::atomic<bool>& done) : done_(done) {}
  ~Restore() {
    host().clock.Sleep(1);
    const MutexHandle mutex = host().mutexes.Create(Name("restore"));
    host().mutexes.WaitFor(mutex);
    host().mutexes.Release(mutex);
    done_ = host().threads.Wait(host().threads.Start("restorer", [] {}), kLong_ms);
  }
  Restore(const Restore&) = delete;
  Restore& operator=(const Restore&) = delete;

 private:
  std::atomic<bool>& done_;
};

TEST(ThreadsTest, TerminateEndsAThreadInEveryBlockingCall) {
  const MutexHandle owned = host().mutexes.Create(Name("owned"));
  host().mutexes.WaitFor(owned);
  std::promise<void> release;
  const ThreadHandle waiting = host().threads.Start("other", [&] { release.get_future().wait(); });
  const std::string path = testing::TempDir() + "/" + Name("locked");
  const posix::Descriptor locked(::open(path.c_str(), O_RDWR | O_CREAT, 0600));
  ASSERT_EQ(::flock(locked.Get(), LOCK_EX), 0);

  struct Case {
    const char* name;
    std::function<void()> block;
  };
  const std::vector<Case> cases{
      {"sleep", [] { host().clock.Sleep(kLong_ms); }},
      {"mutex", [&] { host().mutexes.WaitFor(owned); }},
      {"thread without limit", [&] { host().threads.Wait(waiting, Threads::kNoLimit); }},
      {"thread with a limit", [&] { host().threads.Wait(waiting, kLong_ms); }},
      {"terminate", [&] { host().threads.Terminate(waiting); }},
      {"locked file", [&] { host().files.ReadLocked(path); }},
      {"clock loop",
       [] {
         while (true) {
           host().clock.TickCount();
         }
       }},
      {"file loop",
       [] {
         while (true) {
           host().files.CanRead("missing");
         }
       }},
  };
  for (const Case& one : cases) {
    std::promise<void> begun;
    std::atomic<bool> restored{false};
    std::atomic<bool> wentOn{false};
    const ThreadHandle thread = host().threads.Start(one.name, [&] {
      const Restore restore(restored);
      begun.set_value();
      one.block();
      wentOn = true;
    });
    begun.get_future().wait();
    host().clock.Sleep(kMeet_ms);
    const std::uint32_t begin = host().clock.TickCount();
    host().threads.Terminate(thread);
    EXPECT_LT(host().clock.TickCount() - begin, 9'000U) << one.name;
    EXPECT_TRUE(host().threads.Wait(thread, 0)) << one.name;
    EXPECT_TRUE(restored) << one.name;
    EXPECT_FALSE(wentOn) << one.name;
  }
  release.set_value();
  EXPECT_TRUE(host().threads.Wait(waiting, kLong_ms));
  EXPECT_TRUE(host().mutexes.Release(owned));
  std::filesystem::remove(path);
}

// A throw out of a destructor that another exception runs would end the process.
TEST(ThreadsTest, AnUnwindingThreadIsNotInterruptedASecondTime) {
  struct Unwound {
    ~Unwound() {
      atDestructor.set_value();
      terminating.get_future().wait();
      host().clock.Sleep(kMeet_ms);  // the request comes meanwhile, or is there already
    }
    std::promise<void>& atDestructor;
    std::promise<void>& terminating;
  };
  std::promise<void> atDestructor;
  std::promise<void> terminating;
  std::atomic<bool> caught{false};
  std::atomic<bool> interrupted{false};
  const ThreadHandle thread = host().threads.Start("unwinding", [&] {
    try {
      const Unwound unwound{atDestructor, terminating};
      throw std::runtime_error("the first");
    } catch (const std::runtime_error&) {
      caught = true;
    }
    try {
      host().clock.Sleep(kLong_ms);
    } catch (const ThreadTerminated&) {
      host().clock.Sleep(1);  // nor is it once it was
      interrupted = true;
    }
  });
  atDestructor.get_future().wait();
  terminating.set_value();
  host().threads.Terminate(thread);
  EXPECT_TRUE(caught);
  EXPECT_TRUE(interrupted);
}

TEST(ThreadsTest, WaitTellsARunningThreadFromAnEndedOne) {
  std::promise<void> release;
  const ThreadHandle thread = host().threads.Start("waited for", [&] { release.get_future().wait(); });
  EXPECT_FALSE(host().threads.Wait(thread, 0));
  EXPECT_FALSE(host().threads.Wait(thread, 1));
  release.set_value();
  EXPECT_TRUE(host().threads.Wait(thread, Threads::kNoLimit));
  EXPECT_TRUE(host().threads.Wait(thread, 0));
  EXPECT_TRUE(host().threads.Wait(0, Threads::kNoLimit));
}

TEST(ThreadsTest, AClosedThreadRunsOnAndCannotBeEnded) {
  std::promise<void> release;
  std::promise<void> ended;
  const ThreadHandle thread = host().threads.Start("closed", [&] {
    release.get_future().wait();
    host().clock.TickCount();
    ended.set_value();
  });
  host().threads.Close(thread);
  EXPECT_TRUE(host().threads.Wait(thread, 0));
  host().threads.Terminate(thread);
  release.set_value();
  EXPECT_NO_THROW(ended.get_future().get());
}

TEST(ThreadsTest, AThreadThatThrowsEndsAloneAndSaysSo) {
  testing::internal::CaptureStderr();
  const ThreadHandle thread =
      host().threads.Start("thrower", []() -> void { throw std::runtime_error("what happened"); });
  EXPECT_TRUE(host().threads.Wait(thread, kLong_ms));
  const std::string report = testing::internal::GetCapturedStderr();
  EXPECT_NE(report.find("thrower"), std::string::npos) << report;
  EXPECT_NE(report.find("what happened"), std::string::npos) << report;
}

TEST(ThreadsTest, WhatABodyHoldsIsGoneWhenItsThreadHasEnded) {
  std::atomic<bool> gone{false};
  std::shared_ptr<void> held(nullptr, [&](void*) {
    host().clock.Sleep(kMeet_ms);
    gone = true;
  });
  const ThreadHandle thread = host().threads.Start("holder", [held = std::move(held)] {});
  EXPECT_TRUE(host().threads.Wait(thread, kLong_ms));
  EXPECT_TRUE(gone);
}

// A prompt's worker may be started a hundred times a second, and nobody closes its handle.
TEST(ThreadsTest, EndedThreadsKeepNoDescriptorsThoughNobodyClosesThem) {
  const auto open = [] {
    return std::distance(std::filesystem::directory_iterator("/proc/self/fd"), std::filesystem::directory_iterator());
  };
  const auto before = open();
  for (int i = 0; i < 50; ++i) {
    std::promise<void> ended;
    ASSERT_NE(host().threads.Start("unclosed", [&] { ended.set_value(); }), 0U);
    ended.get_future().wait();
  }
  for (int tries = 0; open() > before && tries < 1000; ++tries) {
    host().clock.Sleep(1);  // the last ones are on their way out
  }
  EXPECT_LE(open(), before);
}

}  // namespace
}  // namespace panelglow::platform
