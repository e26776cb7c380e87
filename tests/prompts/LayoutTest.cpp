// Where the prompts put their controls, against the rules of their layout.
#include <gmock/gmock.h>

#include <algorithm>

#include "prompts/Desk.h"
#include "prompts/DiagnosticWindow.h"
#include "prompts/PromptWindow.h"

namespace panelglow::prompttest {
namespace {

using ::testing::ElementsAre;

constexpr const char* kLocales[] = {"en_US", "de_DE", "ja_JP", "zh_CN", "zh_TW", "ko_KR"};

// Buttons by style, and the longest caption of each set in characters.
struct Set {
  std::vector<int> ids;
  int longest;
};
const Set kSets[] = {
    {{1005}, 3},       {{1005, 1002}, 7}, {{1001, 1006, 1003}, 7}, {{1007, 1004, 1002}, 7}, {{1007, 1004}, 4},
    {{1006, 1002}, 7}, {{1005}, 3}};

int ButtonWidth(const Set& set, const std::string& locale, int latinWidth) {
  const bool latin = locale == "en_US" || locale == "de_DE";
  return std::max(80, set.longest * (latin ? latinWidth : 18));
}

std::string Line(int id, int x, int y, int width, int height, bool visible = true) {
  return std::to_string(id) + ": " + Desk::Describe({x, y, x + width, y + height}, visible);
}

struct Image {
  std::string path;
  int width;
  int height;
  bool readable;
};

// Of an image form whose client area has this size.
std::vector<std::string> ImageLayout(int width, int height, const Set& set, int buttonWidth, bool text,
                                     const Image& image) {
  std::vector<std::string> lines;
  const int count = static_cast<int>(set.ids.size());
  const int shown = std::min(buttonWidth, width / count);
  const int gap = (width - count * shown) / (count + 1);
  for (int i = 0; i < count; ++i) {
    lines.push_back(Line(set.ids[static_cast<std::size_t>(i)], gap + i * (shown + gap), height - 25, shown, 25));
  }
  const bool area = !image.path.empty();
  if (text) {
    lines.push_back(area ? Line(1000, 10, height - 90, width - 40, 60) : Line(1000, 10, 10, width - 40, height - 40));
  }
  if (area) {
    const int areaHeight = height - (text ? 130 : 50);
    const int frame = image.readable ? 0 : 2;
    lines.push_back(Line(1008, 10, 10, width - 40, areaHeight));
    lines.push_back(Line(0, 10, height - (text ? 120 : 50), width - 30, 20, image.width > width - 40 - frame));
    lines.push_back(Line(0, width - 20, 10, 20, areaHeight, image.height > areaHeight - frame));
  }
  return lines;
}

TEST(ImagePrompt, LaysOutEveryStyleInEveryLanguageAtEverySize) {
  constexpr int kFrame = 8;  // of both sides
  const TemporaryFile fitting("fitting.pgm", HalfBlack(600, 400));
  const TemporaryFile large("larger.pgm", HalfBlack(1400, 1200));
  const TemporaryFile small("small.pgm", HalfBlack(40, 30));
  const Image kImages[] = {{"", 0, 0, true},
                           {"none.png", 490, 160, false},
                           {fitting.Path(), 600, 400, true},
                           {large.Path(), 1400, 1200, true},
                           {small.Path(), 40, 30, true}};
  std::size_t round = 0;
  for (std::size_t style = 0; style < std::size(kSets); ++style) {
    for (const char* locale : kLocales) {
      const Image& image = kImages[++round % std::size(kImages)];
      const bool text = round % 3 != 0;
      SCOPED_TRACE("style " + std::to_string(style) + ", " + locale + ", image " + image.path);
      Desk desk;
      desk.locale = locale;
      const int buttonWidth = ButtonWidth(kSets[style], locale, 30);
      const int width = image.readable && !image.path.empty() ? std::clamp(image.width + 50, 540, 1280) : 540;
      const int height = image.readable && !image.path.empty() ? std::clamp(image.height + 140, 300, 1024) : 300;
      unsigned time_ms = 100;
      const auto expect = [&](int w, int h) {
        desk.At(time_ms, [&, w, h] {
          EXPECT_EQ(desk.Layout(), ImageLayout(w - kFrame, h - kFrame, kSets[style], buttonWidth, text, image));
        });
        time_ms += 100;
      };
      desk.At(time_ms, [&] {
        EXPECT_EQ(desk.Describe(desk.Top()),
                  "title " + Desk::Describe({(1280 - width) / 2, (1024 - height) / 2, (1280 - width) / 2 + width,
                                             (1024 - height) / 2 + height}));
      });
      expect(width, height);
      for (const auto& [w, h] : {std::pair{708, 508}, {540, 300}, {1003, 421}, {1280, 1024}}) {
        desk.At(time_ms, [&, w = w, h = h] { desk.windows.MoveWindow(desk.Top(), 0, 0, w, h); });
        time_ms += 100;
        expect(w, h);
      }
      desk.At(time_ms, [&] { desk.windows.MoveWindow(desk.Top(), 0, 0, 100, 100); });
      time_ms += 100;
      expect(540, 300);  // the least
      desk.ClickAt(time_ms, kSets[style].ids[0]);
      const wstring path = platform::WideFromUtf8(image.path);
      const wstring shownText = text ? u"text" : u"";
      const auto promptStyle = static_cast<unsigned>(style);
      const int result = round % 2 == 0 ? ImagePrompt(shownText, u"title", promptStyle, path, nullptr, 0)
                                        : DiagnosticWindow("").ImageForm(shownText, u"title", promptStyle, path);
      EXPECT_EQ(result, kSets[style].ids[0] - 1000);
      EXPECT_EQ(desk.sim.Output(), image.readable ? "" : "LogMessage 14 8 \"Error Loading Image File.\" \"\"\n");
    }
  }
}

TEST(TextPrompt, LaysOutEveryStyleInEveryLanguage) {
  for (std::size_t style = 0; style < std::size(kSets); ++style) {
    for (const char* locale : kLocales) {
      SCOPED_TRACE("style " + std::to_string(style) + ", " + locale);
      Desk desk;
      desk.locale = locale;
      std::vector<std::string> lines;
      int top = 10;
      for (const int id : kSets[style].ids) {
        lines.push_back(Line(id, 365, top, ButtonWidth(kSets[style], locale, 10), 25));
        top += 30;
      }
      const std::size_t round = style + static_cast<std::size_t>(locale[0]);
      const bool marked = round % 2 == 0;
      lines.push_back(Line(marked ? 0 : 1000, 10, 10, 340, 270));
      desk.At(100, [&] {
        EXPECT_EQ(desk.Describe(desk.Top()), "title 370,367 540x290");
        EXPECT_EQ(desk.Layout(), lines);
      });
      desk.ClickAt(200, kSets[style].ids[0]);
      const auto promptStyle = static_cast<unsigned>(style);
      const bool plain = round % 3 == 0;
      if (marked) {
        plain ? MarkedPrompt(u"yes or no", u"title", promptStyle, u"yes", u"no")
              : DiagnosticWindow("").MarkedForm(u"yes or no", u"title", promptStyle, u"yes", u"no");
      } else {
        plain ? TextPrompt(u"text", u"title", promptStyle, nullptr, 0)
              : DiagnosticWindow("").TextForm(u"text", u"title", promptStyle);
      }
    }
  }
}

TEST(Prompt, KeepsCaptionsBeyondAllMeasureWithinReach) {
  for (const bool image : {false, true}) {
    Desk desk;
    CDMWindow::SetServices({[](int, const wstring&) { return wstring(10'000, u'W'); }, {}, {}});
    desk.At(100, [&] {
      EXPECT_THAT(desk.Layout(), image ? ElementsAre("1007: 0,267 177x25", "1004: 177,267 177x25",
                                                     "1002: 354,267 177x25", "1000: 10,10 492x252")
                                       : ElementsAre("1007: 365,10 173x25", "1004: 365,40 173x25",
                                                     "1002: 365,70 173x25", "1000: 10,10 340x270"));
    });
    desk.ClickAt(200, 1004);
    const wstring text(10'000, u'w');
    EXPECT_EQ(image ? ImagePrompt(text, text, 3, u"", nullptr, 0) : TextPrompt(text, text, 3, nullptr, 0),
              prompt_result::kNo);
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
