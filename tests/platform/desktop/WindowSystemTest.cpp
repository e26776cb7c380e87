// Message order, timers, focus and dialog keys, on a machine of virtual time.
#include "platform/desktop/WindowSystem.h"

#include <gmock/gmock.h>

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
    static const char16_t* const kCaptions[] = {u"&Red", u"Fish && Chips", u"&Green"};
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

TEST_F(DialogTest, PostedMessagesComeBeforeTimersAndPaintingComesLast) {
  Pump(1);
  notes_.clear();
  desktop_.Invalidate(dialog_);
  desktop_.SetTimer(dialog_, 7, 10, nullptr);
  machine_.Time().SleepFor(20'000);
  desktop_.Post({dialog_, message::kDeviceChange, 7, 0});
  desktop_.Post({dialog_, message::kDeviceChange, 8, 0});
  Pump(25);
  EXPECT_THAT(notes_, ElementsAre("device 7", "device 8", "timer 7", "paint"));
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
      {"Escape is command 2", 0x1B, 0, false, 0, 11, {"command 2"}},
      {"Alt and a letter press", 'G', u'g', true, 0, 13, {"command 13"}},
      {"a doubled ampersand is none", 'C', u'c', true, 0, 11, {}},
      {"a letter alone does nothing", 'G', u'g', false, 0, 11, {}},
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
