// What the parts that chips are written with do on the hardware, as far as no chip class shows it.
#include <gmock/gmock.h>

#include "board/BoardBench.h"
#include "board/parts/ConfigMode.h"
#include "board/parts/ConfigRegisters.h"
#include "board/parts/LineActivity.h"
#include "platform/Host.h"

namespace panelglow {
namespace {

TEST(LineActivity, ASignalIsCountedAndALevelIsTheMoreFrequentOne) {
  struct Case {
    std::function<bool(int sample)> isHigh;
    int answer;
  };
  const Case kCases[] = {
      {[](int) { return true; }, 1},
      {[](int) { return false; }, 0},
      {[](int n) { return n % 2 == 0; }, -500},  // the first sample is high: a transition
      {[](int n) { return n % 2 == 1; }, -499},
      {[](int n) { return n < 60 || n % 4 == 0; }, 0},
      {[](int n) { return n % 100 < 60; }, -10},
      {[](int n) { return n % 100 < 63; }, 1},   // 315 of 500 is not below five quarters of half of them
      {[](int n) { return n % 250 < 125; }, 0},  // 250 each, in four transitions
  };
  for (const Case& c : kCases) {
    const BoardBench bench;
    int samples = 0;
    EXPECT_EQ(MeasureLineActivity([&] {
                platform::TheHost().clock.Sleep(1);
                return c.isHigh(samples++);
              }),
              c.answer)
        << &c - kCases;
    EXPECT_EQ(samples, 500);
  }
  // A line that is read in no time: the watch ends all the same.
  const BoardBench bench;
  EXPECT_EQ(MeasureLineActivity([] { return true; }), 1);
}

TEST(ConfigRegisters, SelectADeviceWhenItChanges) {
  BoardBench bench;
  ConfigRegisters config(IndexedPorts(BoardDevio(), 0x4E), {0x55}, {0xAA});
  EXPECT_EQ(bench.Traffic([&] {
    const ConfigMode mode(config);
    config.Write({9, 1}, 2);
    config.Write({9, 2}, 3);
    config.Write({8, 3}, 4);
  }),
            "004E<-55 004E<-07 004F<-09 004E<-01 004F<-02 004E<-02 004F<-03 004E<-07 004F<-08 004E<-03 004F<-04 "
            "004E<-AA ");
}

}  // namespace
}  // namespace panelglow
