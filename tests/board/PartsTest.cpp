// What the parts that chips are written with do on the hardware, as far as no chip class shows it.
#include <gmock/gmock.h>

#include "board/BoardBench.h"
#include "board/parts/ConfigRegisters.h"
#include "board/parts/LineActivity.h"
#include "board/parts/Lines.h"
#include "board/parts/PortRegisters.h"
#include "board/parts/PowerEventButton.h"
#include "board/parts/ReadBase.h"
#include "board/parts/RowOf.h"
#include "board/parts/SmbusHost.h"
#include "board/parts/Step.h"
#include "platform/Host.h"

namespace panelglow {
namespace {

constexpr const char* kBusyHost =
    "chip = [{name = \"b\", kind = \"gpio-block\", base = 0xC00, outputs = 0, inputs = 0x1A}]\n";

TEST(SmbusHost, ATransactionEndsWellOrAfterFiveLooks) {
  BoardBench bench(kBusyHost);
  const SmbusHost ready(BoardDevio(), 0xB00);
  EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(ready.ReadByte(0x5A, 3), 0xFF); }),
            "0B02<-5A 0B03<-03 0B00<-07 20ms 0B01->FF 0B04->FF 0B00->FF ");
  EXPECT_EQ(bench.Traffic([&] { EXPECT_TRUE(ready.WriteByte(0x5A, 3, 0xC4)); }),
            "0B02<-5A 0B03<-03 0B04<-C4 0B00<-06 20ms 0B01->FF ");
  const SmbusHost busy(BoardDevio(), 0xC00);
  const std::string looks = "20ms 0C01->1A 20ms 0C01->1A 20ms 0C01->1A 20ms 0C01->1A 20ms 0C01->1A ";
  EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(busy.ReadByte(1, 2), std::nullopt); }),
            "0C02<-01 0C03<-02 0C00<-07 " + looks + "0C04->FF 0C00->07 ");
  EXPECT_EQ(bench.Traffic([&] { EXPECT_FALSE(busy.WriteByte(1, 2, 3)); }),
            "0C02<-01 0C03<-02 0C04<-03 0C00<-06 " + looks);
}

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

TEST(PowerEventButton, WithoutACheckTheEnableWordIsChangedAsItIsNow) {
  BoardBench bench;
  PowerEventButton button(BoardDevio(), 0x900, PowerEventButton::Check::kNone);
  EXPECT_EQ(bench.Traffic([&] {
    button.Save();
    EXPECT_TRUE(button.Arm() && button.Restore());
  }),
            "0902->FFFF 0902->FFFF 0902<-FEFE 0900<-0100 0902<-FFFF ");
}

TEST(RegisterFiles, AreOpenedOnceForAnOperationAndSelectADeviceWhenItChanges) {
  BoardBench bench;
  ConfigRegisters config(IndexedPorts(BoardDevio(), 0x4E), {0x55}, {0xAA});
  PortRegisters ports(BoardDevio(), 0xFF00);
  SavedRegisters saved;
  EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(ReadBase(config, 10), 0xFFFF); }),
            "004E<-55 004E<-07 004F<-0A 004E<-60 004F->FF 004E<-61 004F->FF 004E<-AA ");
  EXPECT_EQ(bench.Traffic([&] {
    const ConfigMode mode(config);
    panelglow::Run(
        Steps{Put({9, 1}, 2), SetBits({9, 2}, 1), ClearBits({8, 3}, 0x81), Put({ConfigRegisters::kGlobal, 4}, 5)},
        config);
  }),
            "004E<-55 004E<-07 004F<-09 004E<-01 004F<-02 004E<-02 004F->FF 004E<-02 004F<-FF "
            "004E<-07 004F<-08 004E<-03 004F->FF 004E<-03 004F<-7E 004E<-04 004F<-05 004E<-AA ");
  EXPECT_EQ(bench.Traffic([&] {
    saved.SaveOnce(ports, RegisterRun(0, 0x46, 2));
    saved.SaveOnce(ports, RegisterRun(0, 0x48, 2));
    saved.Set({0, 0x47}, 0x31);
    panelglow::Run(Steps{FromSaved({0, 0x47}, 0xF0, 5), FromSaved({0, 0x49}, 0xFF, 1)}, ports, saved);
    saved.Restore(ports, RegistersAt(0, {0x47, 0x48, 0x46}));
  }),
            "FF46->FF FF47->FF FF47<-35 FF49<-01 FF47<-31 FF46<-FF ");
}

TEST(Tables, ANumberThatHasNoRowIsNone) {
  constexpr int kRows[] = {10, 11};
  constexpr LineRange kLines[] = {{0, 31, 0x0C}, {49, 52, 0x50, 8}};
  for (const int number : {0, 3, -1, 2147483647, -2147483647 - 1}) {
    EXPECT_EQ(RowOf(kRows, number), nullptr) << number;
  }
  EXPECT_EQ(*RowOf(kRows, 2), 11);
  EXPECT_EQ(*RowOf(kRows, 0, 0), 10);
  EXPECT_EQ(FindLine(kLines, 31)->mask, 0x80000000U);
  EXPECT_EQ(FindLine(kLines, 52)->mask, 0x800U);
  EXPECT_EQ(FindLine(kLines, 32), std::nullopt);
}

}  // namespace
}  // namespace panelglow
