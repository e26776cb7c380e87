// Where the parts of a prompt are, for every size.
#include "prompts/PromptLayout.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <string>

namespace panelglow {
namespace {

using platform::Rectangle;

TEST(PromptLayout, TheWindowFitsItsImageBetweenItsLeastSizeAndTheScreen) {
  struct Case {
    bool imageForm;
    std::optional<PixelSize> image;
    PixelSize screen;
    PixelSize window;
  };
  for (const Case& c :
       {Case{false, std::nullopt, {1280, 1024}, {540, 290}}, Case{true, std::nullopt, {1280, 1024}, {540, 300}},
        Case{true, PixelSize{600, 400}, {1280, 1024}, {650, 540}},
        Case{true, PixelSize{1, 1}, {1280, 1024}, {540, 300}},
        Case{true, PixelSize{5000, 200}, {1280, 1024}, {1280, 340}},
        Case{true, PixelSize{5000, 5000}, {320, 200}, {540, 300}}}) {
    EXPECT_EQ(WindowSizeOf({c.imageForm, true, c.image.has_value()}, c.image, c.screen), c.window);
  }
}

TEST(PromptLayout, TextAndPictureShareTheWindowAboveTheButtons) {
  struct Case {
    PromptContent content;
    Rectangle text;
    PicturePlaces picture;
  };
  for (const Case& c : {Case{{false, true, false}, PlaceAt(10, 10, 340, 270), {}},
                        Case{{true, true, false}, PlaceAt(10, 10, 602, 492), {}},
                        Case{{true, true, true},
                             PlaceAt(10, 442, 602, 60),
                             {PlaceAt(10, 10, 602, 402), PlaceAt(10, 412, 612, 20), PlaceAt(622, 10, 20, 402)}},
                        Case{{true, false, true},
                             {},
                             {PlaceAt(10, 10, 602, 482), PlaceAt(10, 482, 612, 20), PlaceAt(622, 10, 20, 482)}}}) {
    const PixelSize client{642, 532};
    if (c.content.hasText) {
      EXPECT_EQ(TextPlace(c.content, client), c.text);
    }
    if (c.content.hasPicture) {
      const PicturePlaces places = PlacesOfPicture(c.content, client);
      EXPECT_EQ(places.area, c.picture.area);
      EXPECT_EQ(places.horizontalBar, c.picture.horizontalBar);
      EXPECT_EQ(places.verticalBar, c.picture.verticalBar);
    }
  }
}

// In a window of every width, with captions of every length: the buttons are inside, apart, and evenly spaced; and
// the number of the count-down is free of them, or lies within one because there is no gap for it.
TEST(PromptLayout, ButtonsAndCountDownKeepApartWhereverThereIsRoom) {
  constexpr PixelSize kNumber{20, 22};
  for (const bool imageForm : {false, true}) {
    for (int width = imageForm ? 532 : 538; width <= (imageForm ? 1920 : 538); width += 7) {
      for (int count = 1; count <= 3; ++count) {
        for (const int buttonWidth : {80, 120, 177, 210, 600, 3000}) {
          SCOPED_TRACE(std::to_string(width) + ", " + std::to_string(count) + " of " + std::to_string(buttonWidth));
          const PixelSize client{width, 288};
          const std::vector<Rectangle> places = ButtonPlaces({imageForm, true, false}, client, count, buttonWidth);
          std::vector<ButtonOutline> outlines;
          int gap = imageForm ? places.front().left : 0;
          for (std::size_t i = 0; i < places.size(); ++i) {
            ASSERT_GE(places[i].left, 0);
            ASSERT_LE(places[i].right, width);
            ASSERT_GT(places[i].Width(), 60);
            ASSERT_TRUE(i == 0 || !Overlap(places[i - 1], places[i]));
            ASSERT_TRUE(i == 0 || !imageForm || places[i].left - places[i - 1].right == gap);
            outlines.push_back({places[i], places[i].Width() - 30});
          }
          gap = imageForm ? std::max(gap, width - places.back().right) : width;
          const CountDownPlace number = PlaceOfCountDown(client, kNumber, outlines);
          const auto under = std::find_if(places.begin(), places.end(),
                                          [&](const Rectangle& place) { return Overlap(place, number.place); });
          ASSERT_EQ(number.place.Width(), kNumber.width);
          ASSERT_GE(number.place.left, 0);
          ASSERT_LE(number.place.right, width);
          if (under != places.end()) {
            ASSERT_LT(gap, kNumber.width + 12);
            ASSERT_GE(number.place.left, under->left);
            ASSERT_LE(number.place.right, under->right);
            ASSERT_TRUE(number.coversCaption);  // a caption that leaves 15 pixels has no room beside it
          }
        }
      }
    }
  }
}

TEST(PromptLayout, TheCountDownLiesBesideAShortCaption) {
  const std::vector<ButtonOutline> outlines{{PlaceAt(0, 263, 180, 25), 40}, {PlaceAt(180, 263, 180, 25), 40}};
  const CountDownPlace number = PlaceOfCountDown({360, 288}, {20, 22}, outlines);
  EXPECT_FALSE(number.coversCaption);
  EXPECT_EQ(number.place, PlaceAt(116, 266, 20, 22));  // the caption ends at 110
}

}  // namespace
}  // namespace panelglow
