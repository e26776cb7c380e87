// Where the parts of a prompt are: from what it holds and how large it is to rectangles. Everything is in pixels, and
// nothing here knows a window.
#pragma once

#include <cstddef>
#include <optional>
#include <string_view>
#include <vector>

#include "platform/Desktop.h"

namespace panelglow {

// The window of every form without an image.
inline constexpr int kFormWidth = 540;
inline constexpr int kFormHeight = 290;
inline constexpr int kImageFormHeight = 300;  // of the form that can hold an image, and its least

/// A rectangle by its left top corner and its size.
constexpr platform::Rectangle PlaceAt(int left, int top, int width, int height) {
  return {left, top, left + width, top + height};
}

constexpr bool Overlap(const platform::Rectangle& a, const platform::Rectangle& b) {
  return a.left < b.right && b.left < a.right && a.top < b.bottom && b.top < a.bottom;
}

struct PixelSize {
  int width = 0;
  int height = 0;
  bool operator==(const PixelSize&) const = default;
};

/// The form with room for an image has its buttons in a row at the lower edge, the other one in a column.
struct PromptContent {
  bool imageForm = false;
  bool hasText = false;
  bool hasPicture = false;  // an image, or the box that names the file of one that failed
};

/// Size of the window. `image` is empty without an image and for one that failed.
PixelSize WindowSizeOf(const PromptContent& content, const std::optional<PixelSize>& image, const PixelSize& screen);

/// Estimated width of a caption's character: only this changes with the language.
int CaptionCharWidth(std::string_view locale, bool imageForm);

/// A width that suits every caption; `longest` counts the characters of the longest one.
int ButtonWidthOf(std::size_t longest, int charWidth);

/// The buttons, in their order. Where they do not fit, by long captions in a small window, they are narrower: each
/// stays within reach of the mouse.
std::vector<platform::Rectangle> ButtonPlaces(const PromptContent& content, const PixelSize& client, int count,
                                              int buttonWidth);

platform::Rectangle TextPlace(const PromptContent& content, const PixelSize& client);

struct PicturePlaces {
  platform::Rectangle area;
  platform::Rectangle horizontalBar;
  platform::Rectangle verticalBar;
};
PicturePlaces PlacesOfPicture(const PromptContent& content, const PixelSize& client);

/// The number of the seconds that are left has a fixed place. Where a button lies there it moves aside, to the
/// nearest gap that is wide enough; where there is none it lies on the button, beside its caption or over its end.
struct ButtonOutline {
  platform::Rectangle area;
  int captionWidth = 0;
};
struct CountDownPlace {
  platform::Rectangle place;
  bool coversCaption = false;
};
CountDownPlace PlaceOfCountDown(const PixelSize& client, const PixelSize& number,
                                const std::vector<ButtonOutline>& buttons);

}  // namespace panelglow
