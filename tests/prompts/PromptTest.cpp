// The prompts: what they show, where, and what ends them.
#include <gmock/gmock.h>

#include <map>

#include "prompts/Desk.h"
#include "prompts/PlainPrompt.h"

namespace panelglow::prompttest {
namespace {

namespace desktop = platform::desktop;
namespace message = platform::message;
namespace scroll = platform::scroll;

constexpr const char* kPromptLock = "_HalcyonPromptLock";

int Text(unsigned style) { return TextPrompt(u"text", u"title", style, nullptr, 0); }
int Image(unsigned style) { return ImagePrompt(u"text", u"title", style, u"", nullptr, 0); }

TEST(Prompt, GivesTheResultOfTheButtonThatIsPressedAndFocusesTheDefaultOne) {
  struct Case {
    unsigned style;
    const char16_t* focused;
    std::vector<int> results;
  };
  for (const Case& c : {Case{0, u"&OK", {5}}, Case{6, u"&OK", {5}}, Case{1, u"&OK", {5, 2}},
                        Case{2, u"&Ignore", {1, 6, 3}}, Case{3, u"&Yes", {7, 4, 2}}, Case{4, u"&Yes", {7, 4}},
                        Case{5, u"&Retry", {6, 2}}, Case{kPromptTopmost | 5, u"&Retry", {6, 2}}}) {
    for (const int result : c.results) {
      for (const auto show : {Text, Image}) {
        Desk desk;
        desk.At(50, [&] { desk.windows.Key(0x1B, 0, false); });  // Escape
        desk.PostAt(60, message::kClose);                        // a prompt is not left without an answer
        desk.At(100, [&] { EXPECT_EQ(desk.windows.WindowText(desk.windows.Focus()), c.focused) << c.style; });
        desk.ClickAt(200, 1000 + result);
        EXPECT_EQ(show(c.style), result);
        EXPECT_NEAR(desk.Now_ms(), 225, 25);  // a press needs nothing else to happen
        EXPECT_EQ(desk.Top(), 0U);
      }
    }
  }
}

TEST(Prompt, TimesOutOnlyWhenItIsTopmostAndOnlyOnce) {
  struct Case {
    unsigned style;
    unsigned seconds;
    int timeoutResult;
    int result;
    unsigned end_ms;
  };
  for (const Case& c : {Case{kPromptTopmost, 2, prompt_result::kRetry, prompt_result::kRetry, 2010},
                        Case{kPromptTopmost, 0, prompt_result::kRetry, prompt_result::kOk, 9000},
                        Case{kPromptTopmost, 2, prompt_result::kNone, prompt_result::kOk, 9000},
                        Case{0, 2, prompt_result::kRetry, prompt_result::kOk, 9000}}) {
    Desk desk;
    ThePromptState().timeoutSeconds = c.seconds;
    ThePromptState().timeoutResult = c.timeoutResult;
    desk.ClickAt(9000, 1005);
    if (c.end_ms < 9000) {
      desk.At(1500, [&] { EXPECT_EQ(desk.Painted<desktop::TextOperation>().at(0).text, u"1"); });
    }
    if (c.style == kPromptTopmost) {
      desk.At(2500, [&] { EXPECT_TRUE(desk.Painted<desktop::TextOperation>().empty()); });
    }
    EXPECT_EQ(Text(c.style), c.result);
    EXPECT_NEAR(desk.Now_ms(), c.end_ms, 20);
    desk.ClickAt(desk.Now_ms() + 8000, 1005);
    EXPECT_EQ(Text(c.style), prompt_result::kOk);  // the armed time was the first one's
  }
}

TEST(Prompt, RunsItsWorkerAgainUntilThatIsDone) {
  Desk desk;
  int runs = 0;
  const AutoWorker worker = [&](std::atomic<bool>& done) {
    platform::TheHost().clock.Sleep(100);  // longer than a tick: no second one is started meanwhile
    done = ++runs % 3 == 0;
  };
  EXPECT_EQ(ImagePrompt(u"", u"", kPromptTopmost, u"", worker, prompt_result::kRetry), prompt_result::kRetry);
  EXPECT_EQ(runs, 3);
  EXPECT_NEAR(desk.Now_ms(), 330, 30);
  EXPECT_EQ(ImagePrompt(u"", u"", kPromptTopmost, u"", worker, prompt_result::kNo), prompt_result::kNo);
  EXPECT_EQ(runs, 6);  // an image prompt does not take the last one's worker for its own
  ThePromptState().topmost = false;
  desk.ClickAt(desk.Now_ms() + 1000, 1005);
  EXPECT_EQ(TextPrompt(u"", u"", 0, worker, prompt_result::kNo), prompt_result::kOk);
  EXPECT_EQ(runs, 6);  // without ticks nothing starts it
}

TEST(Prompt, AsksAgainForAThreadOfItsWorkerThatDoesNotStart) {
  Desk desk;
  desk.sim.RefuseThreads(3);
  const AutoWorker worker = [](std::atomic<bool>& done) { done = true; };
  EXPECT_EQ(ImagePrompt(u"", u"", kPromptTopmost, u"", worker, prompt_result::kRetry), prompt_result::kRetry);
  EXPECT_NEAR(desk.Now_ms(), 50, 10);
}

TEST(Prompt, LeavesNothingOfItsInputToTheNextOne) {
  Desk desk;
  desk.At(100, [&] { desk.windows.KeyDown(0x0D, u'\r', false, false); });  // ends the first one
  desk.At(200, [&] {
    EXPECT_EQ(desk.windows.WindowText(desk.Top()), u"second");
    EXPECT_EQ(desk.windows.TopLevelWindows().size(), 1U);
    EXPECT_EQ(desk.windows.ForegroundWindow(), desk.Top());
    EXPECT_EQ(desk.windows.ControlId(desk.windows.Focus()), 1006);
    EXPECT_TRUE(desk.sim.IsMutexOwned(kPromptLock));
    desk.windows.KeyUp(0x0D, false);
    desk.windows.KeyDown(0x20, u' ', false, true);  // a Space that has been held since before
    desk.windows.KeyUp(0x20, false);
    const platform::Rectangle place = desk.windows.ScreenRectangle(desk.windows.FindControl(desk.Top(), 1006));
    desk.windows.MouseButton(place.left + 5, place.top + 5, false);  // a button that went down on the first one
  });
  desk.ClickAt(300, 1002);
  EXPECT_EQ(TextPrompt(u"text", u"first", 4, nullptr, 0), prompt_result::kYes);
  EXPECT_EQ(ImagePrompt(u"text", u"second", 5, u"", nullptr, 0), prompt_result::kCancel);
  EXPECT_NEAR(desk.Now_ms(), 310, 20);
  EXPECT_FALSE(desk.sim.IsMutexOwned(kPromptLock));
}

TEST(Prompt, OnceOneWasTopmostAllAre) {
  Desk desk;
  desk.At(50, [&] {
    EXPECT_EQ(desk.windows.WindowText(desk.Top()), u"C:\\bench\\panelglow-diags.exe");  // for want of a title
    EXPECT_TRUE(desk.sim.IsMutexOwned(kPromptLock));
  });
  desk.ClickAt(100, 1005);
  EXPECT_EQ(TextPrompt(u"text", u"", kPromptTopmost, nullptr, 0), prompt_result::kOk);
  EXPECT_TRUE(CDMWindow::TestPromptEvents(kPromptTick));
  ThePromptState().timeoutSeconds = 1;
  ThePromptState().timeoutResult = prompt_result::kIgnore;
  EXPECT_EQ(Text(0), prompt_result::kIgnore);
}

TEST(Prompt, KeepsTheForegroundExceptAgainstAWindowOfItsOwnTitle) {
  for (const char16_t* title : {u"another program", u"title"}) {
    Desk desk;
    desk.StartOther(title, 1500);
    WindowHandle own = 0;
    desk.At(400, [&] { own = desk.Top(); });
    desk.At(1000, [&] {
      EXPECT_EQ(desk.windows.TopLevelWindows().size(), 2U);
      EXPECT_EQ(desk.windows.ForegroundWindow() == own, wstring(title) != u"title");
    });
    // A window that is not ours, as the display tells of it, when the first one is gone.
    desk.At(1600, [&] { desk.windows.LoseForeground(title); });
    desk.At(1700, [&] { EXPECT_EQ(desk.windows.ForegroundWindow() == own, wstring(title) != u"title"); });
    desk.ClickAt(2000, 1005);
    EXPECT_EQ(Text(kPromptTopmost), prompt_result::kOk);
  }
}

TEST(Prompt, NotesDevicesThatComeAndGoUntilTheyAreCleared) {
  Desk desk;
  std::uint32_t seen = 0;
  for (const auto& [event, bit] : std::map<std::uintptr_t, std::uint32_t>{
           {7, kDeviceTreeChanged}, {0x8000, kDeviceArrived}, {0x8001, 0}, {0x8004, kDeviceRemoved}}) {
    desk.PostAt(desk.Now_ms() + 100, message::kDeviceChange, event);
    desk.ClickAt(desk.Now_ms() + 200, 1005);
    EXPECT_EQ(Text(0), prompt_result::kOk);
    seen |= bit;
    EXPECT_EQ(ThePromptState().promptEvents, seen);
    EXPECT_EQ(CDMWindow::TestPromptEvents(bit), bit != 0);
  }
  CDMWindow::ClearPromptEvents(kDeviceArrived);
  EXPECT_EQ(ThePromptState().promptEvents, kDeviceTreeChanged | kDeviceRemoved);
}

TEST(ImagePrompt, ScrollsByPixelsAndFollowsTheSizeOfItsWindowDownToALimit) {
  const TemporaryFile large("large.pgm", HalfBlack(1400, 1200));
  Desk desk;
  struct Step {
    std::uint32_t message;
    std::uint32_t request;
    std::uint32_t place;
    int x;  // of the picture in its area
    int y;
  };
  unsigned time_ms = 0;
  for (const Step& step : {Step{message::kHorizontalScroll, scroll::kLineBack, 0, 0, 0},
                           Step{message::kHorizontalScroll, scroll::kLineForward, 0, -1, 0},
                           Step{message::kVerticalScroll, scroll::kThumbTrack, 200, -1, -200},
                           Step{message::kHorizontalScroll, scroll::kStart, 0, 0, -200},
                           Step{message::kVerticalScroll, scroll::kEnd, 0, 0, -1200}}) {
    time_ms += 100;
    desk.PostAt(time_ms, step.message, step.place << 16U | step.request);
    desk.At(time_ms + 50, [&desk, step] {
      const auto picture = desk.Painted<desktop::ImageOperation>().at(0);
      EXPECT_EQ(picture.x, step.x);
      EXPECT_EQ(picture.y, step.y);
      EXPECT_EQ(picture.clip, (platform::Rectangle{0, 0, 1232, 886}));
    });
  }
  desk.At(1000, [&] { desk.windows.MoveWindow(desk.Top(), 0, 0, 708, 508); });
  desk.At(1100, [&] { EXPECT_EQ(desk.Painted<desktop::ImageOperation>().at(0).y, 0); });
  desk.ClickAt(1400, 1007);
  EXPECT_EQ(ImagePrompt(u"text", u"title", 4, large.WidePath(), nullptr, 0), prompt_result::kYes);
}

// ---- the prompt with two marked words

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

}  // namespace
}  // namespace panelglow::prompttest
