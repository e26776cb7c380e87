// Clicks, drags, and what is held with the mouse.
#include "platform/desktop/DialogTest.h"

namespace panelglow::platform::desktop {
namespace {

using ::testing::ElementsAre;

TEST_F(DialogTest, AClickReachesWhatIsThereAndADisabledButtonTakesNone) {
  Pump(1);
  notes_.clear();
  const auto click = [&](std::size_t button, std::uint32_t until_ms) {
    desktop_.Click(On(button).first, On(button).second);
    Pump(until_ms);
  };
  click(2, 10);
  desktop_.EnableWindow(buttons_[1], false);
  click(1, 20);
  EXPECT_THAT(notes_, ElementsAre("command 13"));
  EXPECT_EQ(FocusedId(), 13);
}

TEST_F(DialogTest, APressCountsWhenTheReleaseIsOverTheButtonThatWasPressed) {
  struct Case {
    const char* name;
    std::vector<std::size_t> path;  // buttons: pressed on the first, released on the last
    bool counts;
  };
  std::uint32_t time = 0;
  for (const Case& c : {Case{"straight", {2, 2}, true}, Case{"off it", {2, 0}, false},
                        Case{"off it and back", {2, 0, 2}, true}, Case{"onto it", {0, 2}, false}}) {
    for (const bool busy : {false, true}) {  // the thread looks after each step, or at the end
      SCOPED_TRACE(c.name + std::string(busy ? ", busy" : ""));
      notes_.clear();
      const auto look = [&] {
        if (!busy) {
          Pump(time += 10);
        }
      };
      const auto [x, y] = On(c.path.front());
      desktop_.MouseButton(x, y, true);
      look();
      for (const std::size_t button : c.path) {
        desktop_.MouseMove(On(button).first, On(button).second);
        look();
      }
      EXPECT_EQ(desktop_.MakeScene().windows.at(3).pressed, c.counts && !busy);
      desktop_.MouseButton(On(c.path.back()).first, On(c.path.back()).second, false);
      Pump(time += 10);
      EXPECT_EQ(std::count(notes_.begin(), notes_.end(), "command 13"), c.counts ? 1 : 0);
      EXPECT_FALSE(desktop_.MakeScene().windows.at(3).pressed);
    }
  }
}

TEST_F(DialogTest, APartOfAScrollBarThatIsHeldAsksAgainWhileTheMouseIsOnIt) {
  const WindowHandle bar = AddControl("SCROLLBAR", style::kScrollBarVertical, {200, 0, 220, 200});
  desktop_.MoveWindow(dialog_, 0, 0, 300, 300);
  desktop_.SetScroll(bar, {0, 1000, 100, 500});
  std::vector<std::uintptr_t> requests;
  desktop_.SetProcedure(dialog_, [&](const Message& m) -> std::intptr_t {
    if (m.id == message::kVerticalScroll) {
      requests.push_back(m.wParam & 0xFFFFU);
    }
    return desktop_.DefaultProcedure(m);
  });
  Pump(10);
  desktop_.MouseButton(210, 195, true);
  Pump(1200);
  EXPECT_EQ(requests, std::vector<std::uintptr_t>(19, scroll::kLineForward));
  desktop_.MouseMove(250, 195);
  Pump(1500);
  EXPECT_EQ(requests.size(), 19U);
  desktop_.MouseButton(250, 195, false);
  Pump(1600);
  EXPECT_EQ(requests.size(), 20U);
  EXPECT_EQ(requests.back(), scroll::kReleased);
  requests.clear();
  desktop_.Click(210, 30);
  Pump(2400);
  const std::uint64_t shown = desktop_.Revision();
  desktop_.MouseButton(210, 100, true);  // the thumb, which follows the mouse
  Pump(2410);
  EXPECT_TRUE(desktop_.MakeScene().windows.back().pressed);
  EXPECT_GT(desktop_.Revision(), shown);  // and so it is drawn
  desktop_.MouseMove(210, 116);
  Pump(2500);
  desktop_.MouseButton(210, 116, false);
  Pump(2600);
  EXPECT_THAT(requests, ElementsAre(scroll::kPageBack, scroll::kReleased, scroll::kThumbTrack, scroll::kThumbPosition,
                                    scroll::kReleased));
}

TEST_F(DialogTest, AScrollBarMayBeDestroyedByWhatItAsksFor) {
  const WindowHandle bar = AddControl("SCROLLBAR", style::kScrollBarVertical, {200, 0, 220, 200});
  desktop_.MoveWindow(dialog_, 0, 0, 300, 300);
  desktop_.SetScroll(bar, {0, 1000, 100, 500});
  int requests = 0;
  desktop_.SetProcedure(dialog_, [&](const Message& m) -> std::intptr_t {
    if (m.id == message::kVerticalScroll && ++requests == 3) {
      desktop_.DestroyWindow(bar);
    }
    return desktop_.DefaultProcedure(m);
  });
  Pump(10);
  desktop_.MouseButton(210, 195, true);
  Pump(1000);
  desktop_.MouseButton(210, 195, false);
  Pump(1100);
  EXPECT_EQ(requests, 3);
}

TEST_F(DialogTest, AButtonThatIsTakenAwayWhileItIsHeldIsNotPressed) {
  std::uint32_t time = 10;
  Pump(time);
  for (const bool destroyed : {false, true}) {
    notes_.clear();
    const auto [x, y] = On(2);
    desktop_.MouseButton(x, y, true);
    Pump(time += 10);
    destroyed ? desktop_.DestroyWindow(buttons_[2]) : desktop_.EnableWindow(buttons_[2], false);
    desktop_.MouseButton(x, y, false);
    Pump(time += 10);
    EXPECT_TRUE(notes_.empty());
    desktop_.EnableWindow(buttons_[2], true);
    desktop_.Click(On(0).first, On(0).second);
    Pump(time += 10);
    EXPECT_THAT(notes_, ElementsAre("command 11"));
  }
}

TEST_F(DialogTest, AClickOnAnotherThreadsWindowTakesNoReleaseFromABusyOne) {
  WindowHandle other = 0;
  int released = 0;
  const sim::ThreadId thread = machine_.Time().Start("other", [&] {
    desktop_.RegisterWindowClass({"Other", 0, 0, 0, [&](const Message& m) {
                                    released += m.id == message::kLeftButtonUp ? 1 : 0;
                                    return desktop_.DefaultProcedure(m);
                                  }});
    WindowRequest request;
    request.className = "Other";
    request.style = style::kPopup | style::kVisible;
    request.x = 500;
    request.width = 100;
    request.height = 100;
    other = desktop_.CreateWindow(request);
    Message m;
    while (desktop_.GetMessage(m) && m.id != message::kClose) {
      desktop_.Dispatch(m);
    }
  });
  Pump(10);
  const auto [x, y] = On(2);
  desktop_.MouseButton(x, y, true);
  Pump(20);
  notes_.clear();
  desktop_.MouseButton(x, y, false);
  desktop_.Click(550, 50);
  machine_.Time().SleepFor(10'000);
  EXPECT_EQ(released, 1);
  Pump(40);
  EXPECT_THAT(notes_, ElementsAre("command 13"));
  desktop_.Post({other, message::kClose, 0, 0});
  EXPECT_TRUE(machine_.Time().WaitForEnd(thread, 1'000'000));
}

TEST_F(DialogTest, ASizingFrameFollowsTheMouseWithinItsLimits) {
  desktop_.RegisterWindowClass({"Sizing", 0, 0, 0, [&](const Message& m) {
                                  if (m.id == message::kGetMinMaxInfo) {
                                    *reinterpret_cast<TrackLimits*>(m.lParam) = {150, 100, 400, 300};
                                  }
                                  return desktop_.DefaultProcedure(m);
                                }});
  struct Case {
    const char* name;
    std::vector<std::pair<int, int>> path;  // of the mouse, from press to release
    Rectangle after;                        // of a window at 300,100 that is 200 wide and 150 high
  };
  std::uint32_t time = 10;
  for (const Case& c :
       {Case{"right edge", {{498, 170}, {548, 170}}, {300, 100, 550, 250}},
        Case{"left edge", {{301, 170}, {271, 170}}, {270, 100, 500, 250}},
        Case{"a corner", {{301, 101}, {281, 91}}, {280, 90, 500, 250}},
        Case{"least size", {{498, 248}, {320, 110}}, {300, 100, 450, 200}},
        Case{"beyond it and back", {{498, 248}, {320, 110}, {498, 248}}, {300, 100, 500, 250}},
        Case{"least width, from the left", {{301, 170}, {480, 170}}, {350, 100, 500, 250}},
        Case{"beyond it from the left and back", {{301, 170}, {480, 170}, {311, 170}}, {310, 100, 500, 250}},
        Case{"largest size", {{498, 170}, {1100, 170}}, {300, 100, 700, 250}},
        Case{"no edge", {{400, 170}, {450, 170}}, {300, 100, 500, 250}}}) {
    for (const bool busy : {false, true}) {  // the thread looks after each step, or at the end
      SCOPED_TRACE(c.name + std::string(busy ? ", busy" : ""));
      WindowRequest request;
      request.className = "Sizing";
      request.style = style::kPopup | style::kVisible | style::kSizeFrame;
      request.x = 300;
      request.y = 100;
      request.width = 200;
      request.height = 150;
      const WindowHandle window = desktop_.CreateWindow(request);
      Pump(time += 10);
      desktop_.MouseButton(c.path.front().first, c.path.front().second, true);
      for (const auto& [x, y] : c.path) {
        desktop_.MouseMove(x, y);
        if (!busy) {
          Pump(time += 10);
        }
      }
      desktop_.MouseButton(c.path.back().first, c.path.back().second, false);
      desktop_.MouseMove(10, 10);  // is nobody's any more
      Pump(time += 10);
      EXPECT_EQ(desktop_.WindowRectangle(window), c.after);
      desktop_.DestroyWindow(window);
    }
  }
}

}  // namespace
}  // namespace panelglow::platform::desktop
