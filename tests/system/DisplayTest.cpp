// On a real display: the program's windows under Xvfb, answered by real mouse clicks and keys.
#include <gmock/gmock.h>

#include <chrono>
#include <thread>

#include "system/SystemRun.h"

// Behind the test framework's headers, whose names its macros would replace.
#include "display/VirtualDisplay.h"

namespace panelglow::systemtest {
namespace {

using ::testing::HasSubstr;
using namespace std::chrono_literals;

constexpr unsigned long kDialogGray = 0xC0C0C0;
constexpr unsigned long kPromptGray = 0xF0F0F0;
constexpr unsigned long kLitGreen = 0x20E040;

// Two lock keys, so that a run in real time is a matter of seconds.
constexpr const char* kTwoKeys =
    "<UI><Section ID=\"Default\"><Button ID=\"NumLock\"/><Button ID=\"CapsLock\"/></Section></UI>";

TEST(SystemDisplay, APersonTakesTheTestWithMouseAndKeyboard) {
  const VirtualDisplay display;
  ASSERT_TRUE(display.IsOpen()) << "Xvfb does not start";
  const Installation installation;
  installation.Write("ui.xml", kTwoKeys);
  Outcome outcome;
  std::thread run([&] {
    outcome = RunProgram("panelglow-sim",
                         {"--machine", installation.Machine("desktop.toml"), "--window", "--raw", "--",
                          "-subtest=CustomLEDTest", "-OperatorCheating=false", "-Retries=0"},
                         installation.Path(""), {{"DISPLAY", display.Name()}});
  });
  // The prompt: 540 by 300 in the middle of the screen. Enter presses its OK button.
  EXPECT_TRUE(display.AwaitPixel(640, 600, kPromptGray, 20s));
  display.Do("key Return");
  // The dialog: 615 by 608 in the middle. Of the panel, the fourth and fifth LED are the lock keys.
  EXPECT_TRUE(display.AwaitPixel(640, 500, kDialogGray, 20s));
  constexpr int kLedX = 47;
  constexpr int kNumLockY = 183;
  constexpr int kCapsLockY = 217;
  for (int answers = 0; answers < 2; ++answers) {
    const auto end = std::chrono::steady_clock::now() + 10s;
    bool numLock = false;
    bool capsLock = false;
    while (!numLock && !capsLock && std::chrono::steady_clock::now() < end) {
      numLock = display.PixelAt(kLedX, kNumLockY) == kLitGreen;
      capsLock = display.PixelAt(kLedX, kCapsLockY) == kLitGreen;
      std::this_thread::sleep_for(5ms);
    }
    ASSERT_TRUE(numLock || capsLock) << "no LED blinks on the panel";
    // Client origin (335, 211); buttons at 58 and 260, both in the first row at 150, 130 by 30.
    display.Click(335 + (numLock ? 58 : 260) + 65, 211 + 150 + 15);
    std::this_thread::sleep_for(1500ms);  // the worker's last blink is over
  }
  run.join();
  EXPECT_EQ(outcome.exitCode, 0) << outcome.output << outcome.errors;
  EXPECT_TRUE(outcome.IsOrderly());
}

// The X server dies while something stands on it. Nobody answers any more: the run fails, ends as any other, and
// leaves the LEDs as it found them.
TEST(SystemDisplay, WhenTheDisplayDiesTheRunEndsWithItsCodeAndTheLedsAsFound) {
  constexpr unsigned long kDarkGreen = 0x103818;
  constexpr int kLedX = 47;
  constexpr int kPowerY = 81;
  constexpr int kNumLockY = 183;
  enum class Moment { kPrompt, kBoardBlink, kKeyBlink };
  for (const Moment moment : {Moment::kPrompt, Moment::kBoardBlink, Moment::kKeyBlink}) {
    SCOPED_TRACE(static_cast<int>(moment));
    VirtualDisplay display;
    ASSERT_TRUE(display.IsOpen()) << "Xvfb does not start";
    const Installation installation;
    const bool isBoard = moment == Moment::kBoardBlink;
    installation.Write("ui.xml", std::string("<UI><Section ID=\"Default\"><Button ID=\"") +
                                     (isBoard ? "PowerGreen" : "NumLock") + "\"/></Section></UI>");
    SimulatedRun program{installation.Machine("desktop.toml"), "", 1, {}, {"-subtest=CustomLEDTest", "-Retries=0"}};
    program.arguments.emplace_back("-OperatorCheating=false");
    program.environment = {
        {"DISPLAY", display.Name()}, {"PANELGLOW_SIM_WINDOW", "1"}, {"PANELGLOW_SIM_REAL_TIME", "1"}};
    Outcome outcome;
    std::thread run([&] { outcome = program.In(installation); });
    EXPECT_TRUE(display.AwaitPixel(640, 600, kPromptGray, 20s));
    if (moment != Moment::kPrompt) {
      display.Do("key Return");
      EXPECT_TRUE(display.AwaitPixel(640, 500, kDialogGray, 20s));
      EXPECT_TRUE(display.AwaitPixel(kLedX, isBoard ? kPowerY : kNumLockY, isBoard ? kDarkGreen : kLitGreen, 20s));
    }
    display.Kill();
    run.join();
    EXPECT_EQ(outcome.exitCode, 1) << outcome.output << outcome.errors;
    EXPECT_TRUE(outcome.IsOrderly()) << outcome.output;
    EXPECT_THAT(outcome.Tagged("ReportFailure"), ::testing::ElementsAre("ReportFailure 990640"));
    EXPECT_TRUE(outcome.LeftChanged().empty());
    EXPECT_TRUE(outcome.leftBehind.empty());
    const std::size_t told = outcome.errors.find("the display is gone");
    EXPECT_NE(told, std::string::npos);
    EXPECT_EQ(outcome.errors.find("the display is gone", told + 1), std::string::npos);
  }
}

TEST(SystemDisplay, ADisplaySmallerThanTheMachinesScreenShowsEveryButton) {
  const VirtualDisplay display("800x480");
  ASSERT_TRUE(display.IsOpen()) << "Xvfb does not start";
  const Installation installation;
  installation.Write("ui.xml", kTwoKeys);
  Outcome outcome;
  std::thread run([&] {
    outcome = RunProgram("panelglow-sim",
                         {"--machine", installation.Machine("desktop.toml"), "--window", "--raw", "--",
                          "-subtest=CustomLEDTest", "-Retries=0", "-LEDTimeout=60"},
                         installation.Path(""), {{"DISPLAY", display.Name()}});
  });
  constexpr double kScale = 480 / 1024.0;
  const auto on = [&](int pixel) { return static_cast<int>(pixel * kScale); };
  EXPECT_TRUE(display.AwaitPixel(on(640), on(600), kPromptGray, 20s));
  display.Click(on(640), on(362 + 4 + 267 + 12));  // OK
  EXPECT_TRUE(display.AwaitPixel(on(640), on(500), kDialogGray, 20s));
  display.Click(on(335 + 430), on(211 + 559));  // cancel, the lowest button
  run.join();
  EXPECT_THAT(outcome.output, HasSubstr("ReportFailure 990354"));
}

TEST(SystemDisplay, WithoutADisplayTheCallIsRefusedAtOnce) {
  const Installation installation;
  for (const char* name : {"", ":4711"}) {
    const Outcome outcome =
        RunProgram("panelglow-sim",
                   {"--machine", installation.Machine("desktop.toml"), "--window", "--", "-subtest=CustomLEDTest"},
                   installation.Path(""), {{"DISPLAY", name}});
    EXPECT_EQ(outcome.exitCode, 3);
    EXPECT_THAT(outcome.errors, HasSubstr("the windows cannot be shown"));
  }
}

}  // namespace
}  // namespace panelglow::systemtest
