// What the drawn windows look like, from the pictures that are made of them.
#include <gdk-pixbuf/gdk-pixbuf.h>
#include <gmock/gmock.h>

#include <numeric>
#include <set>

#include "platform/posix/LazyDrawing.h"
#include "prompts/Desk.h"
#include "prompts/DiagnosticWindow.h"
#include "prompts/MessageWindow.h"
#include "prompts/PlainPrompt.h"
#include "prompts/TextWindow.h"

namespace panelglow::prompttest {
namespace {

using platform::Rectangle;

constexpr platform::Color kFace = platform::kButtonFaceColor;

// A picture of the screen, by way of its file.
class Photo {
 public:
  explicit Photo(Desk& desk) : Photo(desk.windows.MakeScene()) {}
  explicit Photo(const platform::desktop::Scene& scene) {
    const TemporaryFile file("photo.png", "");
    platform::posix::LazyDrawing drawing;
    EXPECT_TRUE(drawing.Get()->WritePng(scene, file.Path()));
    picture_ = gdk_pixbuf_new_from_file(file.Path().c_str(), nullptr);
  }
  ~Photo() { g_object_unref(picture_); }
  Photo(const Photo&) = delete;
  Photo& operator=(const Photo&) = delete;

  [[nodiscard]] platform::Color At(int x, int y) const {
    const guint8* pixel = gdk_pixbuf_read_pixels(picture_) + y * gdk_pixbuf_get_rowstride(picture_) +
                          x * gdk_pixbuf_get_n_channels(picture_);
    return static_cast<platform::Color>(pixel[0] | pixel[1] << 8 | pixel[2] << 16);
  }

  /// How many pixels of an area have a colour.
  [[nodiscard]] int Count(const Rectangle& area, platform::Color color) const {
    int count = 0;
    for (int y = area.top; y < area.bottom; ++y) {
      for (int x = area.left; x < area.right; ++x) {
        count += At(x, y) == color ? 1 : 0;
      }
    }
    return count;
  }

