// Virtual time and the baton: order, determinism, termination, stuck machines.
#include "platform/sim/base/Scheduler.h"

#include <gtest/gtest.h>

#include <atomic>
#include <memory>

#include "platform/Threads.h"

namespace panelglow::platform::sim {
namespace {

// What three threads that sleep and write do, as text.
std::string Interleaving(std::uint64_t seed) {
  std::string text;
  Scheduler scheduler({seed, false, 0});
  std::vector<ThreadId> threads;
  for (const char letter : {'a', 'b', 'c'}) {
    threads.push_back(scheduler.Start(std::string(1, letter), [&text, &scheduler, letter] {
      for (int i = 0; i < 4; ++i) {
        text += letter;
        scheduler.Spend(10);
      }
    }));
  }
  for (const ThreadId thread : threads) {
    scheduler.WaitForEnd(thread, std::nullopt);
  }
  return text;
}

TEST(Scheduler, TheSameSeedIsTheSameOrderAndOthersDiffer) {
  EXPECT_EQ(Interleaving(5), Interleaving(5));
  bool differs = false;
  for (std::uint64_t seed = 0; seed < 8; ++seed) {
    differs = differs || Interleaving(seed) != Interleaving(5);
  }
  EXPECT_TRUE(differs);
}

TEST(Scheduler, TimeJumpsToTheEarliestWakeAndEventsComeFirst) {
  Scheduler scheduler({1, false, 0});
  std::vector<std::pair<std::string, Microseconds>> seen;
  scheduler.At(30'000'000, [&] { seen.emplace_back("event", scheduler.Now()); });
  const ThreadId thread = scheduler.Start("sleeper", [&] {
    scheduler.SleepFor(30'000'000);
    seen.emplace_back("sleeper", scheduler.Now());
  });
  EXPECT_FALSE(scheduler.WaitForEnd(thread, 29'000'000));
  EXPECT_EQ(scheduler.Now(), 29'000'000U);
  EXPECT_TRUE(scheduler.WaitForEnd(thread, std::nullopt));
  EXPECT_EQ(seen,
            (std::vector<std::pair<std::string, Microseconds>>{{"event", 30'000'000}, {"sleeper", 30'000'000}}));
}

TEST(Scheduler, AThreadThatIsToldToEndUnwindsAtItsNextCallAndCanStillWait) {
  Scheduler scheduler({1, false, 0});
  std::string steps;
  const ThreadId thread = scheduler.Start("worker", [&] {
    const auto restore = std::shared_ptr<void>(nullptr, [&](void*) {
      scheduler.SleepFor(5'000);  // a restore takes its time, undisturbed
      steps += " restored";
    });
    steps += "blinks";
    scheduler.SleepFor(60'000'000);
    steps += " never";
  });
  scheduler.SleepFor(1'000);
  scheduler.Terminate(thread);
  EXPECT_EQ(steps, "blinks restored");
  EXPECT_TRUE(scheduler.HasEnded(thread));
  EXPECT_EQ(scheduler.Now(), 6'000U);
}

TEST(Scheduler, AThreadThatIsToldToEndBeforeItRanDoesNothing) {
  Scheduler scheduler({1, false, 0});
  bool ran = false;
  const ThreadId thread = scheduler.Start("late", [&] { ran = true; });
  scheduler.Terminate(thread);
  EXPECT_FALSE(ran);
}

TEST(Scheduler, ADeadlockSaysWhoWaitsForWhat) {
  EXPECT_EXIT(
      {
        Scheduler scheduler({1, false, 0});
        const ThreadId thread =
            scheduler.Start("worker", [&] { scheduler.Block(&scheduler, "a board", std::nullopt); });
        scheduler.WaitForEnd(thread, std::nullopt);
      },
      ::testing::ExitedWithCode(3),
      "deadlock.*\n.*\"main\" waits for the end of thread \"worker\".*\n.*waits for a board");
}

TEST(Scheduler, ARunWithoutEndIsStoppedAtItsLimit) {
  EXPECT_EXIT(
      {
        Scheduler scheduler({1, false, 3'600'000'000});
        for (;;) {
          scheduler.SleepFor(1'000'000);
        }
      },
      ::testing::ExitedWithCode(3), "did not end within 3600 s");
}

}  // namespace
}  // namespace panelglow::platform::sim
