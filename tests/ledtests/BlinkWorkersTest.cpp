// The blink workers by what they do to the panel and to the registers.
#include <gmock/gmock.h>

#include <set>

#include "board/base/mblib_exception.h"
#include "harness/base/CDMException.h"
#include "ledtests/Bench.h"
#include "ledtests/PutBack.h"

namespace panelglow::ledtest {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;

enum class Board { kKnown, kLegacy, kUnknown };

void Use(Board board, Bench& bench) {
  if (board == Board::kLegacy) {
    bench.AddBoardSetting("test.panelglow.uselegacy=yes");
  } else if (board == Board::kUnknown) {
    bench.UseUnknownBoard();
  }
}

TEST(BlinkWorkers, LeftAloneBlinkFiftyTimesAndLeaveThePanelAsFound) {
  struct Case {
    const char* function;
    Board board;
    const char* led;
    int blinks;
    unsigned total_s;
  };
  for (const Case& c :
       {Case{"noled", Board::kKnown, "", 0, 50}, Case{"numlock", Board::kKnown, "num", 50, 20},
        Case{"capslock", Board::kKnown, "caps", 50, 20}, Case{"scrolllock", Board::kKnown, "scroll", 50, 20},
        Case{"touchpadlock", Board::kKnown, "touchpad", 50, 50},
        Case{"powergreen", Board::kKnown, "green", 50, 54},  // with the chip's own waits
        Case{"powerred", Board::kKnown, "red", 50, 54}, Case{"hdred", Board::kKnown, "drive", 50, 53},
        Case{"chargegreen", Board::kKnown, "white", 50, 50}, Case{"chargered", Board::kKnown, "amber", 50, 50},
        Case{"speakermute", Board::kKnown, "", 0, 50},  // no chip here has this LED
        Case{"powergreen", Board::kUnknown, "old-green", 50, 50}, Case{"powerred", Board::kLegacy, "old-red", 50, 50},
        Case{"hdred", Board::kUnknown, "old-drive", 50, 150}}) {
    SCOPED_TRACE(c.function + std::string(" on ") + c.led);
    Bench bench;
    Use(c.board, bench);
    const std::string found = bench.Lit();
    bench.Prepare({c.function});
    const unsigned begin_ms = bench.Now_ms();
    bench.RunWorker(c.function);
    EXPECT_NEAR((bench.Now_ms() - begin_ms) / 1000.0, c.total_s, 1);
    EXPECT_EQ(bench.TimesLit(c.led), c.blinks);
    EXPECT_EQ(bench.Lit(), found);
    const LEDStruct& entry = bench.Entry(c.function);
    EXPECT_TRUE(entry.workerStarted && entry.workerFinished && entry.running);
  }
}

TEST(BlinkWorkers, WriteTheirRegistersInThisOrder) {
  struct Case {
    const char* function;
    Board board;
    bool running;  // false: the turn is over before the worker begins; true: over in the first on phase
    const char* writes;
  };
  for (const Case& c :
       {Case{"powergreen", Board::kUnknown, true,
             "0433 <- 00, 0434 <- 00, 044D <- 02, 044D <- 00, 0433 <- 04, 0434 <- 04"},
        Case{"powerred", Board::kLegacy, true,
             "0433 <- 00, 0434 <- 00, 044D <- 01, 044D <- 00, 0433 <- 04, 0434 <- 04"},
        Case{"hdred", Board::kUnknown, true,
             "0433 <- 00, 0434 <- 00, FA0E <- 00, 044D <- 01, FA0E <- 80, FA0E <- 00, 0433 <- 04, 0434 <- 04"},
        Case{"hdred", Board::kUnknown, false,
             "0433 <- 00, 0434 <- 00, FA0E <- 00, 044D <- 01, 0433 <- 04, 0434 <- 04"},
        Case{"hdred", Board::kKnown, false, "0A28 <- 00"},
        Case{"chargered", Board::kKnown, false, "FE5C0408 <- 01, FE5C040C <- 01"},
        Case{"chargered", Board::kKnown, true, "FE5C0408 <- 01, FE5C040C <- 01, FE5C040C <- 41, FE5C040C <- 01"}}) {
    SCOPED_TRACE(c.writes);
    Bench bench;
    Use(c.board, bench);
    bench.Prepare({c.function});
    bench.After(200, [&] { bench.Entry(c.function).running = false; });
    bench.RunWorker(c.function, c.running);
    EXPECT_EQ(bench.Writes(), c.writes);
    EXPECT_TRUE(bench.Entry(c.function).workerFinished);
  }
}

TEST(BlinkWorkers, ThreeModelsHaveTheirLegacyRegistersElsewhere) {
  for (const int systemId : {0x0AC8, 0x3029, 0x3047, 0x7D10}) {
    Bench bench;
    LegacyPanelPorts ports(g_objDriverObjectCustom);
    ports.SelectModel(static_cast<std::uint16_t>(systemId));
    bench.sim.Trace().Clear();
    ports.CustomSetGreenPwrLedGpioMode();
    ports.CustomSetRedPwrLedNativeMode();
    ports.CustomAssertGreenPwrLed();
    EXPECT_EQ(bench.Writes(),
              systemId == 0x7D10 ? "0433 <- 00, 0434 <- 04, 044D <- 02" : "0833 <- FB, 0834 <- FF, 084D <- FE");
  }
}

// As when a worker overruns its turn: the two share the word that stops them, and nothing else.
TEST(BlinkWorkers, OfTwoDrivesAtOnceKeepEachTheirOwnBusy) {
  Bench bench("drives-desktop.toml");
  bench.test.massStorageIniFile = ".\\msctrl.ini";
  bench.Prepare({"hdgreen"});
  bench.test.hdControllers = "all";
  bench.test.PrepareDeviceArray();
  ASSERT_EQ(bench.test.hdCount, 3);
  const platform::ThreadHandle first = bench.StartWorker("hdgreen");
  LEDStruct& second = *bench.test.FindDevice(kFirstHdGreen + 1);
  second.running = true;
  bench.sim.Time().SleepFor(600'000);
  const platform::ThreadHandle other =
      platform::TheHost().threads.Start("worker", [&] { RunBlinkWorker(CustomBlinkCtrlHDLED, bench.test, second); });
  bench.sim.Time().SleepFor(1'000'000);
  bench.Entry("hdgreen").running = false;
  second.running = false;
  for (const platform::ThreadHandle worker : {first, other}) {
    platform::TheHost().threads.Wait(worker, platform::Threads::kNoLimit);
  }
  EXPECT_EQ(bench.TimesLit("sata-drive"), 2);
  EXPECT_EQ(bench.TimesLit("sas-drive"), 1);
  EXPECT_EQ(bench.TimesLit("nvme-drive"), 0);
}

// The second controller's disk is one that the management service does not list: the first one's is left alone.
TEST(BlinkWorkers, ADriveThatNobodyKnowsStaysDarkAndNoOtherIsMadeBusyForIt) {
  const fs::path machine = Bench::FolderPath().string() + "-unlisted.toml";
  std::ofstream(machine) << std::ifstream(fs::path(PANELGLOW_SOURCE_DIR) / "machines/drives-desktop.toml").rdbuf()
                         << "\n[[management]]\nnamespace = 'ROOT\\CIMV2'\nclass = 'Win32_DiskDrive'\n";
  Bench bench(machine.string());
  fs::remove(machine);
  bench.test.massStorageIniFile = ".\\msctrl.ini";
  bench.Prepare({"hdgreen"});
  bench.test.hdControllers = "all";
  bench.test.PrepareDeviceArray();
  ASSERT_GE(bench.test.hdCount, 1);
  bench.test.ChangeDriveHandle("\\\\.\\PHYSICALDRIVE1");  // of the worker before
  bench.After(2500, [&] { bench.Entry("hdgreen").running = false; });
  bench.RunWorker("hdgreen");
  EXPECT_EQ(bench.TimesLit("sata-drive") + bench.TimesLit("sas-drive"), 0);
}

// What a slow part still needs for its last step.
constexpr sim::Microseconds kSilicon_us = 100'000;

// Ended between any two steps of its first cycle, by a dialog that does not wait any longer.
TEST(BlinkWorkers, EndedAtAnyMomentLeaveThePanelAsFoundAndNoLockBehind) {
  struct Case {
    const char* function;
    Board board;
    const char* machine = "";
    unsigned turn_ms = 150;
  };
  for (const Case& c :
       {Case{"numlock", Board::kKnown}, Case{"touchpadlock", Board::kKnown}, Case{"powergreen", Board::kKnown},
        Case{"powerred", Board::kKnown}, Case{"hdred", Board::kKnown}, Case{"chargegreen", Board::kKnown},
        Case{"chargered", Board::kKnown}, Case{"powergreen", Board::kUnknown}, Case{"hdred", Board::kUnknown},
        // Parts whose saving changes something, or is a register list.
        Case{"powergreen", Board::kKnown, "mailbox-notebook.toml"},
        Case{"chargered", Board::kKnown, "mailbox-notebook.toml"},
        Case{"speakermute", Board::kKnown, "codec-notebook.toml"}, Case{"powergreen", Board::kKnown, "sio-ite.toml"},
        // A link that takes its time for either way, and a camera that is being built.
        Case{"network", Board::kKnown, "office-notebook.toml"},
        Case{"webcam", Board::kKnown, "office-notebook.toml", 1500}}) {
    Bench bench(c.machine);
    Use(c.board, bench);
    bench.Prepare({c.function});
    const std::string found = bench.Lit();
    const std::string state = bench.sim.HardwareState();
    const bool keepsAll = *c.machine != '\0';  // the legacy registers go to native mode, whatever they were in
    // A whole turn of one cycle tells when something happens.
    const sim::Microseconds begin = bench.sim.Time().Now();
    bench.After(c.turn_ms, [&] { bench.Entry(c.function).running = false; });
    bench.RunWorker(c.function);
    std::set<sim::Microseconds> moments;
    const auto add = [&](sim::Microseconds time) {
      if (time > begin) {
        moments.insert({time - begin - 1, time - begin, time - begin + 1, time - begin + 100});
      }
    };
    for (const sim::DriverRequest& request : bench.sim.Trace().Requests()) {
      add(request.time);
    }
    for (const sim::LedChange& change : bench.sim.Panel().TimeLine()) {
      add(change.time);
    }
    ASSERT_GE(moments.size(), 8U) << c.function << " on " << c.machine;
    for (const sim::Microseconds moment : moments) {
      const platform::ThreadHandle worker = bench.StartWorker(c.function);
      bench.sim.Time().SleepFor(moment);
      platform::TheHost().threads.Terminate(worker);
      bench.sim.Time().SleepFor(kSilicon_us);
      ASSERT_EQ(bench.Lit(), found) << c.function << " ended after " << moment << " us";
      if (keepsAll) {
        ASSERT_EQ(bench.sim.HardwareState(), state) << c.function << " ended after " << moment << " us";
      }
      ASSERT_THAT(bench.sim.HardwareState(), Not(HasSubstr("held down"))) << moment;
      ASSERT_FALSE(bench.sim.IsMutexOwned("_HalcyonMotherBoardLib")) << moment;
    }
  }
}

TEST(BlinkWorkers, PutTheirLedBackWhateverIsThrown) {
  const std::function<void()> kThrows[] = {[] { throw new CDMException(990001); }, [] { throw CDMException(990001); },
                                           [] { throw mblib_exception("text"); }, [] { throw std::string("text"); },
                                           [] { throw -3; }};
  for (const auto& fails : kThrows) {
    Bench bench;
    int putBack = 0;
    const auto guarded = [&] {
      const PutBack restore([&] {
        ++putBack;
        fails();
      });
      fails();
    };
    platform::TheHost().threads.Wait(platform::TheHost().threads.Start("worker", [&] { ActAndLog(guarded); }), 1000);
    EXPECT_EQ(putBack, 1);
    EXPECT_EQ(bench.Lines().size(), 2U);  // of the action and of the worker
    EXPECT_THAT(bench.sim.Output(), HasSubstr("LogMessage 7 20000 \"A LED could not be blinked: "));
  }
}

TEST(BlinkWorkers, WithoutTheirHardwareDoNothingAndDoNotCountAsStarted) {
  for (const char* function : {"chargegreen", "speakermute", "microphone", "touchpadlock"}) {
    Bench bench("touchpad = false\n");
    bench.UseUnknownBoard();
    bench.Prepare({function});
    bench.RunWorker(function);
    EXPECT_EQ(bench.Writes(), "") << function;
    EXPECT_FALSE(bench.Entry(function).workerStarted) << function;
    EXPECT_EQ(bench.Entry(function).workerFinished, std::string(function) == "touchpadlock");
  }
}

}  // namespace
}  // namespace panelglow::ledtest
