// The test dialog: where its controls stand, how an attempt goes, and how it ends.
#include <gmock/gmock.h>

#include <set>

#include "ledtests/Bench.h"

namespace panelglow::ledtest {
namespace {

using ::testing::HasSubstr;
using ::testing::MatchesRegex;

constexpr const char* kPromptLock = "_HalcyonPromptLock";

// A line "<id> <text> <x>,<y> <width>x<height>" in client pixels, with "disabled" where it is.
std::string Describe(Bench& bench, platform::WindowHandle control) {
  const platform::Rectangle place = bench.windows.WindowRectangle(control);
  return std::to_string(bench.windows.ControlId(control)) + " " +
         platform::Utf8FromWide(bench.windows.WindowText(control)) + " " + std::to_string(place.left) + "," +
         std::to_string(place.top) + " " + std::to_string(place.Width()) + "x" + std::to_string(place.Height()) +
         (bench.windows.IsWindowEnabled(control) ? "\n" : " disabled\n");
}

TEST(SuperDialog, HasItsControlsWhereTheyBelong) {
  Bench bench;
  bench.Prepare({"numlock"}, std::vector<int>(23, 1100));
  bench.After(1000, [&] {
    const std::vector<platform::WindowHandle> controls = bench.windows.Children(bench.Top());
    ASSERT_EQ(controls.size(), 52U);
    std::string text = Describe(bench, bench.Top());
    for (const std::size_t index : {0U, 1U, 2U, 3U, 4U, 25U, 26U, 27U, 28U, 29U, 49U, 50U, 51U}) {
      text += Describe(bench, controls[index]);
    }
    EXPECT_EQ(text,
              "0  332,208 615x608\n"
              "0  10,10 32x32\n0  560,10 32x32\n"                                              // logos
              "0  15,150 32x32\n0  215,150 32x32\n0  415,150 32x32\n0  415,472 32x32\n"        // icons
              "1003 &Floppy 58,150 130x30\n1100 Tap&e 260,150 130x30\n"                        // buttons
              "1100 N&um Lock 462,150 130x30 disabled\n1100 &CD-ROM 58,196 130x30 disabled\n"  // one of an id counts
              "1100 We&bcam 462,472 130x30 disabled\n"
              "1000 Start 170,543 100x30 disabled\n999 &Quit Test 380,544 100x30\n");
    const platform::desktop::Scene scene = bench.windows.MakeScene();
    for (const platform::desktop::SceneWindow& window : scene.windows) {
      EXPECT_EQ(window.focused, window.text == u"&Floppy");
    }
    const platform::desktop::SceneWindow& dialog = scene.windows.at(0);
    EXPECT_EQ(dialog.background, 0xC0C0C0U);
    const auto& heading = std::get<platform::desktop::TextOperation>(dialog.operations.at(0));
    const auto& instruction = std::get<platform::desktop::TextOperation>(dialog.operations.at(1));
    EXPECT_EQ(heading.text, u"Front Panel LED Test");
    EXPECT_EQ(heading.area, (platform::Rectangle{220, 50, 220, 50}));
    EXPECT_EQ(instruction.area, (platform::Rectangle{30, 75, 600, 200}));
  });
  bench.PressAfter(2000, 999);
  EXPECT_FALSE(bench.test.RunSuperLEDTest());
}

TEST(SuperDialog, AnswersDecideTheAttempt) {
  struct Case {
    const char* presses;  // times in ms and buttons; 0 closes the window, 1 clicks beside the buttons, 2 is Escape
    std::int32_t result;
    const char* code;
    std::int32_t index;  // of the LED that was blinking
    unsigned end_ms;
  };
  for (const Case& c :
       {Case{"1000 1003 3000 1006 6000 1012", CustomLEDTest::kRightAnswer, "770148", 2, 7300},
        Case{"1000 1 1200 2 1400 1005 1600 1003 4000 1003", CustomLEDTest::kWrongAnswer, "770101", 1, 4200},
        Case{"1000 1017", CustomLEDTest::kWrongAnswer, "770102", 0, 1200},  // a LED that is not tested
        Case{"1000 1013", CustomLEDTest::kWrongAnswer, "770102", 0, 1200},  // no drive is tested
        Case{"1000 1003 3000 999", CustomLEDTest::kCancelled, "990354", 1, 3200},
        Case{"1000 1003 3000 0", CustomLEDTest::kCancelled, "990354", 1, 3200},
        Case{"", CustomLEDTest::kTimedOut, "770102", 0, 4300},
        Case{"1000 1003", CustomLEDTest::kTimedOut, "770101", 1, 4300}}) {  // the tick that fell into the wait counts
    SCOPED_TRACE(c.presses);
    Bench bench;
    bench.test.ledTimeout = 3;
    bench.Prepare({"numlock", "capslock", "chargegreen"}, {1017, 1013, 1005});
    const std::string found = bench.Lit();
    std::istringstream presses(c.presses);
    unsigned time_ms = 0;
    for (int id = 0; presses >> time_ms >> id;) {
      bench.After(time_ms, [&bench, id] {
        const platform::Rectangle place = bench.windows.ScreenRectangle(bench.Top());
        id == 0   ? bench.windows.Post({bench.Top(), platform::message::kClose, 0, 0})
        : id == 1 ? bench.windows.Click(place.left + 20, place.bottom - 20)
        : id == 2 ? bench.windows.Key(0x1B, 0, false)
                  : bench.Press(id);
      });
    }
    const unsigned begin_ms = bench.Now_ms();
    EXPECT_EQ(bench.test.RunSuperLEDTest(), c.result > 0);
    EXPECT_NEAR(bench.Now_ms() - begin_ms, c.end_ms, 500);
    EXPECT_EQ(bench.test.testResult, c.result);
    EXPECT_EQ(bench.test.failureCode, c.code);
    EXPECT_EQ(bench.test.currentIndex, c.index);
    EXPECT_EQ(bench.Lit(), found);
    EXPECT_FALSE(bench.sim.IsMutexOwned(kPromptLock));
  }
}

TEST(SuperDialog, ATurnGoesOnInTheDarkWhenItsBlinkIsOver) {
  Bench bench;
  bench.test.ledTimeout = 60;
  bench.Prepare({"numlock"});
  EXPECT_TRUE(bench.test.RunSuperLEDTest());  // the time-out is told from a pass by its result
  EXPECT_EQ(bench.test.testResult, CustomLEDTest::kTimedOut);
  EXPECT_NEAR(bench.Now_ms(), 61'200, 200);
  EXPECT_EQ(bench.TimesLit("num"), 50);
}

TEST(SuperDialog, WritesItsLinesInThisOrder) {
  Bench bench;
  bench.Prepare({"numlock", "capslock"});
  bench.sim.ClearOutput();
  bench.PressAfter(1000, 1003);
  bench.PressAfter(3000, 1003);
  bench.test.RunSuperLEDTest();
  EXPECT_EQ(bench.sim.Output(),
            "UpdatePercentage 30\nUpdatePercentage 40\nUpdatePercentage 50\n"
            "LogMessage 6 20000 \"BNL Thread Exited. \" \"\"\n"
            "LogMessage 6 20000 \"WFTTF: DeviceID - 0, Finished: false\" \"\"\n"
            "LogMessage 6 20000 \"WFTTF Sleeping: DeviceID - 0, Finished: true\" \"\"\n"
            "LogMessage 6 20000 \"BCL Thread Exited. \" \"\"\n"
            "LogMessage 6 20000 \"Exit_Window: DeviceID - 0, Finished: true\" \"\"\n"
            "LogMessage 6 20000 \"Exit_Window: DeviceID - 1, Finished: false\" \"\"\n"
            "LogMessage 6 20000 \"Exit_Window Sleeping: DeviceID - 1, Finished: true\" \"\"\n"
            "UpdatePercentage 80\n");
}

TEST(SuperDialog, TheRepeatCheckBringsTheLastButOneAgainUntilTheDiceSaysOtherwise) {
  std::set<std::string> seen;
  std::size_t repeats = 0;
  for (std::uint64_t seed = 1; seed <= 12; ++seed) {
    Bench bench("", "perfect", seed);
    bench.test.operatorCheating = seed > 2;
    bench.Prepare({"numlock", "capslock", "scrolllock"});
    bench.sim.ClearOutput();
    EXPECT_TRUE(bench.test.RunSuperLEDTest());
    std::string turns;
    for (const std::string& line : bench.Lines()) {
      turns += line.find("Thread Exited") == std::string::npos ? "" : line.substr(20, 3) + " ";
    }
    seen.insert(turns);
    EXPECT_THAT(turns, MatchesRegex("BNL (BCL )+BSL "));
    const bool repeated = turns != "BNL BCL BSL ";
    repeats += turns.size() / 4 - 3;
    EXPECT_EQ(bench.test.cheatLevel, !bench.test.operatorCheating ? 1 : repeated ? 3 : 2);
    EXPECT_TRUE(bench.test.operatorCheating || !repeated);
  }
  EXPECT_GT(seen.size(), 1U);
  EXPECT_LT(repeats, 13U);  // of ten runs: two in three are to be expected
}

TEST(SuperDialog, WaitsForThePromptOfAnotherProcess) {
  Bench bench("peer = {mutex = '_HalcyonPromptLock', until_ms = 5000}\n");
  bench.test.ledTimeout = 3;
  bench.Prepare({"numlock"});
  bench.After(4500, [&] { EXPECT_EQ(bench.TimesLit("num"), 0); });
  bench.After(5500, [&] { EXPECT_TRUE(bench.sim.IsMutexOwned(kPromptLock)); });
  bench.test.RunSuperLEDTest();
  EXPECT_NEAR(bench.Now_ms(), 9000, 400);  // the time-out runs from there too
  EXPECT_FALSE(bench.sim.IsMutexOwned(kPromptLock));
}

TEST(SuperDialog, EveryWorkerHasEndedWithIt) {
  // The green power LED's worker waits for the board all through its turn and the next one.
  Bench bench("peer = {mutex = '_HalcyonMotherBoardLib', from_ms = 500, until_ms = 20000}\n");
  bench.Prepare({"powergreen", "numlock"});
  platform::TheHost().clock.Sleep(500);
  bench.sim.Trace().Clear();
  bench.PressAfter(1000, 1017);
  bench.PressAfter(3000, 1003);
  EXPECT_TRUE(bench.test.RunSuperLEDTest());
  EXPECT_LT(bench.Now_ms(), 10'000U);
  platform::TheHost().clock.Sleep(60'000);
  EXPECT_EQ(bench.Writes(), "");
  EXPECT_FALSE(bench.Entry("powergreen").workerStarted);
}

// The board's mailbox is slow: when the operator cancels, the worker is still saving, and has to be let put back.
TEST(SuperDialog, LetsAWorkerThatWasToldToStopPutItsLedBack) {
  for (unsigned cancelled_ms = 300; cancelled_ms < 2000; cancelled_ms += 117) {
    Bench bench("mailbox-notebook.toml");
    bench.Prepare({"chargered"});
    const std::string state = bench.sim.HardwareState();
    bench.PressAfter(cancelled_ms, 999);
    EXPECT_FALSE(bench.test.RunSuperLEDTest());
    EXPECT_TRUE(bench.Entry("chargered").workerFinished) << cancelled_ms;
    EXPECT_EQ(bench.sim.HardwareState(), state) << cancelled_ms;
  }
}

TEST(SuperDialog, IsLostWhenItsWindowGoesAwayByItself) {
  Bench bench;
  bench.Prepare({"numlock", "capslock"});
  const std::string found = bench.Lit();
  bench.PressAfter(1000, 1003);  // a right answer before it happens is no pass
  bench.After(3100, [&] { bench.windows.Post({bench.Top(), platform::message::kDestroy, 0, 0}); });
  EXPECT_FALSE(bench.test.RunSuperLEDTest());
  EXPECT_EQ(bench.test.failureCode, "990640");
  EXPECT_EQ(bench.Lit(), found);
}

TEST(SuperDialog, EndsTheAttemptWhereNoWindowCanBeHad) {
  Bench bench;
  bench.Prepare({"numlock"});
  bench.windows.RegisterWindowClass(
      {"MainWindowClassName", 0, 0, 0, [](const platform::Message&) -> std::intptr_t { return -1; }});
  EXPECT_FALSE(bench.test.RunSuperLEDTest());
  EXPECT_THAT(bench.sim.Output(), HasSubstr("LogMessage 8 20000 \"The test dialog cannot be shown"));
  EXPECT_FALSE(bench.sim.IsMutexOwned(kPromptLock));
  EXPECT_FALSE(bench.Entry("numlock").running);
}

}  // namespace
}  // namespace panelglow::ledtest
