// What a window draws on: each drawing becomes an operation of its picture.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <utility>

#include "platform/Desktop.h"
#include "platform/desktop/Scene.h"

namespace panelglow::platform::desktop {

class PaintCanvas : public Canvas {
 public:
  explicit PaintCanvas(std::function<void(DrawOperation)> add) : add_(std::move(add)) {}

  void Fill(const Rectangle& area, Color color) override { add_(FillOperation{area, color}); }
  void DrawText(int x, int y, std::u16string_view text, const Font& font, Color color,
                std::optional<Color> background) override {
    add_(TextOperation{{x, y, x, y}, false, {}, std::u16string(text), font, color, background});
  }
  void DrawTextBox(const Rectangle& area, std::u16string_view text, const TextLayout& layout, const Font& font,
                   Color color, std::optional<Color> background) override {
    add_(TextOperation{area, true, layout, std::u16string(text), font, color, background});
  }
  void DrawImage(int x, int y, std::u16string_view path, const Rectangle& clip) override {
    add_(ImageOperation{x, y, std::u16string(path), clip});
  }

 private:
  std::function<void(DrawOperation)> add_;
};

}  // namespace panelglow::platform::desktop
