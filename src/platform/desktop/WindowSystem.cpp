// Windows come and go, stand somewhere, have the focus, and are painted.
#include "platform/desktop/WindowSystem.h"

#include <algorithm>
#include <utility>

#include "platform/desktop/PaintCanvas.h"
#include "platform/desktop/SceneBuilder.h"

namespace panelglow::platform::desktop {

// ---- creation and destruction

WindowHandle WindowSystem::CreateWindow(const WindowRequest& request) {
  if (!HasScreen()) {
    host_.Spend();
    return 0;
  }
  const bool isPlain = KindOf(request.className, request.style) == WindowKind::kPlain;
  std::shared_ptr<const WindowClass> windowClass = isPlain ? FindClass(request.className) : nullptr;
  if (isPlain && !windowClass) {
    return 0;
  }
  Window& window = tree_.Add(MakeWindow(request, std::move(windowClass)));
  const WindowHandle handle = window.handle;
  window.thread = host_.CurrentThread();
  queues_.Of(window.thread);
  Changed();
  if (isPlain) {
    if (Call({handle, message::kCreate, 0, request.creationParameter}) == -1 || !IsWindow(handle) || !HasScreen()) {
      DestroyWindow(handle);
      return 0;
    }
    SendSize(handle);
  } else {
    window.procedure = [this](const Message& message) {
      host_.RunInside([&] { RunControl(message); });
      return std::intptr_t{0};
    };
    AskForColor(handle);
  }
  // Not before: a window whose creation waits for something is not there for anybody yet.
  if ((request.style & style::kVisible) != 0) {
    ShowWindow(handle, true);
  }
  Invalidate(handle);
  if (request.parent == 0 && IsWindowVisible(handle)) {
    SetForegroundWindow(handle);
  }
  return handle;
}

void WindowSystem::DestroyWindow(WindowHandle handle) {
  if (const Window* window = tree_.Find(handle); window != nullptr && window->procedure) {
    Call({handle, message::kDestroy, 0, 0});
  }
  const Window* window = tree_.Find(handle);
  if (window == nullptr) {
    return;
  }
  for (const WindowHandle child : std::vector<WindowHandle>(window->children)) {
    DestroyWindow(child);
  }
  tree_.Remove(handle);
  queues_.Forget(handle);
  mouse_.Forget(handle);
  const std::vector<WindowHandle> left = tree_.VisibleTopLevels();
  focus_.Forget(handle, left.empty() ? 0 : left.back());
  Changed();
}

void WindowSystem::EndThread() {
  const std::uint32_t thread = host_.CurrentThread();
  for (const WindowHandle handle : tree_.TopLevelsOf(thread)) {
    DestroyWindow(handle);
  }
  queues_.Remove(thread);
  focus_.RemoveThread(thread);
  mouse_.RemoveThread(thread);
}

// Asked once, when a button or a text is created: the windows of this program do not change their colours.
void WindowSystem::AskForColor(WindowHandle control) {
  const Window* window = tree_.Find(control);
  if (window->kind != WindowKind::kButton && window->kind != WindowKind::kStatic) {
    return;
  }
  const std::uint32_t question =
      window->kind == WindowKind::kButton ? message::kControlColorButton : message::kControlColorStatic;
  const std::intptr_t answer = Send({window->parent, question, 0, static_cast<std::intptr_t>(control)});
  if (Window* asked = tree_.Find(control); asked != nullptr && answer != 0) {
    asked->ownBackground = static_cast<Color>(answer & 0x00FFFFFF);
  }
}

// ---- place and state

void WindowSystem::SetWindowPosition(WindowHandle handle, ZOrder order, int x, int y, int width, int height,
                                     std::uint32_t flags) {
  const Window* window = tree_.Find(handle);
  if (window == nullptr) {
    return;
  }
  Rectangle area = window->area;
  if ((flags & position::kNoMove) == 0) {
    area = {x, y, x + area.Width(), y + area.Height()};
  }
  if ((flags & position::kNoSize) == 0) {
    area.right = area.left + width;
    area.bottom = area.top + height;
  }
  if ((flags & position::kNoZOrder) == 0) {
    Raise(handle, order);
  }
  if ((flags & position::kShowWindow) != 0) {
    ShowWindow(handle, true);
  }
  MoveWindow(handle, area.left, area.top, area.Width(), area.Height());
}

void WindowSystem::MoveWindow(WindowHandle handle, int x, int y, int width, int height) {
  Window* window = tree_.Find(handle);
  if (window != nullptr && (window->style & style::kSizeFrame) != 0) {
    TrackLimits limits{0, 0, 0, 0};
    Call({handle, message::kGetMinMaxInfo, 0, reinterpret_cast<std::intptr_t>(&limits)});
    width = std::max(width, limits.minimumWidth);
    height = std::max(height, limits.minimumHeight);
    width = limits.maximumWidth > 0 ? std::min(width, limits.maximumWidth) : width;
    height = limits.maximumHeight > 0 ? std::min(height, limits.maximumHeight) : height;
    window = tree_.Find(handle);
  }
  if (window == nullptr) {
    return;
  }
  const Rectangle before = std::exchange(window->area, PlaceOf(x, y, width, height));
  if (before == window->area) {
    return;
  }
  Changed();
  if (before.Width() != width || before.Height() != height) {
    SendSize(handle);
    Invalidate(handle);
  }
}

void WindowSystem::SendSize(WindowHandle handle) {
  const Window* window = tree_.Find(handle);
  if (window == nullptr || window->kind != WindowKind::kPlain) {
    return;
  }
  const Rectangle client = tree_.Client(handle);
  const auto packed = static_cast<std::intptr_t>((static_cast<std::uint32_t>(client.Height() & 0xFFFF) << 16U) |
                                                 static_cast<std::uint32_t>(client.Width() & 0xFFFF));
  Call({handle, message::kSize, 0, packed});
}

void WindowSystem::ShowWindow(WindowHandle handle, bool visible) {
  if (Window* window = tree_.Find(handle); window != nullptr && window->visible != visible) {
    window->visible = visible;
    Changed();
    Invalidate(handle);
  }
}

void WindowSystem::EnableWindow(WindowHandle handle, bool enabled) {
  Window* window = tree_.Find(handle);
  if (window == nullptr || window->enabled == enabled) {
    return;
  }
  window->enabled = enabled;
  Changed();
  FocusState::OfThread& state = focus_.Of(window->thread);
  if (!enabled && state.focus == handle) {
    state.focus = 0;
    Call({handle, message::kKillFocus, 0, 0});
  }
}

void WindowSystem::Raise(WindowHandle handle, ZOrder order) {
  if (tree_.Raise(handle, order)) {
    Changed();
  }
}

wstring WindowSystem::WindowText(WindowHandle handle) {
  return handle == kForeignWindow ? focus_.Foreign().value_or(wstring()) : WindowProperties::WindowText(handle);
}

// ---- focus and foreground

void WindowSystem::SetFocus(WindowHandle handle) {
  FocusState::OfThread& state = OwnFocus();
  const Window* window = tree_.Find(handle);
  if (state.focus == handle || (handle != 0 && (window == nullptr || !window->enabled))) {
    return;
  }
  if (handle != 0) {
    Activate(tree_.TopLevelOf(handle));
    if (state.focus == handle) {
      return;
    }
  }
  const WindowHandle loser = std::exchange(state.focus, handle);
  Changed();
  if (loser != 0) {
    Call({loser, message::kKillFocus, handle, 0});
  }
  if (handle != 0 && state.focus == handle) {
    Call({handle, message::kSetFocus, loser, 0});
  }
}

void WindowSystem::Activate(WindowHandle handle) {
  const Window* window = tree_.Find(handle);
  if (window == nullptr) {
    return;
  }
  FocusState::OfThread& state = focus_.Of(window->thread);
  if (state.active == handle) {
    return;
  }
  const WindowHandle former = std::exchange(state.active, handle);
  if (former != 0) {
    Call({former, message::kActivate, 0, 0});
  }
  Send({handle, message::kActivate, 1, 0});
}

void WindowSystem::SetActiveWindow(WindowHandle handle) { Activate(handle); }

bool WindowSystem::SetForegroundWindow(WindowHandle handle) {
  host_.Spend();
  const Window* window = tree_.Find(handle);
  if (window == nullptr || window->parent != 0) {
    return false;
  }
  const bool isRaised = tree_.Raise(handle, ZOrder::kTop);
  if (isRaised || focus_.Foreground() != handle || focus_.Foreign()) {
    focus_.TakeForeground(handle);
    Changed();
  }
  if (window->thread == host_.CurrentThread()) {
    Activate(handle);
  }
  return true;
}

void WindowSystem::LoseForeground(std::u16string_view title) {
  if (focus_.Foreground() == 0) {
    return;
  }
  focus_.LoseForeground(title);
  // The release of a key that is held goes to the other program.
  tree_.ForEach([this](Window& window) {
    auto* button = std::get_if<ButtonControl>(&window.control);
    if (button != nullptr && button->LoseKeyboard().changed) {
      Changed();
    }
  });
}

void WindowSystem::LoseScreen() {
  screenWidth_ = 0;
  screenHeight_ = 0;
  queues_.ForEach([this](MessageQueue& queue) { host_.Wake(&queue); });
}

void WindowSystem::AttachInput(WindowHandle /*other*/, bool /*attach*/) {
  // The foreground is never refused here, so there is nothing to share.
}

void WindowSystem::SetLanguage(std::string_view locale) {
  if (language_ != locale) {
    language_ = locale;
    Changed();
  }
}

// ---- painting

void WindowSystem::Invalidate(WindowHandle handle) {
  if (Window* window = tree_.Find(handle); window != nullptr && window->kind == WindowKind::kPlain) {
    window->dirty = true;
    host_.Wake(&queues_.Of(window->thread));
  }
}

std::unique_ptr<Canvas> WindowSystem::BeginPaint(WindowHandle handle) {
  if (Window* window = tree_.Find(handle)) {
    window->dirty = false;
    window->operations.clear();
    Changed();
  }
  // Called by the window's own code.
  return std::make_unique<PaintCanvas>([this, handle](DrawOperation operation) {
    host_.RunInside([&] {
      if (Window* window = tree_.Find(handle)) {
        window->operations.push_back(std::move(operation));
        Changed();
      }
    });
  });
}

Scene WindowSystem::MakeScene() const {
  Scene scene;
  scene.width = screenWidth_;
  scene.height = screenHeight_;
  scene.foreground = focus_.Foreground();
  scene.foregroundRequest = focus_.Requests();
  scene.language = language_;
  scene.windows = SceneBuilder(tree_, focus_.Focused()).Build(screenWidth_, screenHeight_);
  return scene;
}

}  // namespace panelglow::platform::desktop
