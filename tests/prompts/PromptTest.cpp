// The prompts: what they show, where, and what ends them.
#include <gmock/gmock.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <map>

#include "prompts/Desk.h"
#include "prompts/DiagnosticWindow.h"
#include "prompts/PromptWindow.h"

namespace panelglow::prompttest {
namespace {

using ::testing::HasSubstr;

namespace message = platform::message;
namespace scroll = platform::scroll;

constexpr const char* kPromptLock = "_HalcyonPromptLock";

int Text(unsigned style) { return TextPrompt(u"text", u"title", style, nullptr, 0); }
int Image(unsigned style) { return ImagePrompt(u"text", u"title", style, u"", nullptr, 0); }

TEST(Prompt, ShowsTheButtonsOfItsStyleAndGivesTheResultOfTheOneThatIsPressed) {
  struct Case {
    int (*show)(unsigned style);
    const char* locale;
    unsigned style;
    const char* buttons;
    const char* focused;
    std::vector<int> results;
  };
  const Case kCases[] = {
      {Text, "en_US", 0, "&OK 365,10 80x25", "&OK", {5}},
      {Text, "en_US", 6, "&OK 365,10 80x25", "&OK", {5}},
      {Text, "en_US", 1, "&OK 365,10 80x25 | &Cancel 365,40 80x25", "&OK", {5, 2}},
      {Text, "ko_KR", 2, "&Abort 365,10 126x25 | &Retry 365,40 126x25 | &Ignore 365,70 126x25", "&Ignore", {1, 6, 3}},
      {Text, "en_US", 3, "&Yes 365,10 80x25 | &No 365,40 80x25 | &Cancel 365,70 80x25", "&Yes", {7, 4, 2}},
      {Text, "zh_TW", 5, "&Retry 365,10 126x25 | &Cancel 365,40 126x25", "&Retry", {6, 2}},
      {Image, "en_US", 0, "&OK 221,267 90x25", "&OK", {5}},
      {Image, "en_US", 1, "&OK 37,267 210x25 | &Cancel 284,267 210x25", "&OK", {5, 2}},
      {Image, "ja_JP", 2, "&Abort 38,267 126x25 | &Retry 202,267 126x25 | &Ignore 366,267 126x25", "&Ignore", {6}},
      {Image, "en_US", 3, "&Yes 0,267 177x25 | &No 177,267 177x25 | &Cancel 354,267 177x25", "&Yes", {7, 2}},
      {Image, "de_DE", 4, "&Yes 97,267 120x25 | &No 314,267 120x25", "&Yes", {7, 4}},
  };
  for (const Case& c : kCases) {
    for (const int result : c.results) {
      SCOPED_TRACE(std::string(c.buttons) + ", result " + std::to_string(result));
      Desk desk;
      desk.locale = c.locale;
      desk.At(100, [&] {
        EXPECT_EQ(desk.Controls(true), c.buttons);
        EXPECT_EQ(platform::Utf8FromWide(desk.windows.WindowText(desk.windows.Focus())), c.focused);
      });
      desk.ClickAt(200, 1000 + result);
      EXPECT_EQ(c.show(c.style), result);
      EXPECT_LT(desk.Now_ms(), 250U);  // a press needs nothing else to happen
      EXPECT_EQ(desk.Top(), 0U);
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
        EXPECT_EQ(countDown.area, (platform::Rectangle{107, 266, 107, 266}));
      });
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
  desk.At(2900, [&] { EXPECT_EQ(desk.Controls(true), ""); });
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

// A black picture file of a size, gone with the object.
class Picture {
 public:
  Picture(int width, int height)
      : path_(std::filesystem::temp_directory_path() /
              ("panelglow-" + std::to_string(::getpid()) + "-" + std::to_string(width) + ".pbm")) {
    const auto bytes = static_cast<std::size_t>((width + 7) / 8 * height);
    std::ofstream(path_, std::ios::binary) << "P4\n" << width << " " << height << "\n" << std::string(bytes, '\xFF');
  }
  ~Picture() { std::filesystem::remove(path_); }
  Picture(const Picture&) = delete;
  Picture& operator=(const Picture&) = delete;
  [[nodiscard]] wstring Path() const { return platform::WideFromUtf8(path_.string()); }

 private:
  std::filesystem::path path_;
};

TEST(ImagePrompt, LaysOutTextPictureAndBarsByWhatThereIs) {
  const Picture fitting(600, 400);
  const Picture large(1400, 1200);
  struct Case {
    wstring text;
    wstring path;
    const char* window;
    const char* panes;  // text, image area, horizontal bar, vertical bar
  };
  const Case kCases[] = {
      {u"text", u"", "title 370,362 540x300", "text 10,10 492x252"},
      {u"text", u"none.png", "title 370,362 540x300",
       "text 10,202 492x60 | none.png 10,10 492x162 |  10,172 502x20 hidden |  512,10 20x162 hidden"},
      {u"", u"none.png", "title 370,362 540x300",
       "none.png 10,10 492x242 |  10,242 502x20 hidden |  512,10 20x242 hidden"},
      {u"text", fitting.Path(), "title 315,242 650x540",
       "text 10,442 602x60 |  10,10 602x402 |  10,412 612x20 hidden |  622,10 20x402 hidden"},
      {u"text", large.Path(), "title 0,0 1280x1024",
       "text 10,926 1232x60 |  10,10 1232x886 |  10,896 1242x20 |  1252,10 20x886"},
  };
  for (const Case& c : kCases) {
    Desk desk;
    desk.At(100, [&] {
      EXPECT_EQ(desk.Describe(desk.Top()), c.window);
      EXPECT_EQ(desk.Controls(false), c.panes);
    });
    desk.ClickAt(200, 1005);
    EXPECT_EQ(ImagePrompt(c.text, u"title", 0, c.path, nullptr, 0), prompt_result::kOk);
    const bool failed = c.path == u"none.png";
    EXPECT_EQ(desk.sim.Output(), failed ? "LogMessage 14 8 \"Error Loading Image File.\" \"\"\n" : "");
  }
}

TEST(ImagePrompt, ScrollsByPixelsAndFollowsTheSizeOfItsWindowDownToALimit) {
  const Picture large(1400, 1200);
  Desk desk;
  struct Step {
    std::uint32_t message;
    std::uint32_t request;
    std::uint32_t place;
    int x;  // of the picture in the window
    int y;
  };
  unsigned time_ms = 0;
  for (const Step& step : {Step{message::kHorizontalScroll, scroll::kLineBack, 0, 10, 10},
                           Step{message::kHorizontalScroll, scroll::kLineForward, 0, 9, 10},
                           Step{message::kVerticalScroll, scroll::kThumbTrack, 200, 9, -190},
                           Step{message::kVerticalScroll, scroll::kLineBack, 0, 9, -189},
                           Step{message::kHorizontalScroll, scroll::kStart, 0, 10, -189},
                           Step{message::kVerticalScroll, scroll::kEnd, 0, 10, -1190}}) {
    time_ms += 100;
    desk.PostAt(time_ms, step.message, step.place << 16U | step.request);
    desk.At(time_ms + 50, [&desk, step] {
      const auto picture = desk.Painted<platform::desktop::ImageOperation>().at(0);
      EXPECT_EQ(picture.x, step.x);
      EXPECT_EQ(picture.y, step.y);
      EXPECT_EQ(picture.clip, (platform::Rectangle{10, 10, 1242, 896}));
    });
  }
  desk.At(1000, [&] { desk.windows.MoveWindow(desk.Top(), 0, 0, 708, 508); });
  desk.At(1100, [&] {
    EXPECT_EQ(desk.Controls(false), "text 10,410 660x60 |  10,10 660x370 |  10,380 670x20 |  680,10 20x370");
    EXPECT_EQ(desk.Controls(true), "&Yes 153,475 120x25 | &No 426,475 120x25");
    EXPECT_EQ(desk.Painted<platform::desktop::ImageOperation>().at(0).y, 10);
  });
  desk.At(1200, [&] { desk.windows.MoveWindow(desk.Top(), 0, 0, 100, 100); });
  desk.At(1300, [&] { EXPECT_EQ(desk.Describe(desk.Top()), "title 0,0 540x300"); });
  desk.ClickAt(1400, 1007);
  EXPECT_EQ(ImagePrompt(u"text", u"title", 4, large.Path(), nullptr, 0), prompt_result::kYes);
}

TEST(DiagnosticConfiguration, TakesTheBackgroundFromTheFileOrFromTheSystem) {
  struct Case {
    const char* content;
    platform::Color background;
  };
  for (const Case& c : {Case{"[WindowSettings]\nBackgroundColor=255\n", 0x0000FF},
                        Case{"[WindowSettings]\nBackgroundColor=0x00FF00 ; green\n", 0x00FF00},
                        Case{"[WindowSettings]\nBackgroundColor=\n", platform::kButtonFaceColor},
                        Case{"[WindowSettings]\nBackgroundColor=4294967295\n", platform::kButtonFaceColor},
                        Case{"[WindowSettings]\nBackgroundColor=red\n", 0},
                        Case{"[Others]\nBackgroundColor=255\n", platform::kButtonFaceColor}}) {
    Desk desk;
    desk.sim.DiskFiles().Put(".\\diagconf.ini", c.content);
    EXPECT_EQ(DiagnosticConfiguration(".\\diagconf.ini").GetBackgroundBrush(), c.background) << c.content;
    EXPECT_EQ(DiagnosticConfiguration(".\\none.ini").GetBackgroundBrush(), platform::kButtonFaceColor);
  }
}

TEST(DiagnosticWindow, EndsWithinFiveSecondsWhenTheRunIsToldToStop) {
  for (const bool image : {false, true}) {
    Desk desk;
    desk.At(7000, [&] { desk.stopRequested = true; });
    DiagnosticWindow window(".\\diagconf.ini");
    EXPECT_EQ(image ? window.ImageForm(u"text", u"title", 0, u"") : window.TextForm(u"text", u"title", 0),
              prompt_result::kTerminated);
    EXPECT_NEAR(desk.Now_ms(), 9500, 2500);
  }
}

TEST(DiagnosticWindow, HasItsColorItsOwnTopmostFlagAndNeitherTimeOutNorDeviceEvents) {
  Desk desk;
  desk.sim.DiskFiles().Put(".\\diagconf.ini", "[WindowSettings]\nBackgroundColor=255\n");
  ThePromptState().timeoutSeconds = 1;
  desk.PostAt(500, message::kDeviceChange, 0x8000);
  desk.At(3000, [&] { EXPECT_EQ(desk.windows.MakeScene().windows.at(0).background, 255U); });
  desk.ClickAt(4000, 1002);
  EXPECT_EQ(DiagnosticWindow(".\\diagconf.ini").TextForm(u"text", u"title", 1 | kPromptTopmost),
            prompt_result::kCancel);
  EXPECT_EQ(ThePromptState().promptEvents, 0U);
  EXPECT_FALSE(ThePromptState().topmost);
  EXPECT_EQ(ThePromptState().timeoutSeconds, 1U);  // still armed for the next plain one
}

}  // namespace
}  // namespace panelglow::prompttest
