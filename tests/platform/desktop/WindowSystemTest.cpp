// Message order, timers, focus and dialog keys, on a machine of virtual time.
#include "platform/desktop/WindowSystem.h"

#include <gmock/gmock.h>

#include "platform/Text.h"
#include "platform/sim/Simulation.h"

namespace panelglow::platform::desktop {
namespace {

using ::testing::ElementsAre;

constexpr std::uint32_t kButton = style::kChild | style::kVisible | style::kTabStop;

// A dialog of three buttons, ids 11 to 13, the second of them the default; its messages are noted.
class DialogTest : public ::testing::Test {
 protected:
  void SetUp() override {
    desktop_.RegisterWindowClass({"Dialog", 0, 1, kButtonFaceColor, [this](const Message& m) { return Handle(m); }});
    WindowRequest request;
    request.className = "Dialog";
    request.style = style::kPopup | style::kVisible;
    request.width = 300;
    request.height = 100;
    request.creationParameter = 42;
    dialog_ = desktop_.CreateWindow(request);
    for (int i = 0; i < 3; ++i) {
      buttons_.push_back(AddButton(i, 11 + i, i == 1 ? style::kDefaultPushButton : 0));
    }
    desktop_.SetFocus(buttons_[0]);
    notes_.clear();
  }

  WindowHandle AddButton(int column, int id, std::uint32_t more) {
    static const char16_t* const kCaptions[] = {u"&Red", u"Fish && Chips & more", u"&Green"};
    WindowRequest request;
    request.className = "BUTTON";
    request.text = kCaptions[column];
    request.style = kButton | more;
    request.x = 10 + column * 90;
    request.y = 10;
    request.width = 80;
    request.height = 25;
    request.parent = dialog_;
    const WindowHandle button = desktop_.CreateWindow(request);
    desktop_.SetControlId(button, id);
    return button;
  }

  std::intptr_t Handle(const Message& m) {
    switch (m.id) {
      case message::kCreate:
        notes_.push_back("create " + std::to_string(m.lParam));
        break;
      case message::kCommand:
        notes_.push_back("command " + std::to_string(m.wParam));
        break;
      case message::kTimer:
        notes_.push_back("timer " + std::to_string(m.wParam));
        break;
      case message::kPaint:
        notes_.emplace_back("paint");
        break;
      case message::kDestroy:
        notes_.emplace_back("destroy");
        break;
      case message::kDeviceChange:
        notes_.push_back("device " + std::to_string(m.wParam));
        break;
      default:
        break;
    }
    return desktop_.DefaultProcedure(m);
  }

  // Handles messages until time `until_ms`.
  void Pump(std::uint32_t until_ms) {
    machine_.Time().At(std::uint64_t{until_ms} * 1000, [this] {
      desktop_.Post({dialog_, message::kUnicodeChar, 0, 0});
    });
    Message m;
    while (desktop_.GetMessage(m) && m.id != message::kUnicodeChar) {
      if (!desktop_.IsDialogMessage(dialog_, m)) {
        desktop_.Dispatch(m);
      }
    }
  }

  int FocusedId() { return desktop_.ControlId(desktop_.Focus()); }

