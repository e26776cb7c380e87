#include "platform/desktop/SceneBuilder.h"

#include <algorithm>
#include <utility>

namespace panelglow::platform::desktop {

namespace {

Rectangle Intersect(const Rectangle& a, const Rectangle& b) {
  Rectangle r{std::max(a.left, b.left), std::max(a.top, b.top), std::min(a.right, b.right),
              std::min(a.bottom, b.bottom)};
  r.right = std::max(r.right, r.left);
  r.bottom = std::max(r.bottom, r.top);
  return r;
}

void AddControl(SceneWindow& picture, const Window& window) {
  if (const auto* button = std::get_if<ButtonControl>(&window.control)) {
    picture.pressed = button->IsPressed();
  } else if (const auto* edit = std::get_if<EditControl>(&window.control)) {
    picture.caret = edit->Caret();
    picture.selectionBegin = edit->SelectionBegin();
    picture.selectionEnd = edit->SelectionEnd();
  } else if (const auto* bar = std::get_if<ScrollBarControl>(&window.control)) {
    picture.pressed = bar->IsPressed();
    picture.vertical = bar->IsVertical();
    picture.scroll = bar->Scroll();
  }
}

}  // namespace

std::vector<SceneWindow> SceneBuilder::Build(int screenWidth, int screenHeight) const {
  std::vector<SceneWindow> windows;
  for (const WindowHandle handle : tree_.Order()) {
    Add(windows, *tree_.Find(handle), {0, 0, screenWidth, screenHeight});
  }
  return windows;
}

void SceneBuilder::Add(std::vector<SceneWindow>& windows, const Window& window, const Rectangle& clip) const {
  if (!window.visible) {
    return;
  }
  SceneWindow picture = PictureOf(window);
  picture.clip = Intersect(picture.frame, clip);
  const Rectangle inner = Intersect(picture.client, clip);
  windows.push_back(std::move(picture));
  for (const WindowHandle child : window.children) {
    Add(windows, *tree_.Find(child), inner);
  }
}

SceneWindow SceneBuilder::PictureOf(const Window& window) const {
  SceneWindow picture;
  picture.handle = window.handle;
  picture.topLevel = tree_.TopLevelOf(window.handle);
  picture.kind = window.kind;
  picture.frame = tree_.FrameOnScreen(window.handle);
  picture.client = tree_.ClientOnScreen(window.handle);
  picture.border = (window.style & style::kBorder) != 0;
  picture.raisedFrame = (window.style & (style::kDialogFrame | style::kSizeFrame)) != 0;
  picture.background = BackgroundOf(window);
  picture.ownBackground = window.ownBackground;
  picture.centred =
      window.kind == WindowKind::kStatic && (window.style & style::kStaticTypeMask) == style::kStaticCentred;
  picture.text = TextOf(window);
  picture.iconPath = window.iconPath;
  picture.font = window.font;
  picture.enabled = window.enabled;
  picture.focused = IsFocused(window.handle);
  picture.heavyFrame = HasHeavyFrame(window);
  picture.topmost = window.topmost;
  picture.operations = window.operations;
  AddControl(picture, window);
  return picture;
}

// A control lies on its parent's ground, unless that gave it one of its own.
Color SceneBuilder::BackgroundOf(const Window& window) const {
  if (window.ownBackground) {
    return *window.ownBackground;
  }
  const Window* ground = window.windowClass ? &window : tree_.Find(window.parent);
  return ground != nullptr && ground->windowClass ? ground->windowClass->background : kButtonFaceColor;
}

// The button that has the focus, and the default one while no button beside it has it.
bool SceneBuilder::HasHeavyFrame(const Window& button) const {
  if (button.kind != WindowKind::kButton) {
    return false;
  }
  const bool besideFocused = std::any_of(focused_.begin(), focused_.end(), [&](WindowHandle handle) {
    const Window* focused = tree_.Find(handle);
    return focused != nullptr && focused->kind == WindowKind::kButton && focused->parent == button.parent;
  });
  return besideFocused ? IsFocused(button.handle) : (button.style & 0xFU) == style::kDefaultPushButton;
}

bool SceneBuilder::IsFocused(WindowHandle window) const {
  return std::find(focused_.begin(), focused_.end(), window) != focused_.end();
}

}  // namespace panelglow::platform::desktop
