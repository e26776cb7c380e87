// The message window and the window for entering a line.
#include <gmock/gmock.h>

#include "prompts/Desk.h"
#include "prompts/DiagnosticWindow.h"
#include "prompts/MessageWindow.h"
#include "prompts/PlainPrompt.h"
#include "prompts/TextWindow.h"

namespace panelglow::prompttest {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;

namespace message = platform::message;

constexpr const char* kPromptLock = "_HalcyonPromptLock";

WindowHandle Inner(Desk& desk) {
  const std::vector<WindowHandle> children = desk.windows.Children(desk.Top());
  return children.empty() ? 0 : children.front();
}

std::vector<std::string> PaintedTexts(Desk& desk) {
  std::vector<std::string> texts;
  for (const auto& text : desk.Painted<platform::desktop::TextOperation>()) {
    texts.push_back(platform::Utf8FromWide(text.text) + " " + std::to_string(text.area.left) + "," +
                    std::to_string(text.area.top));
  }
  return texts;
}

TEST(MessageWindow, CountsDownAndEndsByItself) {
  Desk desk;
  desk.At(50, [&] {
    EXPECT_EQ(desk.Describe(desk.Top()), "title 370,367 540x290");
    EXPECT_EQ(desk.Describe(Inner(desk)),
              "_Halcyon_Test_ 53,28 432x232");  // in the client area, behind a border of 1
    EXPECT_EQ(desk.windows.ControlId(Inner(desk)), 1000);
    EXPECT_THAT(PaintedTexts(desk), ElementsAre("text 0,0", "3 215,172"));
    EXPECT_TRUE(desk.sim.IsMutexOwned(kPromptLock));
  });
  for (const auto& [time_ms, number] : {std::pair{150U, "2 215,172"}, {1150U, "1 215,172"}, {2150U, "0 215,172"}}) {
    desk.At(time_ms, [&desk, number = number] { EXPECT_EQ(PaintedTexts(desk).back(), number); });
  }
  EXPECT_EQ(ShowMessageWindow(u"text", u"title", 3, nullptr), -2);
  EXPECT_NEAR(desk.Now_ms(), 3100, 10);
  EXPECT_EQ(desk.Top(), 0U);
  EXPECT_FALSE(desk.sim.IsMutexOwned(kPromptLock));
}

TEST(MessageWindow, SwallowsTheKeyboardAndKeepsTheFocusUntilItIsClosed) {
  Desk desk;
  std::vector<std::uint32_t> seen;
  desk.At(500, [&] {
    for (const std::uint32_t key : {0x0DU, 0x1BU, 0x20U}) {
      desk.windows.Key(key, static_cast<char16_t>(key), false);
    }
  });
  desk.At(550, [&] { desk.windows.SetFocus(0); });
  desk.At(700, [&] {
    EXPECT_EQ(desk.windows.Focus(), Inner(desk));
    EXPECT_THAT(PaintedTexts(desk), ElementsAre("text 0,0"));  // no limit, so no number
    desk.windows.Post({Inner(desk), message::kClose, 0, 0});
  });
  const auto hook = [&](const platform::Message& m) -> std::intptr_t {
    seen.push_back(m.id);
    return 1;
  };
  EXPECT_EQ(ShowMessageWindow(u"text", u"title", 0, hook), 2);
  EXPECT_NEAR(desk.Now_ms(), 700, 10);
  EXPECT_EQ(seen.front(), message::kCreate);
  EXPECT_EQ(seen.back(), message::kDestroy);
  EXPECT_EQ(std::count(seen.begin(), seen.end(), message::kKeyDown), 3);  // all came here, none did anything
}

TEST(MessageWindow, IsEndedByItsHookWhichFinishesWhatItAnswersWithZero) {
  Desk desk;
  int ticks = 0;
  const auto hook = [&](const platform::Message& m) -> std::intptr_t {
    if (m.id != message::kTimer) {
      return 1;
    }
    if (++ticks == 20) {
      desk.windows.DestroyWindow(m.window);
    }
    return 0;  // the window's own count-down does not run
  };
  EXPECT_EQ(ShowMessageWindow(u"text", u"title", 1, hook), 1);
  EXPECT_NEAR(desk.Now_ms(), 2000, 10);
}

// Types a line at a time, one character each 100 ms.
void TypeAt(Desk& desk, unsigned time_ms, const char* line) {
  for (const char* at = line; *at != 0; ++at, time_ms += 100) {
    desk.At(time_ms, [&desk, c = *at] { desk.windows.Key(0x41, static_cast<char16_t>(c), false); });
  }
}
void PressEnterAt(Desk& desk, unsigned time_ms) {
  desk.At(time_ms, [&desk] { desk.windows.Key(0x0D, u'\r', false); });
}

TEST(TextWindow, GivesTheLineToItsButtonAndToTheEnterKey) {
  enum class Way { kEnter, kClick, kEnterOnButton };
  for (const Way way : {Way::kEnter, Way::kClick, Way::kEnterOnButton}) {
    Desk desk;
    desk.At(50, [&] {
      EXPECT_EQ(desk.Layout(), "title 370,367 540x290; 1005: 245,255 50x25; 1100: 120,190 300x25; 0: 10,10 520x140");
      EXPECT_EQ(desk.windows.ControlId(desk.windows.Focus()), 1100);
      EXPECT_TRUE(desk.sim.IsMutexOwned(kPromptLock));
    });
    TypeAt(desk, 100, "AB-12");
    desk.At(700, [&] { desk.windows.Key(0x1B, 0, false); });  // Escape ends nothing
    desk.PostAt(800, message::kClose);
    if (way == Way::kEnterOnButton) {
      desk.At(900, [&] { desk.windows.Key(0x09, 0, false); });  // Tab
    }
    way == Way::kClick ? desk.ClickAt(1000, 1005) : PressEnterAt(desk, 1000);
    std::string entered = "before";
    EXPECT_EQ(ShowTextWindow(u"text", u"title", entered, 2000),
              way == Way::kEnter ? prompt_result::kNone : prompt_result::kOk);
    EXPECT_EQ(entered, "AB-12");
    EXPECT_NEAR(desk.Now_ms(), 1000, 10);
    EXPECT_EQ(desk.Top(), 0U);
    EXPECT_FALSE(desk.sim.IsMutexOwned(kPromptLock));
  }
}

TEST(TextWindow, WipesWhatIsNotGoneOnWithInTime) {
  Desk desk;
  TypeAt(desk, 100, "slow");  // each character gives 300 ms more
  desk.At(650, [&] { EXPECT_EQ(desk.windows.WindowText(desk.windows.FindControl(desk.Top(), 1100)), u"slow"); });
  desk.At(750, [&] { EXPECT_EQ(desk.windows.WindowText(desk.windows.FindControl(desk.Top(), 1100)), u""); });
  TypeAt(desk, 1000, "fast");
  PressEnterAt(desk, 1350);
  std::string entered;
  EXPECT_EQ(ShowTextWindow(u"text", u"title", entered, 300), prompt_result::kNone);
  EXPECT_EQ(entered, "fast");
}

TEST(TextWindow, TakesAtMost255CharactersInTheSystemsCodePage) {
  Desk desk;
  desk.At(100, [&] {
    desk.windows.Key(0x41, u'ä', false);
    for (int i = 0; i < 300; ++i) {
      desk.windows.Key(0x41, u'漢', false);
    }
  });
  PressEnterAt(desk, 1000);
  std::string entered;
  EXPECT_EQ(ShowTextWindow(u"text", u"title", entered, 5000), prompt_result::kNone);
  EXPECT_EQ(entered, "\xE4" + std::string(254, '?'));
}

TEST(TextWindow, GivesTheFocusToItsFieldAndLeavesTheLineAloneWhenTheThreadIsToQuit) {
  Desk desk;
  desk.At(100, [&] { desk.windows.SetFocus(desk.windows.FindControl(desk.Top(), 1005)); });
  desk.PostAt(200, message::kSetFocus);
  desk.At(300, [&] { EXPECT_EQ(desk.windows.ControlId(desk.windows.Focus()), 1100); });
  desk.At(400, [&] { desk.windows.PostQuit(); });
  std::string entered = "before";
  EXPECT_EQ(ShowTextWindow(u"text", u"title", entered, 500), prompt_result::kNone);
  EXPECT_EQ(entered, "before");
}

TEST(EachWindow, EndsAtOnceWhereNoWindowCanBeHad) {
  Desk desk;
  const auto refuse = [](const platform::Message&) -> std::intptr_t { return -1; };
  std::string entered = "before";
  const std::tuple<const char*, std::function<int()>, int> kCases[] = {
      {"MessageWindowClassName", [] { return ShowMessageWindow(u"text", u"title", 0, nullptr); }, 1},
      {"TextWindowClassName", [&] { return ShowTextWindow(u"text", u"title", entered, 500); }, prompt_result::kNone},
      {"PromptWindowClassName", [] { return TextPrompt(u"", u"", kPromptTopmost, nullptr, 0); },
       prompt_result::kNone},
  };
  for (const auto& [className, show, result] : kCases) {
    desk.windows.RegisterWindowClass({className, 0, 0, 0, refuse});
    desk.sim.ClearOutput();
    EXPECT_EQ(show(), result);
    EXPECT_THAT(desk.sim.Output(), HasSubstr("LogMessage 8 20000 \"A prompt cannot be shown"));
    EXPECT_EQ(desk.Top(), 0U);
    EXPECT_FALSE(desk.sim.IsMutexOwned(kPromptLock));
  }
  EXPECT_EQ(entered, "before");
}

TEST(EachWindow, EndsWithoutAnAnswerWhenTheDisplayGoesAway) {
  std::string entered = "before";
  const std::pair<std::function<int()>, int> kCases[] = {
      {[] { return ShowMessageWindow(u"text", u"title", 0, nullptr); }, 1},
      {[&] { return ShowTextWindow(u"text", u"title", entered, 5000); }, prompt_result::kNone},
      {[] { return TextPrompt(u"", u"", 0, nullptr, 0); }, prompt_result::kNone},
      {[] { return ImagePrompt(u"", u"", kPromptTopmost, u"", nullptr, 0); }, prompt_result::kNone},
      {[] { return DiagnosticWindow("").TextForm(u"", u"", 0); }, prompt_result::kNone},
  };
  for (const auto& [show, result] : kCases) {
    Desk desk;
    desk.At(500, [&] { desk.windows.LoseScreen(); });
    EXPECT_EQ(show(), result);
    EXPECT_NEAR(desk.Now_ms(), 500, 10);
    EXPECT_FALSE(desk.sim.IsMutexOwned(kPromptLock));
    EXPECT_EQ(show(), result);  // and the next one is not shown at all
    EXPECT_NEAR(desk.Now_ms(), 500, 10);
  }
  EXPECT_EQ(entered, "before");
}

}  // namespace
}  // namespace panelglow::prompttest