  sim::Simulation machine_{""};
  WindowSystem& desktop_ = machine_.Windows();
  WindowHandle dialog_ = 0;
  std::vector<WindowHandle> buttons_;
  std::vector<std::string> notes_;
};

TEST_F(DialogTest, PostedMessagesComeBeforePaintingAndTimersComeLast) {
  Pump(1);
  notes_.clear();
  desktop_.Invalidate(dialog_);
  desktop_.SetTimer(dialog_, 7, 10, nullptr);
  machine_.Time().SleepFor(20'000);
  desktop_.Post({dialog_, message::kDeviceChange, 7, 0});
  desktop_.Post({dialog_, message::kDeviceChange, 8, 0});
  Pump(25);
  EXPECT_THAT(notes_, ElementsAre("device 7", "device 8", "paint", "timer 7"));
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

TEST_F(DialogTest, KeysOfADialog) {
  struct Case {
    const char* name;
    std::uint32_t key;
    char16_t character;
    bool alt;
    int focusBefore;  // index of the button
    int focusAfter;   // id
    std::vector<std::string> notes;
  };
  const Case kCases[] = {
      {"Tab walks on", 0x09, 0, false, 0, 12, {}},
      {"Tab wraps", 0x09, 0, false, 2, 11, {}},
      {"an arrow walks", 0x27, 0, false, 0, 12, {}},
      {"Enter presses the focused button", 0x0D, 0, false, 2, 13, {"command 13"}},
      {"Space presses it too", 0x20, u' ', false, 0, 11, {"command 11"}},
      {"but not with Alt", 0x20, u' ', true, 0, 11, {}},
      {"nor a button behind a single ampersand", 0x20, u' ', false, 2, 13, {"command 13"}},
      {"Escape is command 2", 0x1B, 0, false, 0, 11, {"command 2"}},
      {"Alt and a letter press", 'G', u'g', true, 0, 13, {"command 13"}},
      {"a doubled ampersand is none", 'C', u'c', true, 0, 11, {}},
      {"so does a letter alone", 'G', u'g', false, 0, 13, {"command 13"}},
      {"but not one that no caption marks", 'F', u'f', false, 0, 11, {}},
  };
  std::uint32_t time = 10;
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.name);
    desktop_.SetFocus(buttons_[static_cast<std::size_t>(c.focusBefore)]);
    Pump(time += 10);
    notes_.clear();
    desktop_.Key(c.key, c.character, c.alt);
    Pump(time += 10);
    EXPECT_EQ(FocusedId(), c.focusAfter);
    EXPECT_EQ(notes_, c.notes);
  }
}

TEST_F(DialogTest, AHeldKeyPressesOnceUnlessItIsEnter) {
  struct Case {
    const char* name;
    std::uint32_t key;
    char16_t character;
    std::size_t whileHeld;  // commands until it is released, and then
    std::size_t released;
  };
  std::uint32_t time = 0;
  for (const Case& c :
       {Case{"Space presses when it is released", 0x20, u' ', 0, 1},
        Case{"a letter presses at once", 'R', u'r', 1, 1}, Case{"Enter presses each time", 0x0D, u'\r', 26, 26}}) {
    SCOPED_TRACE(c.name);
    notes_.clear();
    for (int i = 0; i < 26; ++i) {
      desktop_.KeyDown(c.key, c.character, false, i != 0);
    }
    Pump(time += 10);
    EXPECT_EQ(std::count(notes_.begin(), notes_.end(), "command 11"), c.whileHeld);
    EXPECT_EQ(desktop_.MakeScene().windows.at(1).pressed, c.key == 0x20);
    desktop_.KeyUp(c.key, false);
    Pump(time += 10);
    EXPECT_EQ(std::count(notes_.begin(), notes_.end(), "command 11"), c.released);
  }
}

TEST_F(DialogTest, SpaceThatIsHeldWhileTheFocusMovesPressesNothing) {
  desktop_.KeyDown(0x20, u' ', false, false);
  Pump(10);
  desktop_.SetFocus(buttons_[2]);
  notes_.clear();
  desktop_.KeyDown(0x20, u' ', false, true);  // as the display repeats it
  desktop_.KeyUp(0x20, false);
  desktop_.SetFocus(buttons_[0]);
  desktop_.KeyUp(0x20, false);
  Pump(20);
  EXPECT_TRUE(notes_.empty());
  EXPECT_FALSE(desktop_.MakeScene().windows.at(1).pressed);

  desktop_.KeyDown(0x20, u' ', false, false);
  desktop_.KeyUp(0x20, true);  // Alt has been pressed meanwhile
  desktop_.KeyDown(0x20, u' ', true, false);
  desktop_.KeyUp(0x20, false);  // Alt has been released
  Pump(30);
  EXPECT_TRUE(notes_.empty());
  EXPECT_FALSE(desktop_.MakeScene().windows.at(1).pressed);

  desktop_.KeyDown(0x20, u' ', false, false);
  Pump(10);
  desktop_.LoseForeground(u"other");  // which gets the release
  EXPECT_FALSE(desktop_.MakeScene().windows.at(1).pressed);
  desktop_.SetForegroundWindow(dialog_);
  notes_.clear();
  desktop_.KeyUp(0x20, false);
  Pump(20);
  EXPECT_TRUE(notes_.empty());
}

TEST_F(DialogTest, TheFocusedButtonHasTheHeavyFrameAndTheDefaultOneWhenNoneIs) {
  const auto heavy = [&] {
    std::vector<int> ids;
    for (const SceneWindow& window : desktop_.MakeScene().windows) {
      if (window.heavyFrame) {
        ids.push_back(desktop_.ControlId(window.handle));
      }
    }
    return ids;
  };
  EXPECT_THAT(heavy(), ElementsAre(11));
  desktop_.SetFocus(0);
  EXPECT_THAT(heavy(), ElementsAre(12));
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

TEST_F(DialogTest, EnterWithoutAFocusedButtonPressesTheDefaultOne) {
  Pump(1);
  desktop_.EnableWindow(buttons_[0], false);  // the focused one: no focus is left
  EXPECT_EQ(desktop_.Focus(), 0U);
  notes_.clear();
  desktop_.Key(0x0D, 0, false);
  Pump(10);
  EXPECT_THAT(notes_, ElementsAre("command 12"));
}

TEST_F(DialogTest, AClickReachesWhatIsThereAndADisabledButtonTakesNone) {
  Pump(1);
  notes_.clear();
  const auto click = [&](std::size_t button, std::uint32_t until_ms) {
    const Rectangle place = desktop_.ScreenRectangle(buttons_[button]);
    desktop_.Click(place.left + 5, place.top + 5);
    Pump(until_ms);
  };
  click(2, 10);
  desktop_.EnableWindow(buttons_[1], false);
  click(1, 20);
  EXPECT_THAT(notes_, ElementsAre("command 13"));
  EXPECT_EQ(FocusedId(), 13);
}

TEST_F(DialogTest, APressCountsWhenTheReleaseIsOverTheButtonThatWasPressed) {
  const auto at = [&](std::size_t button) {
    const Rectangle place = desktop_.ScreenRectangle(buttons_[button]);
    return std::pair(place.left + 5, place.top + 5);
  };
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
      const auto [x, y] = at(c.path.front());
      desktop_.MouseButton(x, y, true);
      look();
      for (const std::size_t button : c.path) {
        desktop_.MouseMove(at(button).first, at(button).second);
        look();
      }
      EXPECT_EQ(desktop_.MakeScene().windows.at(3).pressed, c.counts && !busy);
      desktop_.MouseButton(at(c.path.back()).first, at(c.path.back()).second, false);
      Pump(time += 10);
      EXPECT_EQ(std::count(notes_.begin(), notes_.end(), "command 13"), c.counts ? 1 : 0);
      EXPECT_FALSE(desktop_.MakeScene().windows.at(3).pressed);
    }
  }
}

TEST_F(DialogTest, APartOfAScrollBarThatIsHeldAsksAgainWhileTheMouseIsOnIt) {
  WindowRequest request;
  request.className = "SCROLLBAR";
  request.style = style::kChild | style::kVisible | style::kScrollBarVertical;
  request.x = 200;
  request.width = 20;
  request.height = 200;
  request.parent = dialog_;
  const WindowHandle bar = desktop_.CreateWindow(request);
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
  desktop_.MouseButton(210, 100, true);  // the thumb, which follows the mouse
  desktop_.MouseMove(210, 116);
  Pump(2500);
  desktop_.MouseButton(210, 116, false);
  Pump(2600);
  EXPECT_THAT(requests, ElementsAre(scroll::kPageBack, scroll::kReleased, scroll::kThumbTrack, scroll::kThumbPosition,
                                    scroll::kReleased));
}

TEST_F(DialogTest, AnEntryFieldIsEditedAtItsCaretByWholeCharacters) {
  WindowRequest request;
  request.className = "EDIT";
  request.style = style::kChild | style::kVisible | style::kTabStop;
  request.parent = dialog_;
  const WindowHandle edit = desktop_.CreateWindow(request);
  desktop_.SetFocus(edit);
  constexpr std::uint32_t kHome = 0x24;
  constexpr std::uint32_t kEnd = 0x23;
  constexpr std::uint32_t kLeft = 0x25;
  constexpr std::uint32_t kRight = 0x27;
  constexpr std::uint32_t kDelete = 0x2E;
  constexpr std::uint32_t kBackspace = 0x08;
  struct Case {
    std::vector<std::uint32_t> keys;
    const char16_t* text;  // of "g😀r", with an X typed at the end
  };
  std::uint32_t time = 0;
  for (const Case& c :
       {Case{{}, u"g😀rX"}, Case{{kLeft}, u"g😀Xr"}, Case{{kLeft, kLeft}, u"gX😀r"}, Case{{kHome, kLeft}, u"Xg😀r"},
        Case{{kHome, kRight, kRight}, u"g😀Xr"}, Case{{kHome, kEnd}, u"g😀rX"}, Case{{kBackspace, kBackspace}, u"gX"},
        Case{{kHome, kRight, kDelete}, u"gXr"}, Case{{kDelete, kRight}, u"g😀rX"},
        Case{{kHome, kBackspace}, u"Xg😀r"}}) {
    SCOPED_TRACE(Utf8FromWide(c.text));
    desktop_.SetWindowText(edit, u"");
    for (const char16_t unit : std::u16string_view(u"g😀r")) {
      desktop_.Key('G', unit, false);
    }
    for (const std::uint32_t key : c.keys) {
      desktop_.Key(key, key == kBackspace ? u'\b' : u'\0', false);
    }
    desktop_.Key('X', u'X', false);
    Pump(time += 10);
    EXPECT_EQ(desktop_.WindowText(edit), c.text);
  }
  EXPECT_EQ(FocusedId(), 0);  // the letters that captions mark were typed
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
