// The half of the window logic that looks at windows and changes what they are, and sends no message: classes, texts,
// fonts, ids, kinship, rectangles, scroll states.
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "platform/Desktop.h"
#include "platform/desktop/WindowTree.h"

namespace panelglow::platform::desktop {

class WindowProperties : public Desktop {
 public:
  bool RegisterWindowClass(const WindowClass& windowClass) override;
  void UnregisterWindowClass(std::string_view name) override;
  bool IsWindow(WindowHandle window) override { return tree_.Find(window) != nullptr; }
  bool IsWindowEnabled(WindowHandle window) override;
  bool IsWindowVisible(WindowHandle window) override { return tree_.IsShown(window); }
  Rectangle WindowRectangle(WindowHandle window) override;
  Rectangle ClientRectangle(WindowHandle window) override { return tree_.Client(window); }
  wstring WindowText(WindowHandle window) override;
  void SetWindowText(WindowHandle window, std::u16string_view text) override;
  void SetFont(WindowHandle window, const Font& font) override;
  void SetIcon(WindowHandle window, std::u16string_view path) override;
  void SetControlId(WindowHandle window, int id) override;
  int ControlId(WindowHandle window) override;
  void SetExtraWord(WindowHandle window, std::size_t index, std::intptr_t value) override;
  std::intptr_t ExtraWord(WindowHandle window, std::size_t index) override;
  WindowProcedure SetProcedure(WindowHandle window, WindowProcedure procedure) override;
  WindowHandle Parent(WindowHandle window) override;
  std::vector<WindowHandle> Children(WindowHandle window) override;
  WindowHandle FindControl(WindowHandle parent, int id) override { return tree_.ChildWithId(parent, id); }
  void SetScroll(WindowHandle bar, const ScrollState& state) override;
  ScrollState Scroll(WindowHandle bar) override;

  /// Visible top-level windows, topmost last.
  [[nodiscard]] std::vector<WindowHandle> TopLevelWindows() const { return tree_.VisibleTopLevels(); }

  /// The window's frame on the screen.
  [[nodiscard]] Rectangle ScreenRectangle(WindowHandle window) const { return tree_.FrameOnScreen(window); }

  /// Grows whenever the picture of the windows changes.
  [[nodiscard]] std::uint64_t Revision() const { return revision_; }

 protected:
  void Changed() { ++revision_; }

  /// Null for a name that nobody registered.
  [[nodiscard]] std::shared_ptr<const WindowClass> FindClass(std::string_view name) const;

  WindowTree tree_;

 private:
  std::map<std::string, std::shared_ptr<const WindowClass>, std::less<>> classes_;
  std::uint64_t revision_ = 0;
};

}  // namespace panelglow::platform::desktop
