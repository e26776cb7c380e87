// Makes the picture of all windows.
#pragma once

#include <vector>

#include "platform/desktop/Scene.h"
#include "platform/desktop/WindowTree.h"

namespace panelglow::platform::desktop {

class SceneBuilder {
 public:
  /// `focused`: the windows that have the keyboard, each of its thread.
  SceneBuilder(const WindowTree& tree, std::vector<WindowHandle> focused)
      : tree_(tree), focused_(std::move(focused)) {}

  /// The visible windows within a screen of this size, bottom-most first.
  [[nodiscard]] std::vector<SceneWindow> Build(int screenWidth, int screenHeight) const;

 private:
  void Add(std::vector<SceneWindow>& windows, const Window& window, const Rectangle& clip) const;
  [[nodiscard]] SceneWindow PictureOf(const Window& window) const;
  [[nodiscard]] Color BackgroundOf(const Window& window) const;
  [[nodiscard]] bool HasHeavyFrame(const Window& button) const;
  [[nodiscard]] bool IsFocused(WindowHandle window) const;

  const WindowTree& tree_;
  std::vector<WindowHandle> focused_;
};

}  // namespace panelglow::platform::desktop
