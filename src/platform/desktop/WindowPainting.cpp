// What windows paint, and the picture of them all.
#include <algorithm>
#include <utility>

#include "platform/desktop/WindowRecords.h"

namespace panelglow::platform::desktop {

namespace {

Rectangle Intersect(const Rectangle& a, const Rectangle& b) {
  Rectangle r{std::max(a.left, b.left), std::max(a.top, b.top), std::min(a.right, b.right),
              std::min(a.bottom, b.bottom)};
  r.right = std::max(r.right, r.left);
  r.bottom = std::max(r.bottom, r.top);
  return r;
}

}  // namespace

class WindowSystem::PaintCanvas : public Canvas {
 public:
  PaintCanvas(WindowSystem& system, WindowHandle window) : system_(system), window_(window) {}

  void Fill(const Rectangle& area, Color color) override { Add(FillOperation{area, color}); }
  void DrawText(int x, int y, std::u16string_view text, const Font& font, Color color,
                std::optional<Color> background) override {
    Add(TextOperation{{x, y, x, y}, false, {}, std::u16string(text), font, color, background});
  }
  void DrawTextBox(const Rectangle& area, std::u16string_view text, const TextLayout& layout, const Font& font,
                   Color color, std::optional<Color> background) override {
    Add(TextOperation{area, true, layout, std::u16string(text), font, color, background});
  }
  void DrawImage(int x, int y, std::u16string_view path, const Rectangle& clip) override {
    Add(ImageOperation{x, y, std::u16string(path), clip});
  }

 private:
  // Called by a window's own code.
  void Add(DrawOperation operation) {
    system_.host_.RunInside([&] {
      if (Window* window = system_.Find(window_)) {
        window->operations.push_back(std::move(operation));
        system_.Changed();
      }
    });
  }

  WindowSystem& system_;
  WindowHandle window_;
};

std::unique_ptr<Canvas> WindowSystem::BeginPaint(WindowHandle handle) {
  if (Window* window = Find(handle)) {
    window->dirty = false;
    window->operations.clear();
    Changed();
  }
  return std::make_unique<PaintCanvas>(*this, handle);
}

std::vector<WindowHandle> WindowSystem::TopLevelWindows() const {
  std::vector<WindowHandle> visible;
  std::copy_if(order_.begin(), order_.end(), std::back_inserter(visible),
               [&](WindowHandle handle) { return Find(handle)->visible; });
  return visible;
}

void WindowSystem::AddToScene(Scene& scene, const Window& window, const Rectangle& clip) const {
  if (!window.visible) {
    return;
  }
  SceneWindow picture;
  picture.handle = window.handle;
  picture.topLevel = TopLevelOf(window.handle);
  picture.kind = window.kind;
  picture.frame = ScreenRectangle(window.handle);
  picture.client = ClientOnScreen(window);
  picture.clip = Intersect(picture.frame, clip);
  picture.border = (window.style & style::kBorder) != 0;
  picture.raisedFrame = (window.style & (style::kDialogFrame | style::kSizeFrame)) != 0;
  picture.background = window.windowClass ? window.windowClass->background : kButtonFaceColor;
  if (!window.windowClass) {
    if (const Window* parent = Find(window.parent); parent != nullptr && parent->windowClass) {
      picture.background = parent->windowClass->background;
    }
  }
  if (window.ownBackground) {
    picture.background = *window.ownBackground;
  }
  picture.ownBackground = window.ownBackground;
  picture.centred =
      window.kind == WindowKind::kStatic && (window.style & style::kStaticTypeMask) == style::kStaticCentred;
  picture.text = window.text;
  picture.iconPath = window.iconPath;
  picture.font = window.font;
  picture.enabled = window.enabled;
  picture.heavyFrame = HasHeavyFrame(window);
  picture.caret = window.caret;
  picture.topmost = window.topmost;
  picture.pressed = window.pressed;
  picture.vertical = (window.style & style::kScrollBarVertical) != 0;
  picture.scroll = window.scroll;
  picture.operations = window.operations;
  for (const auto& [thread, queue] : queues_) {
    picture.focused = picture.focused || queue->focus == window.handle;
  }
  const Rectangle inner = Intersect(picture.client, clip);
  scene.windows.push_back(std::move(picture));
  for (const WindowHandle child : window.children) {
    AddToScene(scene, *Find(child), inner);
  }
}

// The button that has the focus, and the default one while no button has it.
bool WindowSystem::HasHeavyFrame(const Window& button) const {
  if (button.kind != WindowKind::kButton) {
    return false;
  }
  const auto queue = queues_.find(button.thread);
  const Window* focused = queue == queues_.end() ? nullptr : Find(queue->second->focus);
  if (focused != nullptr && focused->kind == WindowKind::kButton && focused->parent == button.parent) {
    return focused == &button;
  }
  return (button.style & 0xFU) == style::kDefaultPushButton;
}

Scene WindowSystem::MakeScene() const {
  Scene scene;
  scene.width = screenWidth_;
  scene.height = screenHeight_;
  scene.foreground = foreground_;
  scene.foregroundRequest = foregroundRequests_;
  scene.language = language_;
  for (const WindowHandle handle : order_) {
    AddToScene(scene, *Find(handle), {0, 0, screenWidth_, screenHeight_});
  }
  return scene;
}

}  // namespace panelglow::platform::desktop
