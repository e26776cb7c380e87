// How an attempt's device array is filled, and how long a worker is waited for.
#include <gmock/gmock.h>

#include <set>

#include "ledtests/Bench.h"

namespace panelglow::ledtest {
namespace {

std::vector<std::string> AllButDrives() {
  std::vector<std::string> functions;
  for (const LedKind& kind : LedKinds()) {
    functions.emplace_back(kind.function);
  }
  functions.pop_back();
  return functions;
}

TEST(DeviceArray, HoldsTheActiveFunctionsAndOfTheRedLedsThoseThatTheBoardHas) {
  struct Case {
    const char* setting;  // null: the board is not known
    std::int32_t count;
    bool powerRed;
    bool chargeRed;
  };
  for (const Case& c : {Case{"", 14, true, true}, Case{"test.powerled.redled.support=no", 13, false, true},
                        Case{"test.chargeled.redled.support=No", 13, true, false}, Case{nullptr, 12, false, false}}) {
    Bench bench;
    c.setting == nullptr ? bench.UseUnknownBoard() : bench.AddBoardSetting(c.setting);
    bench.Prepare(AllButDrives(), {1001, 1013});
    EXPECT_EQ(bench.test.deviceCount, c.count);
    EXPECT_EQ(bench.test.GetCustomIndex(kPowerRed) >= 0, c.powerRed);
    EXPECT_EQ(bench.test.GetCustomIndex(kChargeRed) >= 0, c.chargeRed);
    EXPECT_EQ(bench.Entry("hdred").adapter, 0);  // a drive's address
    EXPECT_EQ(bench.Entry("webcam").lun, 32);    // the kind again
    EXPECT_FALSE(bench.sim.IsMutexOwned("_HalcyonMotherBoardLib"));
    bench.test.functions.clear();
    EXPECT_TRUE(bench.test.PrepareDeviceArray());
    EXPECT_EQ(bench.test.deviceCount, 0);
    for (const LEDStruct& slot : bench.test.devices) {  // unused, and nothing waits for it
      EXPECT_TRUE(slot.deviceId == -1 && slot.tested && slot.workerFinished && !slot.running && !slot.workerStarted);
    }
    EXPECT_EQ(bench.test.GetCustomIndex(-1), -1);
  }
}

TEST(DeviceArray, IsInAnotherOrderAtAnotherTimeWithEachEntryWhole) {
  std::set<std::vector<std::int32_t>> orders;
  for (std::uint64_t seed = 1; seed <= 8; ++seed) {
    Bench bench("", "", seed);
    bench.test.operatorCheating = seed % 2 == 0;
    bench.Prepare(AllButDrives());
    bench.test.PrepareDeviceArray();
    std::vector<std::int32_t> order;
    for (std::int32_t i = 0; i < bench.test.deviceCount; ++i) {
      const LEDStruct& entry = bench.test.devices[static_cast<std::size_t>(i)];
      const LedKind& kind = *FindLedKindByStartCommand(entry.startCommand);
      EXPECT_EQ(entry.deviceId, kind.deviceId);
      EXPECT_EQ(entry.defaultErrorCode, kind.errorCode);
      EXPECT_EQ(entry.errorCode, std::to_string(770000 + kind.buttonCommand));
      EXPECT_EQ(entry.cheatCheck, bench.test.operatorCheating && i == bench.test.deviceCount - 1);
      order.push_back(entry.deviceId);
    }
    orders.insert(order);
    bench.test.functions = {"numlock"};
    bench.test.PrepareDeviceArray();
    EXPECT_FALSE(bench.Entry("numlock").cheatCheck);  // nothing stands before it
  }
  EXPECT_GT(orders.size(), 4U);
}

TEST(DeviceArray, WaitsForAWorkerButNotForEver) {
  struct Case {
    bool started;
    unsigned ends_ms;  // after the wait began
    unsigned waits_ms;
    std::size_t lines;
    bool closed;
  };
  for (const Case& c : {Case{false, 0, 0, 0, false}, Case{true, 0, 300, 1, true}, Case{true, 700, 1300, 3, true},
                        Case{true, 60'000, 3300, 7, false}}) {
    Bench bench;
    bench.Prepare({"numlock"});
    LEDStruct& entry = bench.Entry("numlock");
    bench.test.workerThread = platform::TheHost().threads.Start("worker", [&entry, &c] {
      entry.workerStarted = c.started;
      platform::TheHost().clock.Sleep(c.ends_ms);
      entry.workerFinished = true;
    });
    bench.sim.ClearOutput();
    const unsigned begin_ms = bench.Now_ms();
    bench.test.WaitForThreadToFinish(kNumLock);
    EXPECT_NEAR(bench.Now_ms() - begin_ms, c.waits_ms, 2);
    EXPECT_EQ(bench.Lines().size(), c.lines);
    EXPECT_EQ(bench.test.workerThread == 0, c.closed);
    platform::TheHost().threads.Terminate(bench.test.workerThread);
  }
}

}  // namespace
}  // namespace panelglow::ledtest
