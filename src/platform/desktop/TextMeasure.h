// How large a text is on the screen.
#pragma once

#include <functional>
#include <string>
#include <string_view>

#include "platform/Desktop.h"
#include "platform/desktop/Scene.h"

namespace panelglow::platform::desktop {

/// Asks the drawing module, which is loaded when it is first asked. Where nothing can be drawn, and so nothing
/// measured, a character counts as half as wide as it is high.
class TextMeasure {
 public:
  /// `drawing` may give null, and be empty.
  void SetDrawing(std::function<SceneDrawing*()> drawing) { drawing_ = std::move(drawing); }

  /// Size of `text`, in a language as Scene has it, broken to `width` pixels; its left top corner is at 0.
  [[nodiscard]] Rectangle SizeOf(std::u16string_view text, int width, const Font& font,
                                 const std::string& language) const;

 private:
  std::function<SceneDrawing*()> drawing_;
};

}  // namespace panelglow::platform::desktop
