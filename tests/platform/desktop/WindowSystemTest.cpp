// Message order, timers, foreground, and how windows come and go.
#include "platform/desktop/DialogTest.h"

namespace panelglow::platform::desktop {
namespace {

using ::testing::ElementsAre;

TEST_F(DialogTest, WhatWaitsIsTakenInOneOrder) {
  Pump(1);
  notes_.clear();
  desktop_.SetTimer(dialog_, 7, 10, nullptr);
  desktop_.Invalidate(dialog_);
  desktop_.Key(0x1B, 0, false);
  desktop_.Post({dialog_, message::kDeviceChange, 7, 0});
  desktop_.Post({dialog_, message::kDeviceChange, 8, 0});
  machine_.Time().Start("sender", [&] { desktop_.Send({dialog_, message::kDeviceChange, 9, 0}); });
  machine_.Time().SleepFor(20'000);
  Pump(25);
  EXPECT_THAT(notes_, ElementsAre("device 9", "device 7", "device 8", "command 2", "paint", "timer 7"));
}

TEST_F(DialogTest, AQuitMessageEndsOneLoopOnceWhatWasPostedIsTaken) {
  Pump(1);
  desktop_.Post({dialog_, message::kDeviceChange, 1, 0});
  desktop_.PostQuit();
  Message m;
  EXPECT_TRUE(desktop_.GetMessage(m));
  EXPECT_FALSE(desktop_.GetMessage(m));
  desktop_.Post({dialog_, message::kDeviceChange, 2, 0});
  EXPECT_TRUE(desktop_.GetMessage(m));
}

TEST_F(DialogTest, ABusyThreadGetsOneTickAndShortPeriodsAreTenMilliseconds) {
  Pump(1);
  notes_.clear();
  desktop_.SetTimer(dialog_, 1, 1, nullptr);  // behaves as 10 ms, from 1 ms on
  Pump(45);
  EXPECT_EQ(notes_.size(), 4U);
  machine_.Time().SleepFor(500'000);
  notes_.clear();
  Pump(549);
  EXPECT_THAT(notes_, ElementsAre("timer 1"));
  desktop_.KillTimer(dialog_, 1);
  notes_.clear();
  Pump(600);
  EXPECT_TRUE(notes_.empty());
}

// Each row's number of lines, and characters of the longest.
TEST_F(DialogTest, ATextHasAPlausibleSizeWithoutTheDrawingModule) {
  desktop_.SetDrawing([] { return nullptr; });
  const Font font{18, 600};
  const std::tuple<std::u16string, int, int, int> kCases[] = {{u"", 100, 1, 0},
                                                              {u"59", 10'000, 1, 2},
                                                              {u"59", 0, 2, 1},
                                                              {u"one\nthree\n", 32'767, 3, 5},
                                                              {u"1234567890", 36, 3, 4}};
  for (const auto& [text, width, lines, longest] : kCases) {
    const Rectangle size = desktop_.MeasureText(text, width, font);
    EXPECT_EQ(size.Height(), lines * font.height) << width;
    EXPECT_EQ(size.Width(), longest * font.height / 2) << width;
  }
}

TEST_F(DialogTest, AnotherProgramHasTheForegroundUntilOneOfOursTakesItBack) {
  desktop_.SetForegroundWindow(dialog_);
  const std::uint64_t request = desktop_.MakeScene().foregroundRequest;
  const std::uint64_t revision = desktop_.Revision();
  desktop_.SetForegroundWindow(dialog_);
  EXPECT_EQ(desktop_.Revision(), revision);  // nothing to do, nothing for the screen to do
  ScreenEvent lost;
  lost.kind = ScreenEvent::Kind::kForegroundLost;
  lost.title = u"other";
  desktop_.Take(lost);
  EXPECT_EQ(desktop_.WindowText(desktop_.ForegroundWindow()), u"other");
  desktop_.SetForegroundWindow(dialog_);
  EXPECT_EQ(desktop_.ForegroundWindow(), dialog_);
  EXPECT_EQ(desktop_.MakeScene().foregroundRequest, request + 1);
  desktop_.Take(lost);
  desktop_.Click(290, 90);  // beside the buttons
  Pump(10);
  EXPECT_EQ(desktop_.MakeScene().foregroundRequest, request + 2);
}

TEST_F(DialogTest, WithoutItsScreenEveryLoopEndsAndNoWindowIsMade) {
  const sim::ThreadId other = machine_.Time().Start("other loop", [&] {
    WindowRequest request;
    request.className = "Dialog";
    desktop_.CreateWindow(request);
    Message m;
    while (desktop_.GetMessage(m)) {
    }
  });
  machine_.Time().At(500'000, [this] {
    desktop_.Post({dialog_, message::kDeviceChange, 1, 0});
    desktop_.LoseScreen();
  });
  Message m;
  while (desktop_.GetMessage(m)) {
    desktop_.Dispatch(m);
  }
  EXPECT_EQ(machine_.Time().Now() / 1000, 500U);
  EXPECT_TRUE(machine_.Time().WaitForEnd(other, 600'000));
  EXPECT_FALSE(desktop_.GetMessage(m));
  WindowRequest request;
  request.className = "Dialog";
  EXPECT_EQ(desktop_.CreateWindow(request), 0U);
  notes_.clear();
  desktop_.DestroyWindow(dialog_);  // and what is there can be put away
  EXPECT_THAT(notes_, ElementsAre("destroy"));
}

TEST_F(DialogTest, AWindowWhoseCreationOutlastsTheScreenIsNone) {
  desktop_.RegisterWindowClass({"Slow", 0, 0, 0, [&](const Message& m) {
                                  if (m.id == message::kCreate) {
                                    machine_.Time().SleepFor(100'000);  // as for the prompt lock
                                  }
                                  return desktop_.DefaultProcedure(m);
                                }});
  machine_.Time().At(50'000, [this] { desktop_.LoseScreen(); });
  WindowRequest request;
  request.className = "Slow";
  EXPECT_EQ(desktop_.CreateWindow(request), 0U);
}

TEST_F(DialogTest, AMessageSentFromAnotherThreadIsAnsweredWhileTheOwnerWaits) {
  std::intptr_t answer = 0;
  desktop_.SetProcedure(dialog_, [&](const Message& m) -> std::intptr_t {
    return m.id == message::kDeviceChange ? 77 : desktop_.DefaultProcedure(m);
  });
  const sim::ThreadId sender = machine_.Time().Start("sender", [&] {
    answer = desktop_.Send({dialog_, message::kDeviceChange, 1, 0});
  });
  Pump(20);
  machine_.Time().WaitForEnd(sender, std::nullopt);
  EXPECT_EQ(answer, 77);
}

TEST_F(DialogTest, TopmostWindowsStandAboveTheRestAndDestroyingAParentTakesItsChildren) {
  WindowRequest request;
  request.className = "Dialog";
  request.style = style::kPopup | style::kVisible;
  request.extendedStyle = style::kExTopmost;
  const WindowHandle high = desktop_.CreateWindow(request);
  desktop_.SetForegroundWindow(dialog_);
  EXPECT_THAT(desktop_.TopLevelWindows(), ElementsAre(dialog_, high));
  desktop_.SetTimer(dialog_, 1, 10, nullptr);
  notes_.clear();
  desktop_.DestroyWindow(dialog_);
  EXPECT_THAT(notes_, ElementsAre("destroy"));
  EXPECT_FALSE(desktop_.IsWindow(buttons_[1]));
  EXPECT_THAT(desktop_.TopLevelWindows(), ElementsAre(high));
}

TEST_F(DialogTest, PlacesBeyondAllMeasureAreCut) {
  desktop_.MoveWindow(buttons_[0], 2'000'000'000, -2'000'000'000, 2'000'000'000, 10);
  EXPECT_EQ(desktop_.WindowRectangle(buttons_[0]), (Rectangle{32767, -32768, 65534, -32758}));
}

}  // namespace
}  // namespace panelglow::platform::desktop
