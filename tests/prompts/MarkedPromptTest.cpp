// The prompt with two marked words.
#include <gmock/gmock.h>

#include "prompts/Desk.h"
#include "prompts/PromptWindow.h"

namespace panelglow::prompttest {
namespace {

namespace desktop = platform::desktop;

// What is painted: each piece, behind "G:" or "R:" where it is on green or red.
std::string Pieces(const std::vector<desktop::TextOperation>& painted) {
  std::string text;
  for (const desktop::TextOperation& piece : painted) {
    const char* mark = !piece.background ? "" : *piece.background == 0x00FF00 ? "G:" : "R:";
    text += (text.empty() ? "" : "|") + (mark + platform::Utf8FromWide(piece.text));
  }
  return text;
}

TEST(MarkedPrompt, PaintsItsMarksOnGreenAndRed) {
  struct Case {
    const char16_t* text;
    const char16_t* green;
    const char16_t* red;
    const char* pieces;  // empty: an ordinary text field
  };
  for (const Case& c :
       {Case{u"Press YES or NO, yes?", u"yes", u"no", "Press |G:YES| or |R:NO|, yes?"},
        Case{u"Press yes or No.", u"yes", u"No", "Press |G:yes| or |R:No|."},
        Case{u"NO or YES", u"yes", u"no", "R:NO| or |G:YES"}, Case{u"LED or LED", u"led", u"led", "G:LED| or |R:LED"},
        Case{u"YES\nNO", u"yes", u"no", "G:YES|R:NO"},
        Case{u"はいかいいえ", u"はい", u"いいえ", "G:はい|か|R:いいえ"}, Case{u"Press YES.", u"yes", u"no", ""},
        Case{u"Press NO.", u"yes", u"no", ""}, Case{u"", u"yes", u"no", ""}}) {
    SCOPED_TRACE(platform::Utf8FromWide(c.text));
    Desk desk;
    const auto look = [&] {
      EXPECT_EQ(Pieces(desk.Painted<desktop::TextOperation>()), c.pieces);
      const WindowHandle pane = desk.windows.Children(desk.Top()).back();
      EXPECT_EQ(desk.windows.WindowText(pane), c.text);
      EXPECT_EQ(desk.windows.ControlId(pane), *c.pieces == 0 ? 1000 : 0);
    };
    desk.At(100, look);
    desk.At(200, [&] { desk.windows.Invalidate(desk.windows.Children(desk.Top()).back()); });  // as after a cover
    desk.At(300, look);
    desk.ClickAt(400, 1005);
    EXPECT_EQ(MarkedPrompt(c.text, u"title", 0, c.green, c.red), prompt_result::kOk);
  }
}

TEST(MarkedPrompt, BreaksItsLinesInsideThePane) {
  const wstring wide(30, u'W');                   // wider than the average letter says
  const wstring pairs = u"😀😀😀😀😀😀😀😀😀😀😀😀😀😀😀😀😀😀😀😀";  // two units each, which stay together
  for (const wstring& text : {wstring(u"some words and "), wstring(40, u' '), wide + wide, wstring(40, u'漢'),
                              pairs + pairs, wstring(10'000, u'i')}) {
    Desk desk;
    desk.At(100, [&] {
      int y = 11;
      int right = 11;
      wstring whole;
      for (const desktop::TextOperation& piece : desk.Painted<desktop::TextOperation>()) {
        if (piece.area.top != y) {
          y += 16;
          right = 11;
        }
        EXPECT_EQ(piece.area.top, y);
        EXPECT_EQ(piece.area.left, right);
        right += desk.windows.MeasureText(piece.text, 10'000, piece.font).Width();
        EXPECT_LE(right, 338);
        EXPECT_LT(y, 268);
        EXPECT_NE(piece.text.front() & 0xFC00, 0xDC00);
        whole += piece.text;
      }
      EXPECT_EQ(whole.substr(0, 60), (text + u"YES or NO" + text).substr(0, 60));
      EXPECT_GT(y, 11);
    });
    desk.ClickAt(200, 1005);
    EXPECT_EQ(MarkedPrompt(text + u"YES or NO" + text, u"title", 0, u"yes", u"no"), prompt_result::kOk);
  }
}

TEST(MarkedPrompt, TimesOutLikeAnyPlainPrompt) {
  Desk desk;
  ThePromptState().timeoutSeconds = 2;
  ThePromptState().timeoutResult = prompt_result::kNo;
  desk.At(1500, [&] { EXPECT_EQ(Pieces(desk.Painted<desktop::TextOperation>()), "G:YES| or |R:NO|1"); });
  EXPECT_EQ(MarkedPrompt(u"YES or NO", u"title", 4 | kPromptTopmost, u"yes", u"no"), prompt_result::kNo);
  EXPECT_NEAR(desk.Now_ms(), 2010, 20);
}

}  // namespace
}  // namespace panelglow::prompttest
