// The entry field.
#include "platform/Text.h"
#include "platform/desktop/DialogTest.h"
#include "platform/desktop/Keys.h"

namespace panelglow::platform::desktop {
namespace {

class EditTest : public DialogTest {
 protected:
  void SetUp() override {
    DialogTest::SetUp();
    edit_ = AddControl("EDIT", style::kTabStop, {0, 0, 100, 25});
    desktop_.SetFocus(edit_);
  }

  // Keys by letter; a small one is with Shift. X is typed.
  void Press(std::string_view keys) {
    const std::map<char, std::uint32_t> kKeys{{'L', key::kLeft}, {'R', key::kRight},  {'H', key::kHome},
                                              {'E', key::kEnd},  {'D', key::kDelete}, {'B', key::kBackspace},
                                              {'T', key::kTab},  {'X', 'X'}};
    for (const char letter : keys) {
      ScreenEvent event;
      event.virtualKey = kKeys.at(static_cast<char>(std::toupper(letter)));
      event.shift = std::islower(letter) != 0;
      event.character = letter == 'X' ? u'X' : letter == 'B' ? u'\b' : letter == 'D' ? u'\x7F' : u'\0';
      desktop_.Take(event);
    }
    Pump(time_ += 10);
  }

  void Paste(const std::u16string& text) {
    ScreenEvent event;
    event.kind = ScreenEvent::Kind::kText;
    event.text = text;
    desktop_.Take(event);
    Pump(time_ += 10);
  }

  WindowHandle edit_ = 0;
  std::uint32_t time_ = 0;
};

TEST_F(EditTest, KeysMoveSelectAndEraseWholeCharacters) {
  const std::pair<const char*, const char16_t*> kCases[] = {
      // of "g😀r", which is typed first
      {"X", u"g😀rX"},
      {"LX", u"g😀Xr"},
      {"LLX", u"gX😀r"},
      {"HLX", u"Xg😀r"},
      {"HRRX", u"g😀Xr"},
      {"HEX", u"g😀rX"},
      {"BBX", u"gX"},
      {"HRDX", u"gXr"},
      {"DRX", u"g😀rX"},
      {"HBX", u"Xg😀r"},
      // what is selected is replaced, and erased whole
      {"lX", u"g😀X"},
      {"llX", u"gX"},
      {"hX", u"X"},
      {"HeX", u"X"},
      {"llBX", u"gX"},
      {"llDX", u"gX"},
      {"hBBX", u"X"},
      // and is left to its ends
      {"llLX", u"gX😀r"},
      {"llRX", u"g😀rX"},
      {"HrrLX", u"Xg😀r"},
      {"HrrRX", u"g😀Xr"},
      {"hEX", u"g😀rX"},
      {"lrX", u"g😀rX"},
  };
  for (const auto& [keys, text] : kCases) {
    SCOPED_TRACE(keys);
    desktop_.SetWindowText(edit_, u"");
    Paste(u"g😀r");
    Press(keys);
    EXPECT_EQ(desktop_.WindowText(edit_), text);
  }
  EXPECT_EQ(FocusedId(), 0);  // the letters that captions mark were typed
}

TEST_F(EditTest, WhatIsSelectedIsInThePicture) {
  Paste(u"g😀r");
  Press("ll");
  const SceneWindow picture = desktop_.MakeScene().windows.back();
  EXPECT_EQ(picture.selectionBegin, 1U);
  EXPECT_EQ(picture.selectionEnd, 4U);
  EXPECT_EQ(picture.caret, 1U);
  desktop_.SetWindowText(edit_, u"g");
  EXPECT_EQ(desktop_.MakeScene().windows.back().selectionEnd, 0U);
}

TEST_F(EditTest, TabIntoTheFieldSelectsItsLineAndAClickDoesNot) {
  Paste(u"line");
  Press("TtX");
  EXPECT_EQ(desktop_.WindowText(edit_), u"X");
  desktop_.SetFocus(buttons_[0]);
  desktop_.Click(5, 5);
  Press("X");
  EXPECT_EQ(desktop_.WindowText(edit_), u"XX");
}

TEST_F(EditTest, ATextComesInWholeUpToItsFirstLineEnd) {
  for (const char16_t* text : {u"漢😀\tä", u"漢😀ä\r\nB", u"漢😀ä\nB"}) {
    desktop_.SetWindowText(edit_, u"ab");
    Press("Rr");
    Paste(text);
    EXPECT_EQ(desktop_.WindowText(edit_), u"a漢😀ä");
  }
}

}  // namespace
}  // namespace panelglow::platform::desktop
