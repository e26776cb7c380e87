// The keyboard in a dialog.
#include "platform/desktop/DialogTest.h"

namespace panelglow::platform::desktop {
namespace {

using ::testing::ElementsAre;

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

TEST_F(DialogTest, EnterWithoutAFocusedButtonPressesTheDefaultOne) {
  Pump(1);
  desktop_.EnableWindow(buttons_[0], false);  // the focused one: no focus is left
  EXPECT_EQ(desktop_.Focus(), 0U);
  notes_.clear();
  desktop_.Key(0x0D, 0, false);
  Pump(10);
  EXPECT_THAT(notes_, ElementsAre("command 12"));
}

TEST_F(DialogTest, ShiftAndTabWalkBackPastWhatIsDisabled) {
  ScreenEvent shiftTab;
  shiftTab.virtualKey = 0x09;
  shiftTab.shift = true;
  std::uint32_t time = 0;
  for (const bool enabled : {true, false}) {
    desktop_.EnableWindow(buttons_[1], enabled);
    desktop_.SetFocus(buttons_[2]);
    desktop_.Take(shiftTab);
    Pump(time += 10);
    EXPECT_EQ(FocusedId(), enabled ? 12 : 11);
  }
  desktop_.Take(shiftTab);
  Pump(time += 10);
  EXPECT_EQ(FocusedId(), 13);
}

TEST_F(DialogTest, ATextThatNoKeyTypedPressesNoButton) {
  ScreenEvent pasted;
  pasted.kind = ScreenEvent::Kind::kText;
  pasted.text = u"rg ";
  desktop_.Take(pasted);
  Pump(10);
  EXPECT_EQ(std::count_if(notes_.begin(), notes_.end(), [](const auto& note) { return note[0] == 'c'; }), 0);
  EXPECT_EQ(FocusedId(), 11);
}

}  // namespace
}  // namespace panelglow::platform::desktop
