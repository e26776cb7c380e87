// Where the prompts put their controls.
#include <gmock/gmock.h>

#include "prompts/Desk.h"
#include "prompts/DiagnosticWindow.h"
#include "prompts/PlainPrompt.h"

namespace panelglow::prompttest {
namespace {

using ::testing::HasSubstr;

TEST(ImagePrompt, LaysOutItsControlsForStyleLanguageImageAndSize) {
  const TemporaryFile fitting("fitting.pgm", HalfBlack(600, 400));
  const TemporaryFile large("larger.pgm", HalfBlack(1400, 1200));
  const TemporaryFile small("small.pgm", HalfBlack(40, 30));
  struct Form {
    unsigned style;
    const char* locale;
    std::string image;
    const char16_t* text;
  };
  const struct {
    Form form;
    const char* layout;
    std::pair<int, int> size;  // that the window is then given
    const char* layoutThen;
  } kCases[] = {
      {{0, "en_US", "", u"text"},
       "title 370,362 540x300; 1005: 221,267 90x25; 1000: 10,10 492x252",
       {708, 508},
       "title 0,0 708x508; 1005: 305,475 90x25; 1000: 10,10 660x460"},
      {{1, "de_DE", "none.png", u"text"},
       "title 370,362 540x300; 1005: 37,267 210x25; 1002: 284,267 210x25; 1000: 10,202 492x60; "
       "1008: 10,10 492x162; 0: 10,172 502x20 hidden; 0: 512,10 20x162 hidden",
       {500, 540},
       "title 0,0 540x540; 1005: 37,507 210x25; 1002: 284,507 210x25; 1000: 10,442 492x60; 1008: 10,10 492x402; "
       "0: 10,412 502x20 hidden; 0: 512,10 20x402 hidden"},
      {{2, "ja_JP", fitting.Path(), u""},
       "title 315,242 650x540; 1001: 66,507 126x25; 1006: 258,507 126x25; 1003: 450,507 126x25; "
       "1008: 10,10 602x482; 0: 10,482 612x20 hidden; 0: 622,10 20x482 hidden",
       {560, 421},
       "title 0,0 560x421; 1001: 43,388 126x25; 1006: 212,388 126x25; 1003: 381,388 126x25; "
       "1008: 10,10 512x363; 0: 10,363 522x20; 0: 532,10 20x363"},
      {{3, "zh_CN", large.Path(), u"text"},
       "title 0,0 1280x1024; 1007: 223,991 126x25; 1004: 572,991 126x25; 1002: 921,991 126x25; "
       "1000: 10,926 1232x60; 1008: 10,10 1232x886; 0: 10,896 1242x20; 0: 1252,10 20x886",
       {708, 508},
       "title 0,0 708x508; 1007: 80,475 126x25; 1004: 286,475 126x25; 1002: 492,475 126x25; "
       "1000: 10,410 660x60; 1008: 10,10 660x370; 0: 10,380 670x20; 0: 680,10 20x370"},
      {{5, "ko_KR", small.Path(), u"text"},
       "title 370,362 540x300; 1006: 93,267 126x25; 1002: 312,267 126x25; 1000: 10,202 492x60; "
       "1008: 10,10 492x162; 0: 10,172 502x20 hidden; 0: 512,10 20x162 hidden",
       {1003, 421},
       "title 0,0 1003x421; 1006: 247,388 126x25; 1002: 620,388 126x25; 1000: 10,323 955x60; "
       "1008: 10,10 955x283; 0: 10,293 965x20 hidden; 0: 975,10 20x283 hidden"},
      {{6, "zh_TW", fitting.Path(), u"text"},
       "title 315,242 650x540; 1005: 281,507 80x25; 1000: 10,442 602x60; 1008: 10,10 602x402; "
       "0: 10,412 612x20 hidden; 0: 622,10 20x402 hidden",
       {100, 100},
       "title 0,0 540x300; 1005: 226,267 80x25; 1000: 10,202 492x60; 1008: 10,10 492x162; 0: 10,172 502x20; "
       "0: 512,10 20x162"},
  };
  for (const auto& [form, layout, size, layoutThen] : kCases) {
    SCOPED_TRACE(layout);
    Desk desk;
    desk.locale = form.locale;
    desk.At(100, [&, layout = layout] { EXPECT_EQ(desk.Layout(), layout); });
    desk.At(200, [&, size = size] { desk.windows.MoveWindow(desk.Top(), 0, 0, size.first, size.second); });
    desk.At(300, [&, layoutThen = layoutThen] { EXPECT_EQ(desk.Layout(), layoutThen); });
    desk.PostAt(400, platform::message::kCommand, 1005);
    const wstring path = platform::WideFromUtf8(form.image);
    form.style % 2 == 0 ? ImagePrompt(form.text, u"title", form.style, path, nullptr, 0)
                        : DiagnosticWindow("").ImageForm(form.text, u"title", form.style, path);
    EXPECT_EQ(desk.sim.Output().empty(), form.image != "none.png");
  }
}

TEST(TextPrompt, LaysOutEveryStyleInEveryLanguage) {
  const std::tuple<unsigned, const char*, std::string> kCases[] = {
      {0, "en_US", "1005: 365,10 80x25"},
      {1, "ja_JP", "1005: 365,10 126x25; 1002: 365,40 126x25"},
      {2, "de_DE", "1001: 365,10 80x25; 1006: 365,40 80x25; 1003: 365,70 80x25"},
      {2, "zh_CN", "1001: 365,10 126x25; 1006: 365,40 126x25; 1003: 365,70 126x25"},
      {3, "zh_TW", "1007: 365,10 126x25; 1004: 365,40 126x25; 1002: 365,70 126x25"},
      {4, "ko_KR", "1007: 365,10 80x25; 1004: 365,40 80x25"},
      {5, "ko_KR", "1006: 365,10 126x25; 1002: 365,40 126x25"},
      {6, "en_US", "1005: 365,10 80x25"},
  };
  using Show = std::function<int(unsigned)>;
  const std::pair<const char*, Show> kForms[] = {
      {"; 1000: 10,10 340x270", [](unsigned s) { return TextPrompt(u"text", u"title", s, nullptr, 0); }},
      {"; 1000: 10,10 340x270", [](unsigned s) { return DiagnosticWindow("").TextForm(u"text", u"title", s); }},
      {"; 0: 10,10 340x270", [](unsigned s) { return MarkedPrompt(u"a or b", u"title", s, u"a", u"b"); }},
      {"; 0: 10,10 340x270",
       [](unsigned s) { return DiagnosticWindow("").MarkedForm(u"a or b", u"title", s, u"a", u"b"); }},
  };
  for (const auto& [style, locale, buttons] : kCases) {
    for (const auto& [text, show] : kForms) {
      Desk desk;
      desk.locale = locale;
      const std::string layout = "title 370,367 540x290; " + buttons + text;
      desk.At(100, [&] { EXPECT_EQ(desk.Layout(), layout); });
      desk.PostAt(200, platform::message::kCommand, 1005);
      show(style);
    }
  }
}

TEST(Prompt, KeepsCaptionsBeyondAllMeasureWithinReach) {
  for (const bool image : {false, true}) {
    Desk desk;
    CDMWindow::SetServices({[](int, const wstring&) { return wstring(10'000, u'W'); }, {}, {}});
    desk.At(100, [&] {
      EXPECT_THAT(desk.Layout(), HasSubstr(image ? "1007: 0,267 177x25; 1004: 177,267 177x25; 1002: 354,267 177x25"
                                                 : "1007: 365,10 173x25; 1004: 365,40 173x25; 1002: 365,70 173x25"));
    });
    desk.ClickAt(200, 1004);
    const wstring text(10'000, u'w');
    EXPECT_EQ(image ? ImagePrompt(text, text, 3, u"", nullptr, 0) : TextPrompt(text, text, 3, nullptr, 0),
              prompt_result::kNo);
  }
}

// Where the count-down is painted, on the screen, with the control or window that shows it.
struct Shown {
  WindowHandle on;
  platform::Rectangle place;
};
std::vector<Shown> CountDownsOf(Desk& desk) {
  std::vector<Shown> found;
  for (const platform::desktop::SceneWindow& window : desk.windows.MakeScene().windows) {
    for (const platform::desktop::DrawOperation& operation : window.operations) {
      const auto* text = std::get_if<platform::desktop::TextOperation>(&operation);
      if (text != nullptr && text->text == u"59") {
        const platform::Rectangle size = desk.windows.MeasureText(text->text, 1000, text->font);
        const int left = window.client.left + text->area.left;
        const int top = window.client.top + text->area.top;
        found.push_back({window.handle, {left, top, left + size.Width(), top + size.Height()}});
      }
    }
  }
  return found;
}

TEST(Prompt, NoButtonHidesAnyPartOfTheCountDown) {
  const TemporaryFile picture("counted.pgm", HalfBlack(600, 200));
  const TemporaryFile wide("counted-wide.pgm", HalfBlack(900, 200));
  for (const char* locale : {"en_US", "ja_JP"}) {
    for (const std::string& image : {std::string(), picture.Path(), wide.Path()}) {
      for (unsigned style = 0; style <= 5; ++style) {
        for (const bool isLong : {false, true}) {
          SCOPED_TRACE(std::string(locale) + " " + std::to_string(style) + " " + image + (isLong ? " long" : ""));
          Desk desk;
          desk.locale = locale;
          CDMWindow::SetServices({[&](int, const wstring& text) { return isLong ? text + wstring(30, u'W') : text; },
                                  [&] { return desk.locale; },
                                  {}});
          ThePromptState().timeoutSeconds = 60;
          desk.At(1500, [&] {
            const std::vector<Shown> shown = CountDownsOf(desk);
            ASSERT_FALSE(shown.empty());
            EXPECT_EQ(shown.front().on, desk.Top());
            const platform::Rectangle number = shown.front().place;
            for (const WindowHandle child : desk.windows.Children(desk.Top())) {
              const platform::Rectangle area = desk.windows.ScreenRectangle(child);
              const bool touches = desk.windows.IsWindowVisible(child) && area.left < number.right &&
                                   number.left < area.right && area.top < number.bottom && number.top < area.bottom;
              const auto own =
                  std::find_if(shown.begin(), shown.end(), [&](const Shown& one) { return one.on == child; });
              EXPECT_EQ(touches, own != shown.end());
              if (touches && desk.windows.ControlId(child) > 1000) {  // a button: it shows the whole of it
                EXPECT_EQ(own->place, number);
                EXPECT_LE(area.left, number.left);
                EXPECT_GE(area.right, number.right);
                EXPECT_TRUE(isLong || style == 2 || style == 3);  // elsewhere there is room beside the buttons
              }
            }
          });
          desk.PostAt(1600, platform::message::kCommand, 1005);
          ImagePrompt(u"text", u"title", style | kPromptTopmost, platform::WideFromUtf8(image), nullptr, 0);
        }
      }
    }
  }
}

TEST(ImagePrompt, NamesAFileThatIsNoPicture) {
  const std::string picture = HalfBlack(400, 300);
  const TemporaryFile empty("empty.png", "");
  const TemporaryFile text("text.png", "This is a text.\n");
  const TemporaryFile truncated("truncated.pgm", picture.substr(0, picture.size() / 2));
  const TemporaryFile huge("huge.pgm", "P5\n20000 20000\n255\n" + std::string(1000, 'x'));
  for (const std::string& path :
       {std::string("missing.png"), std::string("/"), empty.Path(), text.Path(), truncated.Path(), huge.Path()}) {
    SCOPED_TRACE(path);
    Desk desk;
    desk.At(100,
            [&] { EXPECT_EQ(desk.Describe(desk.windows.FindControl(desk.Top(), 1008)), path + " 10,10 492x162"); });
    desk.ClickAt(200, 1005);
    EXPECT_EQ(ImagePrompt(u"text", u"title", 0, platform::WideFromUtf8(path), nullptr, 0), prompt_result::kOk);
    EXPECT_EQ(desk.sim.Output(), "LogMessage 14 8 \"Error Loading Image File.\" \"\"\n");
  }
}

}  // namespace
}  // namespace panelglow::prompttest
