#include "prompts/PromptLayout.h"

#include <algorithm>
#include <array>
#include <cstdlib>

namespace panelglow {

using platform::Rectangle;

namespace {

constexpr int kImageMarginX = 50;
constexpr int kImageMarginY = 140;
constexpr int kMargin = 10;
constexpr int kButtonHeight = 25;
constexpr int kNarrowestButton = 80;
constexpr int kColumnX = 365;
constexpr int kColumnStep = 30;
constexpr int kColumnTextWidth = 340;
constexpr int kColumnTextHeight = 270;
constexpr int kBarThickness = 20;
constexpr int kAboveBottom = 22;  // from the window's lower edge to the count-down's upper one
constexpr int kGap = 6;           // to what stands beside the count-down

// The left edge nearest to `wanted` at which the number stands in a gap of a row of buttons; nothing when no gap is
// wide enough.
std::optional<int> NearestGap(const std::vector<ButtonOutline>& row, int wanted, int width, int clientWidth) {
  std::optional<int> nearest;
  int gapBegin = 0;
  for (std::size_t i = 0; i <= row.size(); ++i) {
    const int gapEnd = i < row.size() ? row[i].area.left : clientWidth;
    if (gapEnd - gapBegin >= width + 2 * kGap) {
      const int left = std::clamp(wanted, gapBegin + kGap, gapEnd - kGap - width);
      nearest = nearest && std::abs(*nearest - wanted) <= std::abs(left - wanted) ? nearest : left;
    }
    gapBegin = i < row.size() ? row[i].area.right : clientWidth;
  }
  return nearest;
}

}  // namespace

// Not below the least size that the window can be dragged to: a small picture leaves no room for buttons and text.
PixelSize WindowSizeOf(const PromptContent& content, const std::optional<PixelSize>& image, const PixelSize& screen) {
  if (!image) {
    return {kFormWidth, content.imageForm ? kImageFormHeight : kFormHeight};
  }
  return {std::clamp(image->width + kImageMarginX, kFormWidth, std::max(kFormWidth, screen.width)),
          std::clamp(image->height + kImageMarginY, kImageFormHeight, std::max(kImageFormHeight, screen.height))};
}

int CaptionCharWidth(std::string_view locale, bool imageForm) {
  constexpr std::array<std::string_view, 4> kWideLocales{"zh_CN", "zh_TW", "ko_KR", "ja_JP"};
  if (std::find(kWideLocales.begin(), kWideLocales.end(), locale) != kWideLocales.end()) {
    return 18;
  }
  return imageForm ? 30 : 10;
}

int ButtonWidthOf(std::size_t longest, int charWidth) {
  return std::max(kNarrowestButton, static_cast<int>(longest) * charWidth);
}

// A row spreads over the window's lower edge with equal gaps, or shares it without gaps. A column's buttons end with
// the window, so that the middle of their captions can be seen.
std::vector<Rectangle> ButtonPlaces(const PromptContent& content, const PixelSize& client, int count,
                                    int buttonWidth) {
  const int width = std::min(buttonWidth, content.imageForm ? client.width / count : client.width - kColumnX);
  const int gap = (client.width - count * width) / (count + 1);
  std::vector<Rectangle> places;
  places.reserve(static_cast<std::size_t>(count));
  for (int i = 0; i < count; ++i) {
    places.push_back(content.imageForm
                         ? PlaceAt(gap + i * (width + gap), client.height - kButtonHeight, width, kButtonHeight)
                         : PlaceAt(kColumnX, kMargin + i * kColumnStep, width, kButtonHeight));
  }
  return places;
}

Rectangle TextPlace(const PromptContent& content, const PixelSize& client) {
  if (!content.imageForm) {
    return PlaceAt(kMargin, kMargin, kColumnTextWidth, kColumnTextHeight);
  }
  return content.hasPicture ? PlaceAt(kMargin, client.height - 90, client.width - 40, 60)
                            : PlaceAt(kMargin, kMargin, client.width - 40, client.height - 40);
}

PicturePlaces PlacesOfPicture(const PromptContent& content, const PixelSize& client) {
  const int height = client.height - (content.hasText ? 130 : 50);
  const int barTop = client.height - (content.hasText ? 120 : 50);
  return {PlaceAt(kMargin, kMargin, client.width - 40, height),
          PlaceAt(kMargin, barTop, client.width - 30, kBarThickness),
          PlaceAt(client.width - kBarThickness, kMargin, kBarThickness, height)};
}

CountDownPlace PlaceOfCountDown(const PixelSize& client, const PixelSize& number,
                                const std::vector<ButtonOutline>& buttons) {
  const int wanted = client.width / 5;
  const int top = client.height - kAboveBottom;
  const auto at = [&](int left) { return PlaceAt(left, top, number.width, number.height); };
  std::vector<ButtonOutline> row;  // beside the number, from left to right
  for (const ButtonOutline& button : buttons) {
    if (Overlap(button.area, PlaceAt(0, top, client.width, number.height))) {
      row.push_back(button);
    }
  }
  const auto under =
      std::find_if(row.begin(), row.end(), [&](const ButtonOutline& b) { return Overlap(b.area, at(wanted)); });
  if (under == row.end()) {
    return {at(wanted), false};
  }
  if (const std::optional<int> gap = NearestGap(row, wanted, number.width, client.width)) {
    return {at(*gap), false};
  }
  const int captionEnd = (under->area.left + under->area.right + under->captionWidth) / 2;
  const int left = std::min(std::max(wanted, captionEnd + kGap), under->area.right - kGap - number.width);
  return {at(left), left < captionEnd};
}

}  // namespace panelglow
