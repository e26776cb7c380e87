// The prompts: what they show, where, and what ends them.
#include <gmock/gmock.h>

#include <map>

#include "prompts/Desk.h"
#include "prompts/PromptWindow.h"

namespace panelglow::prompttest {
namespace {

using ::testing::HasSubstr;

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
        desk.At(100, [&] { EXPECT_EQ(desk.windows.WindowText(desk.windows.Focus()), c.focused) << c.style; });
        desk.ClickAt(200, 1000 + result);
        EXPECT_EQ(show(c.style), result);
        EXPECT_LT(desk.Now_ms(), 250U);  // a press needs nothing else to happen
        EXPECT_EQ(desk.Top(), 0U);
      }
    }
  }
}

TEST(Prompt, IsAnsweredByKeysButNotLeftWithoutAnAnswer) {
  struct Case {
    std::uint32_t key;
    char16_t character;
    bool alt;
    int result;
  };
  for (const Case& c : {Case{0x0D, 0, false, prompt_result::kYes}, Case{'N', u'n', true, prompt_result::kNo},
                        Case{'C', u'c', true, prompt_result::kCancel}}) {
    Desk desk;
    desk.At(100, [&] { desk.windows.Key(0x1B, 0, false); });  // Escape
    desk.PostAt(200, message::kClose);
    desk.At(300, [&] { desk.windows.Key(c.key, c.character, c.alt); });
    EXPECT_EQ(Text(3), c.result);
    EXPECT_GE(desk.Now_ms(), 300U);
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
      desk.At(1500, [&] {
        const auto countDown = desk.Painted<platform::desktop::TextOperation>().at(0);
        EXPECT_EQ(countDown.text, u"1");
        EXPECT_EQ(countDown.area, (platform::Rectangle{96, 255, 96, 255}));  // of the text field, which is there
      });
    }
    if (c.style == kPromptTopmost) {
      desk.At(2500, [&] { EXPECT_TRUE(desk.Painted<platform::desktop::TextOperation>().empty()); });
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

TEST(Prompt, OnceOneWasTopmostAllAre) {
  Desk desk;
  desk.ClickAt(100, 1005);
  EXPECT_EQ(Text(kPromptTopmost), prompt_result::kOk);
  EXPECT_TRUE(CDMWindow::TestPromptEvents(kPromptTick));
  ThePromptState().timeoutSeconds = 1;
  ThePromptState().timeoutResult = prompt_result::kIgnore;
  EXPECT_EQ(Text(0), prompt_result::kIgnore);
}

TEST(Prompt, KeepsTheForegroundExceptAgainstAWindowOfItsOwnTitle) {
  for (const char16_t* title : {u"another program", u"title"}) {
    Desk desk;
    WindowHandle other = 0;
    platform::TheHost().threads.Start("another program", [&] {
      platform::TheHost().clock.Sleep(500);
      desk.windows.RegisterWindowClass({"other", 0, 0, 0, nullptr});
      platform::WindowRequest request;
      request.className = "other";
      request.text = title;
      request.style = platform::style::kPopup | platform::style::kVisible;
      other = desk.windows.CreateWindow(request);
      platform::TheHost().clock.Sleep(1000);
    });
    desk.At(1000, [&] {
      ASSERT_NE(other, 0U);
      EXPECT_EQ(desk.windows.ForegroundWindow() == other, wstring(title) == u"title");
    });
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

TEST(Prompt, WaitsForThePromptOfAnotherProcess) {
  Desk desk("[[peer]]\nmutex = '_HalcyonPromptLock'\nuntil_ms = 3000\n");
  desk.At(2900, [&] { EXPECT_EQ(desk.Top(), 0U); });
  desk.At(3100, [&] {
    EXPECT_TRUE(desk.sim.IsMutexOwned(kPromptLock));
    EXPECT_EQ(desk.windows.WindowText(desk.Top()), u"C:\\bench\\panelglow-diags.exe");  // for want of a title
  });
  desk.ClickAt(4000, 1005);
  EXPECT_EQ(TextPrompt(u"text", u"", 0, nullptr, 0), prompt_result::kOk);
  EXPECT_FALSE(desk.sim.IsMutexOwned(kPromptLock));
}

TEST(Prompt, EndsAtOnceWhereNoWindowCanBeHad) {
  Desk desk;
  desk.windows.RegisterWindowClass(
      {"PromptWindowClassName", 0, 0, 0, [](const platform::Message&) -> std::intptr_t { return -1; }});
  EXPECT_EQ(Image(kPromptTopmost), prompt_result::kNone);
  EXPECT_THAT(desk.sim.Output(), HasSubstr("LogMessage 8 20000 \"A prompt cannot be shown"));
  EXPECT_FALSE(desk.sim.IsMutexOwned(kPromptLock));
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
                           Step{message::kVerticalScroll, scroll::kLineBack, 0, -1, -199},
                           Step{message::kHorizontalScroll, scroll::kStart, 0, 0, -199},
                           Step{message::kVerticalScroll, scroll::kEnd, 0, 0, -1200}}) {
    time_ms += 100;
    desk.PostAt(time_ms, step.message, step.place << 16U | step.request);
    desk.At(time_ms + 50, [&desk, step] {
      const auto picture = desk.Painted<platform::desktop::ImageOperation>().at(0);
      EXPECT_EQ(picture.x, step.x);
      EXPECT_EQ(picture.y, step.y);
      EXPECT_EQ(picture.clip, (platform::Rectangle{0, 0, 1232, 886}));
    });
  }
  desk.At(1000, [&] { desk.windows.MoveWindow(desk.Top(), 0, 0, 708, 508); });
  desk.At(1100, [&] { EXPECT_EQ(desk.Painted<platform::desktop::ImageOperation>().at(0).y, 0); });
  desk.At(1200, [&] { desk.windows.MoveWindow(desk.Top(), 0, 0, 100, 100); });
  desk.At(1300, [&] { EXPECT_EQ(desk.Describe(desk.Top()), "title 0,0 540x300"); });
  desk.ClickAt(1400, 1007);
  EXPECT_EQ(ImagePrompt(u"text", u"title", 4, large.WidePath(), nullptr, 0), prompt_result::kYes);
}

}  // namespace
}  // namespace panelglow::prompttest