 private:
  GdkPixbuf* picture_ = nullptr;
};

// The window in the middle of the screen that every form without an image has, and a place in its client area.
constexpr int kLeft = 370 + 1;
constexpr int kTop = 367 + 1;
constexpr Rectangle In(int x, int y, int width, int height) {
  return {kLeft + x, kTop + y, kLeft + x + width, kTop + y + height};
}

TEST(Pixels, AScrolledPictureMovesInsideItsAreaOnly) {
  const TemporaryFile picture("scrolled.pgm", HalfBlack(1400, 1200));
  Desk desk;
  const auto look = [&](platform::Color left) {
    const Photo photo(desk);
    EXPECT_EQ(photo.At(4 + 9, 100), kFace);
    EXPECT_EQ(photo.At(4 + 10, 100), left);
    EXPECT_EQ(photo.At(4 + 10 + 500, 100), left == 0 ? 0U : 0xFFFFFFU);
    EXPECT_EQ(photo.At(4 + 10 + 660, 100), kFace);     // between the area and its bar
    EXPECT_NE(photo.At(4 + 10 + 100, 4 + 390), left);  // the bar below
    EXPECT_EQ(photo.At(4 + 100, 4 + 405), kFace);      // and below that
  };
  desk.At(100, [&] { desk.windows.MoveWindow(desk.Top(), 0, 0, 708, 508); });
  desk.At(200, [&] { look(0); });
  desk.PostAt(300, platform::message::kHorizontalScroll, 740U << 16U | platform::scroll::kThumbTrack);
  desk.At(400, [&] { look(0xFFFFFF); });
  desk.ClickAt(500, 1005);
  ImagePrompt(u"text", u"title", 0, picture.WidePath(), nullptr, 0);
}

TEST(Pixels, APictureThatHasBeenPutRightIsReadAnew) {
  platform::posix::LazyDrawing drawing;
  const TemporaryFile picture("renewed.pgm", "");
  EXPECT_EQ(drawing.Get()->ImageSize(picture.Path()), std::nullopt);
  for (const int width : {20, 300}) {
    std::ofstream(picture.Path(), std::ios::binary) << HalfBlack(width, 10);
    EXPECT_EQ(drawing.Get()->ImageSize(picture.Path()), std::pair(width, 10));
  }
}

TEST(Pixels, TheCountDownIsSeenInEveryFormWhatEverIsUnderIt) {
  for (const bool image : {false, true}) {
    for (const bool counting : {false, true}) {
      Desk desk;
      ThePromptState().timeoutSeconds = counting ? 8 : 0;
      desk.At(1500, [&] {
        const Photo photo(desk);
        // In the image form, which is 10 pixels higher and has a frame of 4, a button is under it.
        const Rectangle place =
            image ? Rectangle{370 + 4 + 106, 362 + 4 + 270, 370 + 4 + 150, 362 + 4 + 286} : In(107, 266, 40, 12);
        EXPECT_EQ(photo.Count(place, 0) > 5, counting) << image;
      });
      desk.ClickAt(2000, 1007);
      image ? ImagePrompt(u"text", u"title", 3 | kPromptTopmost, u"", nullptr, 0)
            : TextPrompt(u"text", u"title", 3 | kPromptTopmost, nullptr, 0);
    }
  }
}

// The ink of a text on a prompt: how dark each pixel of its field is.
std::vector<int> InkOf(const wstring& text, const char* locale, int weight) {
  Desk desk;
  desk.locale = locale;
  std::vector<int> ink;
  desk.At(100, [&] {
    desk.windows.SetFont(desk.windows.FindControl(desk.Top(), 1000), {18, weight});
    const Photo photo(desk);
    for (int y = 12; y < 40; ++y) {
      for (int x = 12; x < 140; ++x) {
        ink.push_back(255 - static_cast<int>(photo.At(kLeft + x, kTop + y) & 0xFFU));
      }
    }
  });
  desk.ClickAt(200, 1005);
  TextPrompt(text, u"title", 0, nullptr, 0);
  return ink;
}

TEST(Pixels, ChineseJapaneseAndKoreanAreBoldAndHaveTheFormsOfTheirLanguage) {
  const wstring kSame = u"\u9AA8\u76F4\u6D77";  // one code each, and another shape in each language
  std::set<std::vector<int>> shapes;
  for (const auto& [locale, text] : {std::pair<const char*, wstring>{"zh_CN", u"电源灯"},
                                     {"zh_TW", u"電源燈"},
                                     {"ja_JP", u"電源ランプ"},
                                     {"ko_KR", u"전원 표시등"}}) {
    const std::vector<int> bold = InkOf(text, locale, 600);
    const std::vector<int> normal = InkOf(text, locale, 400);
    EXPECT_GT(std::accumulate(bold.begin(), bold.end(), 0),
              std::accumulate(normal.begin(), normal.end(), 0) * 11 / 10)
        << locale;
    shapes.insert(InkOf(kSame, locale, 600));
  }
  EXPECT_EQ(shapes.size(), 4U);
}

TEST(Pixels, ALoneSurrogateSpoilsOnlyItself) {
  const std::vector<int> whole = InkOf(u"Text \xFFFD and more", "en_US", 600);
  EXPECT_EQ(InkOf(u"Text \xD83D and more", "en_US", 600), whole);
  EXPECT_EQ(InkOf(u"Text \xDE00 and more", "en_US", 600), whole);
}

TEST(Pixels, OnlyTheFocusedButtonHasTheHeavyFrame) {
  Desk desk;
  const auto frames = [&] {
    const Photo photo(desk);
    const auto isHeavy = [&](int y) { return photo.At(kLeft + 365 + 20, kTop + y) == 0; };
    return std::pair(isHeavy(10), isHeavy(40));
  };
  desk.At(100, [&] { EXPECT_EQ(frames(), std::pair(true, false)); });
  desk.At(200, [&] { desk.windows.Key(0x09, 0, false); });  // Tab
  desk.At(300, [&] { EXPECT_EQ(frames(), std::pair(false, true)); });
  desk.ClickAt(400, 1004);
  TextPrompt(u"text", u"title", 4, nullptr, 0);
}

TEST(Pixels, AConfiguredColorFillsWindowTextsAndButtonsAndLeavesTextsReadable) {
  for (const auto& [value, ground, ink] :
       {std::tuple{"255", 0xFFU, 0U}, {"65280", 0xFF00U, 0U}, {"0", 0U, 0xFFFFFFU}}) {
    Desk desk;
    desk.sim.DiskFiles().Put(".\\diagconf.ini", std::string("[WindowSettings]\nBackgroundColor=") + value + "\n");
    desk.At(500, [&, ground = ground, ink = ink] {
      const Photo photo(desk);
      EXPECT_EQ(photo.At(kLeft + 3, kTop + 3), ground);
      EXPECT_EQ(photo.Count(In(20, 100, 300, 100), ground), 300 * 100);  // of the text field
      EXPECT_GT(photo.Count(In(11, 11, 60, 18), ink), 20);               // the text
      EXPECT_EQ(photo.At(kLeft + 370, kTop + 45), ground);               // of the second button
      EXPECT_GT(photo.Count(In(385, 43, 40, 18), ink), 20);              // its caption
    });
    desk.ClickAt(1000, 1002);
    DiagnosticWindow(".\\diagconf.ini").TextForm(u"Some text", u"title", 1);
  }
}

TEST(Pixels, MarksAreOnGreenAndRed) {
  Desk desk;
  desk.At(500, [&] {
    const Photo photo(desk);
    EXPECT_GT(photo.Count(In(21, 21, 300, 20), 0x00FF00), 100);
    EXPECT_GT(photo.Count(In(21, 21, 300, 20), 0x0000FF), 100);
    EXPECT_EQ(photo.Count(In(0, 45, 538, 243), 0x00FF00) + photo.Count(In(0, 45, 538, 243), 0x0000FF), 0);
  });
  desk.ClickAt(1000, 1005);
  MarkedPrompt(u"YES or NO", u"title", 0, u"yes", u"no");
}

TEST(Pixels, AMessageHasItsTitleOnTheFrameAndItsNumberBelowTheText) {
  Desk desk;
  desk.At(500, [&] {
    const Photo photo(desk);
    EXPECT_GT(photo.Count(In(250, 0, 40, 18), 0), 20);             // the title, in the middle
    EXPECT_GT(photo.Count(In(54, 29, 60, 18), 0), 20);             // the text
    EXPECT_GT(photo.Count(In(53 + 215, 28 + 172, 20, 18), 0), 5);  // the number
    EXPECT_EQ(photo.Count(In(60, 60, 420, 130), kFace), 420 * 130);
  });
  ShowMessageWindow(u"Some text", u"title", 1, nullptr);
}

TEST(Pixels, ALongLineShowsItsEndInTheField) {
  Desk desk;
  const Rectangle end = In(380, 195, 36, 16);
  desk.At(100, [&] { EXPECT_EQ(Photo(desk).Count(end, 0), 0); });
  desk.At(200, [&] {
    for (int i = 0; i < 200; ++i) {
      desk.windows.Key(0x57, i < 195 ? u'.' : u'W', false);
    }
  });
  desk.At(300, [&] {
    const Photo photo(desk);
    EXPECT_GT(photo.Count(end, 0), 60);
    EXPECT_EQ(photo.Count(In(421, 190, 100, 25), kFace), 100 * 25);  // nothing beside it
    EXPECT_EQ(photo.Count(In(20, 216, 500, 30), kFace), 500 * 30);   // nor below
  });
  desk.ClickAt(500, 1005);
  std::string entered;
  ShowTextWindow(u"text", u"title", entered, 5000);
}

TEST(Pixels, ATextThatIsLaidOutAsInAFieldEndsWithAWholeLine) {
  platform::desktop::TextOperation text;
  text.boxed = true;
  text.text = u"WWW WWW WWW WWW WWW WWW WWW WWW";
  text.font = {18, 600};
  const auto blackIn = [&](bool asInAField, int height) {
    text.area = {0, 0, 100, height};
    text.layout = {true, asInAField};
    platform::desktop::SceneWindow window;
    window.frame = window.client = window.clip = {0, 0, 100, 100};
    window.operations = {text};
    platform::desktop::Scene scene;
    scene.width = scene.height = 100;
    scene.windows = {window};
    return Photo(scene).Count(window.frame, 0);
  };
  std::set<int> asInAField;  // grows with each whole line
  std::set<int> otherwise;   // grows with each row of pixels that has letters
  for (int height = 0; height < 40; ++height) {
    asInAField.insert(blackIn(true, height));
    otherwise.insert(blackIn(false, height));
  }
  EXPECT_EQ(asInAField.size(), 3U);  // two lines and none
  EXPECT_GT(otherwise.size(), 15U);
  EXPECT_EQ(blackIn(true, 100), blackIn(false, 100));
}

TEST(Pixels, WhatIsSelectedIsSeenWhileTheFieldHasTheKeyboard) {
  constexpr platform::Color kSelection = 0x00D77800;
  Desk desk;
  const auto look = [&](bool first, bool second) {
    const Photo photo(desk);
    EXPECT_EQ(photo.Count(In(124, 195, 12, 15), kSelection) > 50, first);
    EXPECT_EQ(photo.Count(In(160, 195, 20, 15), kSelection) > 50, second);
    EXPECT_EQ(photo.Count(In(250, 195, 165, 15), kSelection), 0);  // behind the line
  };
  const auto press = [&](std::uint32_t key, bool shift) {
    platform::desktop::ScreenEvent event;
    event.virtualKey = key;
    event.shift = shift;
    desk.windows.Take(event);
  };
  desk.At(100, [&] {
    for (const char16_t letter : std::u16string_view(u"nnnnnnnn")) {
      desk.windows.Key('N', letter, false);
    }
  });
  desk.At(200, [&] { look(false, false); });
  desk.At(250, [&] { press(0x24, true); });  // all, up to the line's beginning
  desk.At(300, [&] { look(true, true); });
  desk.At(350, [&] {
    press(0x24, false);
    press(0x27, true);
    press(0x27, true);
  });
  desk.At(400, [&] { look(true, false); });
  desk.At(450, [&] { press(0x09, false); });  // to the button
  desk.At(500, [&] { look(false, false); });
  desk.ClickAt(600, 1005);
  std::string entered;
  ShowTextWindow(u"text", u"title", entered, 5000);
}

}  // namespace
}  // namespace panelglow::prompttest
