// A picture of the windows as plain data: what a screen has to draw. Made by SceneBuilder, drawn by the drawing
// module into a file or onto a display.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "platform/Desktop.h"

namespace panelglow::platform::desktop {

struct FillOperation {
  Rectangle area;
  Color color = 0;
  bool operator==(const FillOperation&) const = default;
};

struct TextOperation {
  Rectangle area;  // only the top left corner counts for a single line
  bool boxed = false;
  TextLayout layout;
  std::u16string text;
  Font font;
  Color color = 0;
  std::optional<Color> background;
  bool operator==(const TextOperation&) const = default;
};

struct ImageOperation {
  int x = 0;
  int y = 0;
  std::u16string path;
  Rectangle clip;
  bool operator==(const ImageOperation&) const = default;
};

/// A filled disc that touches all sides of `area`.
struct DiscOperation {
  Rectangle area;
  Color color = 0;
  bool operator==(const DiscOperation&) const = default;
};

using DrawOperation = std::variant<FillOperation, TextOperation, ImageOperation, DiscOperation>;

enum class WindowKind { kPlain, kStatic, kIcon, kImageArea, kButton, kEdit, kScrollBar };

/// One visible window, bottom-most first in Scene::windows.
struct SceneWindow {
  WindowHandle handle = 0;
  WindowHandle topLevel = 0;  // the window itself, when it has no parent
  WindowKind kind = WindowKind::kPlain;
  Rectangle frame;   // screen pixels
  Rectangle client;  // screen pixels
  Rectangle clip;    // screen pixels: the part that its parents leave of the frame
  bool border = false;
  bool raisedFrame = false;
  Color background = kButtonFaceColor;
  std::optional<Color> ownBackground;  // of a control whose parent wants it so
  bool centred = false;                // static text
  std::u16string text;
  std::u16string iconPath;
  Font font;
  bool enabled = true;
  bool focused = false;
  bool heavyFrame = false;         // of a button: the one that Enter presses
  std::size_t caret = 0;           // of an entry field: before which character it stands
  std::size_t selectionBegin = 0;  // of an entry field; the same twice when nothing is selected
  std::size_t selectionEnd = 0;
  bool topmost = false;  // of a top-level window
  bool pressed = false;
  bool vertical = false;  // scroll bar
  ScrollState scroll;
  std::vector<DrawOperation> operations;  // in client coordinates
  bool operator==(const SceneWindow&) const = default;
};

struct Scene {
  int width = 0;
  int height = 0;
  Color background = 0x00604838;
  std::vector<SceneWindow> windows;
  WindowHandle foreground = 0;
  std::uint64_t foregroundRequest = 0;  // grows when the foreground is to be taken (again)
  std::string language;                 // of the texts, as "ja_JP": which forms Chinese characters have
};

/// Implemented by the drawing module.
class SceneDrawing {
 public:
  virtual ~SceneDrawing() = default;

  /// Draws the scene into a PNG file. False when the file cannot be written.
  virtual bool WritePng(const Scene& scene, const std::string& path) = 0;

  /// Size of an image or icon file; nothing when it does not decode.
  virtual std::optional<std::pair<int, int>> ImageSize(const std::string& path) = 0;

  /// Width and height of `text`, in a language as Scene has it, broken to `width` pixels.
  virtual std::pair<int, int> MeasureText(std::u16string_view text, int width, const Font& font,
                                          const std::string& language) = 0;
};

}  // namespace panelglow::platform::desktop
