#include "platform/desktop/TextMeasure.h"

#include <algorithm>

namespace panelglow::platform::desktop {

namespace {

Rectangle Estimate(std::u16string_view text, int width, const Font& font) {
  const int charWidth = std::max(1, font.height / 2);
  const auto most = static_cast<std::size_t>(std::max(1, width / charWidth));  // of a line
  std::size_t lines = 0;
  std::size_t longest = 0;
  for (std::size_t begin = 0; begin <= text.size();) {
    const std::size_t end = std::min(text.find(u'\n', begin), text.size());
    lines += std::max<std::size_t>(1, (end - begin + most - 1) / most);
    longest = std::max(longest, std::min(end - begin, most));
    begin = end + 1;
  }
  return {0, 0, static_cast<int>(longest) * charWidth, static_cast<int>(lines) * font.height};
}

}  // namespace

Rectangle TextMeasure::SizeOf(std::u16string_view text, int width, const Font& font,
                              const std::string& language) const {
  SceneDrawing* drawing = drawing_ ? drawing_() : nullptr;
  if (drawing == nullptr) {
    return Estimate(text, width, font);
  }
  const auto [w, h] = drawing->MeasureText(text, width, font, language);
  return {0, 0, w, h};
}

}  // namespace panelglow::platform::desktop
