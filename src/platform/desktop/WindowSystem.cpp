#include "platform/desktop/WindowSystem.h"

#include <algorithm>
#include <array>
#include <utility>

#include "platform/desktop/ScrollParts.h"

namespace panelglow::platform::desktop {

namespace {

// Places and sizes are 16-bit numbers on the home system: what lies beyond is cut to that.
int Coordinate(int value) { return std::clamp(value, -32768, 32767); }

Rectangle PlaceOf(int x, int y, int width, int height) {
  const int left = Coordinate(x);
  const int top = Coordinate(y);
  return {left, top, left + Coordinate(width), top + Coordinate(height)};
}

constexpr std::uint32_t kShortestTimer_ms = 10;

// Virtual-key codes of the dialog keys.
constexpr std::uint32_t kTabKey = 0x09;
constexpr std::uint32_t kEnterKey = 0x0D;
constexpr std::uint32_t kEscapeKey = 0x1B;
constexpr std::uint32_t kSpaceKey = 0x20;
constexpr std::uint32_t kLeftKey = 0x25;
constexpr std::uint32_t kUpKey = 0x26;
constexpr std::uint32_t kRightKey = 0x27;
constexpr std::uint32_t kDownKey = 0x28;

// Commands that a dialog gets for Enter without a default button, and for Escape.
constexpr std::uintptr_t kOkCommand = 1;
constexpr std::uintptr_t kCancelCommand = 2;

constexpr std::uint32_t kLimitEditCharacters = 30000;

// Edges of a frame that the mouse drags.
constexpr int kLeftEdge = 1;
constexpr int kTopEdge = 2;
constexpr int kRightEdge = 4;
constexpr int kBottomEdge = 8;

WindowKind KindOf(std::string_view className, std::uint32_t style) {
  if (className == "BUTTON") {
    return WindowKind::kButton;
  }
  if (className == "EDIT") {
    return WindowKind::kEdit;
  }
  if (className == "SCROLLBAR") {
    return WindowKind::kScrollBar;
  }
  if (className == "STATIC") {
    switch (style & style::kStaticTypeMask) {
      case style::kStaticIcon:
        return WindowKind::kIcon;
      case style::kStaticBitmap:
        return WindowKind::kImageArea;
      default:
        return WindowKind::kStatic;
    }
  }
  return WindowKind::kPlain;
}

// Width of the frame on each side, by style: a sizing frame, a dialog frame, a thin border.
int FrameWidth(std::uint32_t windowStyle) {
  if ((windowStyle & style::kSizeFrame) != 0) {
    return 4;
  }
  if ((windowStyle & style::kDialogFrame) != 0) {
    return 3;
  }
  return (windowStyle & style::kBorder) != 0 ? 1 : 0;
}

Rectangle Intersect(const Rectangle& a, const Rectangle& b) {
  Rectangle r{std::max(a.left, b.left), std::max(a.top, b.top), std::min(a.right, b.right),
              std::min(a.bottom, b.bottom)};
  r.right = std::max(r.right, r.left);
  r.bottom = std::max(r.bottom, r.top);
  return r;
}

int XOf(const Message& message) { return static_cast<std::int16_t>(message.lParam & 0xFFFF); }
int YOf(const Message& message) { return static_cast<std::int16_t>(message.lParam >> 16 & 0xFFFF); }

char16_t UpperLetter(char16_t c) { return c >= u'a' && c <= u'z' ? static_cast<char16_t>(c - 32) : c; }

// The letter behind the first single '&' of a caption, 0 when there is none.
char16_t MnemonicOf(std::u16string_view caption) {
  for (std::size_t i = 0; i + 1 < caption.size(); ++i) {
    if (caption[i] == u'&') {
      if (caption[i + 1] != u'&') {
        return UpperLetter(caption[i + 1]);
      }
      ++i;
    }
  }
  return 0;
}

}  // namespace

struct WindowSystem::Window {
  WindowHandle handle = 0;
  std::uint32_t thread = 0;
  std::shared_ptr<const WindowClass> windowClass;  // null for a built-in control
  WindowKind kind = WindowKind::kPlain;
  WindowProcedure procedure;
  std::uint32_t style = 0;
  bool topmost = false;
  bool visible = false;
  bool enabled = true;
  bool dirty = false;
  bool pressed = false;
  Rectangle area;  // client coordinates of the parent, or the screen
  WindowHandle parent = 0;
  std::vector<WindowHandle> children;
  int id = 0;
  std::vector<std::intptr_t> extra;
  wstring text;
  wstring iconPath;
  std::optional<Color> ownBackground;
  Font font;
  ScrollState scroll;
  std::vector<DrawOperation> operations;
};

struct WindowSystem::Queue {
  std::deque<Message> posted;
  std::deque<std::shared_ptr<SentMessage>> sent;
  std::deque<Input> input;
  std::vector<Timer> timers;
  WindowHandle focus = 0;
  WindowHandle active = 0;
  bool quit = false;
};

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

WindowSystem::WindowSystem(WindowHost& host, int screenWidth, int screenHeight)
    : host_(host), screenWidth_(screenWidth), screenHeight_(screenHeight) {}

WindowSystem::~WindowSystem() = default;

WindowSystem::Window* WindowSystem::Find(WindowHandle window) const {
  const auto found = windows_.find(window);
  return found == windows_.end() ? nullptr : found->second.get();
}

WindowSystem::Queue& WindowSystem::QueueOf(std::uint32_t thread) {
  std::unique_ptr<Queue>& queue = queues_[thread];
  if (!queue) {
    queue = std::make_unique<Queue>();
  }
  return *queue;
}

// ---- classes and windows

bool WindowSystem::RegisterWindowClass(const WindowClass& windowClass) {
  return classes_.emplace(windowClass.name, std::make_shared<const WindowClass>(windowClass)).second;
}

void WindowSystem::UnregisterWindowClass(std::string_view name) {
  const auto found = classes_.find(name);
  if (found != classes_.end()) {
    classes_.erase(found);  // windows of the class keep it alive
  }
}

WindowHandle WindowSystem::CreateWindow(const WindowRequest& request) {
  if (!HasScreen()) {
    host_.Spend();
    return 0;
  }
  const WindowKind kind = KindOf(request.className, request.style);
  const auto found = classes_.find(request.className);
  if (kind == WindowKind::kPlain && found == classes_.end()) {
    return 0;
  }
  auto owned = std::make_unique<Window>();
  Window& window = *owned;
  window.handle = nextWindow_++;
  window.thread = host_.CurrentThread();
  window.kind = kind;
  if (kind == WindowKind::kPlain) {
    window.windowClass = found->second;
    window.procedure = found->second->procedure;
    window.extra.resize(found->second->extraWords);
  } else {
    window.procedure = [this](const Message& message) {
      std::intptr_t result = 0;
      host_.RunInside([&] { result = ControlProcedure(message); });
      return result;
    };
  }
  window.style = request.style;
  window.topmost = (request.extendedStyle & style::kExTopmost) != 0;
  window.enabled = (request.style & style::kDisabled) == 0;
  window.area = PlaceOf(request.x, request.y, request.width, request.height);
  window.parent = request.parent;
  window.text = request.text;
  const WindowHandle handle = window.handle;
  windows_.emplace(handle, std::move(owned));
  Changed();
  if (Window* parent = Find(request.parent)) {
    parent->children.push_back(handle);
  } else {
    order_.push_back(handle);
    Raise(handle, window.topmost ? ZOrder::kTopmost : ZOrder::kTop);
  }
  QueueOf(host_.CurrentThread());
  const bool visible = (request.style & style::kVisible) != 0;
  if (kind == WindowKind::kPlain) {
    if (Call({handle, message::kCreate, 0, request.creationParameter}) == -1 || Find(handle) == nullptr) {
      DestroyWindow(handle);
      return 0;
    }
    SendSize(handle);
  } else {
    AskForColor(handle);
  }
  // Not before: a window whose creation waits for something is not there for anybody yet.
  if (visible) {
    ShowWindow(handle, true);
  }
  Invalidate(handle);
  if (request.parent == 0 && IsWindowVisible(handle)) {
    SetForegroundWindow(handle);
  }
  return handle;
}

void WindowSystem::DestroyWindow(WindowHandle handle) {
  Window* window = Find(handle);
  if (window == nullptr) {
    return;
  }
  if (window->procedure) {
    Call({handle, message::kDestroy, 0, 0});
  }
  window = Find(handle);
  if (window == nullptr) {
    return;
  }
  for (const WindowHandle child : std::vector<WindowHandle>(window->children)) {
    DestroyWindow(child);
  }
  for (auto& [thread, queue] : queues_) {
    std::erase_if(queue->timers, [&](const Timer& timer) { return timer.window == handle; });
    std::erase_if(queue->posted, [&](const Message& message) { return message.window == handle; });
    queue->focus = queue->focus == handle ? 0 : queue->focus;
    queue->active = queue->active == handle ? 0 : queue->active;
  }
  if (Window* parent = Find(window->parent)) {
    std::erase(parent->children, handle);
  }
  std::erase(order_, handle);
  windows_.erase(handle);
  captured_ = captured_ == handle ? 0 : captured_;
  Changed();
  if (foreground_ == handle) {
    const auto visible =
        std::find_if(order_.rbegin(), order_.rend(), [&](WindowHandle w) { return Find(w)->visible; });
    foreground_ = visible == order_.rend() ? 0 : *visible;
  }
}

void WindowSystem::EndThread() {
  const std::uint32_t thread = host_.CurrentThread();
  std::vector<WindowHandle> own;
  for (const auto& [handle, window] : windows_) {
    if (window->thread == thread && window->parent == 0) {
      own.push_back(handle);
    }
  }
  for (const WindowHandle handle : own) {
    DestroyWindow(handle);
  }
  queues_.erase(thread);
}

void WindowSystem::SetTopmost(Window& window, bool topmost) { window.topmost = topmost; }

void WindowSystem::Raise(WindowHandle handle, ZOrder order) {
  Window* window = Find(handle);
  if (window == nullptr || window->parent != 0) {
    return;
  }
  if (order == ZOrder::kTopmost) {
    SetTopmost(*window, true);
  }
  std::erase(order_, handle);
  auto place = order_.end();
  if (!window->topmost) {
    place = std::find_if(order_.begin(), order_.end(), [&](WindowHandle other) { return Find(other)->topmost; });
  }
  order_.insert(place, handle);
  Changed();
}

void WindowSystem::SetWindowPosition(WindowHandle handle, ZOrder order, int x, int y, int width, int height,
                                     std::uint32_t flags) {
  Window* window = Find(handle);
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
  Window* window = Find(handle);
  if (window == nullptr) {
    return;
  }
  TrackLimits limits{0, 0, 0, 0};
  if ((window->style & style::kSizeFrame) != 0) {
    Call({handle, message::kGetMinMaxInfo, 0, reinterpret_cast<std::intptr_t>(&limits)});
    width = std::max(width, limits.minimumWidth);
    height = std::max(height, limits.minimumHeight);
    width = limits.maximumWidth > 0 ? std::min(width, limits.maximumWidth) : width;
    height = limits.maximumHeight > 0 ? std::min(height, limits.maximumHeight) : height;
    window = Find(handle);
    if (window == nullptr) {
      return;
    }
  }
  const Rectangle before = window->area;
  window->area = PlaceOf(x, y, width, height);
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
  const Window* window = Find(handle);
  if (window == nullptr || window->kind != WindowKind::kPlain) {
    return;
  }
  const Rectangle client = ClientRectangle(handle);
  const auto packed = static_cast<std::intptr_t>((static_cast<std::uint32_t>(client.Height() & 0xFFFF) << 16U) |
                                                 static_cast<std::uint32_t>(client.Width() & 0xFFFF));
  Call({handle, message::kSize, 0, packed});
}

// Asked once, when a button or a text is created: the windows of this program do not change their colours.
void WindowSystem::AskForColor(WindowHandle control) {
  const Window* window = Find(control);
  if (window->kind != WindowKind::kButton && window->kind != WindowKind::kStatic) {
    return;
  }
  const std::uint32_t question =
      window->kind == WindowKind::kButton ? message::kControlColorButton : message::kControlColorStatic;
  const std::intptr_t answer = Send({window->parent, question, 0, static_cast<std::intptr_t>(control)});
  if (Window* asked = Find(control); asked != nullptr && answer != 0) {
    asked->ownBackground = static_cast<Color>(answer & 0x00FFFFFF);
  }
}

void WindowSystem::ShowWindow(WindowHandle handle, bool visible) {
  if (Window* window = Find(handle); window != nullptr && window->visible != visible) {
    window->visible = visible;
    Changed();
    Invalidate(handle);
  }
}

void WindowSystem::EnableWindow(WindowHandle handle, bool enabled) {
  Window* window = Find(handle);
  if (window == nullptr || window->enabled == enabled) {
    return;
  }
  window->enabled = enabled;
  Changed();
  Queue& queue = QueueOf(window->thread);
  if (!enabled && queue.focus == handle) {
    queue.focus = 0;
    Call({handle, message::kKillFocus, 0, 0});
  }
}

bool WindowSystem::IsWindowEnabled(WindowHandle handle) {
  const Window* window = Find(handle);
  return window != nullptr && window->enabled;
}

bool WindowSystem::IsShown(const Window& window) const {
  const Window* at = &window;
  while (at != nullptr && at->visible) {
    if (at->parent == 0) {
      return true;
    }
    at = Find(at->parent);
  }
  return false;
}

bool WindowSystem::IsWindowVisible(WindowHandle handle) {
  const Window* window = Find(handle);
  return window != nullptr && IsShown(*window);
}

Rectangle WindowSystem::WindowRectangle(WindowHandle handle) {
  const Window* window = Find(handle);
  return window == nullptr ? Rectangle{} : window->area;
}

Rectangle WindowSystem::ClientRectangle(WindowHandle handle) {
  const Window* window = Find(handle);
  if (window == nullptr) {
    return {};
  }
  const int frame = FrameWidth(window->style);
  return {0, 0, std::max(0, window->area.Width() - 2 * frame), std::max(0, window->area.Height() - 2 * frame)};
}

Rectangle WindowSystem::ClientOnScreen(const Window& window) const {
  const Rectangle frame = ScreenRectangle(window.handle);
  const int width = FrameWidth(window.style);
  return {frame.left + width, frame.top + width, std::max(frame.left + width, frame.right - width),
          std::max(frame.top + width, frame.bottom - width)};
}

Rectangle WindowSystem::ScreenRectangle(WindowHandle handle) const {
  const Window* window = Find(handle);
  if (window == nullptr) {
    return {};
  }
  Rectangle area = window->area;
  if (const Window* parent = Find(window->parent)) {
    const Rectangle outer = ScreenRectangle(parent->handle);
    const int frame = FrameWidth(parent->style);
    const int dx = outer.left + frame;
    const int dy = outer.top + frame;
    area = {area.left + dx, area.top + dy, area.right + dx, area.bottom + dy};
  }
  return area;
}

wstring WindowSystem::WindowText(WindowHandle handle) {
  const Window* window = Find(handle);
  return window == nullptr ? wstring() : window->text;
}

void WindowSystem::SetWindowText(WindowHandle handle, std::u16string_view text) {
  if (Window* window = Find(handle)) {
    window->text = text;
    Changed();
  }
}

void WindowSystem::SetFont(WindowHandle handle, const Font& font) {
  if (Window* window = Find(handle)) {
    window->font = font;
    Changed();
  }
}

void WindowSystem::SetIcon(WindowHandle handle, std::u16string_view path) {
  if (Window* window = Find(handle); window != nullptr && window->kind == WindowKind::kIcon) {
    window->iconPath = path;
    Changed();
  }
}

void WindowSystem::SetControlId(WindowHandle handle, int id) {
  if (Window* window = Find(handle)) {
    window->id = id;
  }
}

int WindowSystem::ControlId(WindowHandle handle) {
  const Window* window = Find(handle);
  return window == nullptr ? 0 : window->id;
}

void WindowSystem::SetExtraWord(WindowHandle handle, std::size_t index, std::intptr_t value) {
  if (Window* window = Find(handle); window != nullptr && index < window->extra.size()) {
    window->extra[index] = value;
  }
}

std::intptr_t WindowSystem::ExtraWord(WindowHandle handle, std::size_t index) {
  const Window* window = Find(handle);
  return window != nullptr && index < window->extra.size() ? window->extra[index] : 0;
}

WindowProcedure WindowSystem::SetProcedure(WindowHandle handle, WindowProcedure procedure) {
  Window* window = Find(handle);
  if (window == nullptr) {
    return {};
  }
  return std::exchange(window->procedure, std::move(procedure));
}

WindowHandle WindowSystem::Parent(WindowHandle handle) {
  const Window* window = Find(handle);
  return window == nullptr ? 0 : window->parent;
}

std::vector<WindowHandle> WindowSystem::Children(WindowHandle handle) {
  const Window* window = Find(handle);
  return window == nullptr ? std::vector<WindowHandle>{} : window->children;
}

WindowHandle WindowSystem::FindControl(WindowHandle parent, int id) {
  const Window* window = Find(parent);
  if (window == nullptr) {
    return 0;
  }
  const auto found = std::find_if(window->children.begin(), window->children.end(),
                                  [&](WindowHandle c) { return Find(c)->id == id; });
  return found == window->children.end() ? 0 : *found;
}

WindowHandle WindowSystem::TopLevelOf(WindowHandle handle) const {
  const Window* window = Find(handle);
  while (window != nullptr && window->parent != 0) {
    window = Find(window->parent);
  }
  return window == nullptr ? 0 : window->handle;
}

bool WindowSystem::IsDescendant(WindowHandle ancestor, WindowHandle handle) const {
  for (const Window* window = Find(handle); window != nullptr; window = Find(window->parent)) {
    if (window->handle == ancestor) {
      return true;
    }
  }
  return false;
}

// ---- focus and order

void WindowSystem::SetFocus(WindowHandle handle) {
  Queue& queue = OwnQueue();
  const Window* window = Find(handle);
  if (queue.focus == handle || (handle != 0 && (window == nullptr || !window->enabled))) {
    return;
  }
  if (handle != 0) {
    Activate(TopLevelOf(handle));
    if (queue.focus == handle) {
      return;
    }
  }
  const WindowHandle loser = std::exchange(queue.focus, handle);
  Changed();
  if (loser != 0) {
    Call({loser, message::kKillFocus, handle, 0});
  }
  if (handle != 0 && queue.focus == handle) {
    Call({handle, message::kSetFocus, loser, 0});
  }
}

WindowHandle WindowSystem::Focus() { return OwnQueue().focus; }

void WindowSystem::Activate(WindowHandle handle) {
  const Window* window = Find(handle);
  if (window == nullptr) {
    return;
  }
  Queue& queue = QueueOf(window->thread);
  if (queue.active == handle) {
    return;
  }
  const WindowHandle former = std::exchange(queue.active, handle);
  if (former != 0) {
    Call({former, message::kActivate, 0, 0});
  }
  Send({handle, message::kActivate, 1, 0});
}

bool WindowSystem::SetForegroundWindow(WindowHandle handle) {
  host_.Spend();
  const Window* window = Find(handle);
  if (window == nullptr || window->parent != 0) {
    return false;
  }
  if (foreground_ != handle || order_.back() != handle) {
    Raise(handle, ZOrder::kTop);
    foreground_ = handle;
    Changed();
  }
  if (window->thread == host_.CurrentThread()) {
    Activate(handle);
  }
  return true;
}

void WindowSystem::SetActiveWindow(WindowHandle handle) { Activate(handle); }

void WindowSystem::AttachInput(WindowHandle /*other*/, bool /*attach*/) {
  // All windows of this screen are one program's: the foreground is never refused, so there is nothing to share.
}

// ---- timers

std::uint32_t WindowSystem::SetTimer(WindowHandle handle, std::uint32_t timer, std::uint32_t period_ms,
                                     TimerProcedure procedure) {
  const Window* window = Find(handle);
  if (window == nullptr) {
    return 0;
  }
  KillTimer(handle, timer);
  const std::uint32_t period = std::max(period_ms, kShortestTimer_ms);
  QueueOf(window->thread).timers.push_back({handle, timer, period, host_.Now_ms() + period, std::move(procedure)});
  return timer;
}

void WindowSystem::KillTimer(WindowHandle handle, std::uint32_t timer) {
  if (const Window* window = Find(handle)) {
    std::erase_if(QueueOf(window->thread).timers,
                  [&](const Timer& t) { return t.window == handle && t.id == timer; });
  }
}

// ---- messages

// Runs a window's procedure on the calling thread.
std::intptr_t WindowSystem::Call(const Message& message) {
  const Window* window = Find(message.window);
  if (window == nullptr || !window->procedure) {
    return 0;
  }
  const WindowProcedure procedure = window->procedure;  // the window may end itself while it runs
  std::intptr_t result = 0;
  host_.RunProcedure([&] { result = procedure(message); });
  return result;
}

std::intptr_t WindowSystem::Send(const Message& message) {
  const Window* window = Find(message.window);
  if (window == nullptr) {
    return 0;
  }
  if (window->thread == host_.CurrentThread()) {
    return Call(message);
  }
  Queue& queue = QueueOf(window->thread);
  auto sent = std::make_shared<SentMessage>();
  sent->message = message;
  queue.sent.push_back(sent);
  host_.Wake(&queue);
  while (!sent->done && Find(message.window) != nullptr) {
    host_.Block(sent.get(), "the answer to a sent message", host_.Now_ms() + 100);
  }
  return sent->result;
}

void WindowSystem::HandleSentMessages(Queue& queue) {
  while (!queue.sent.empty()) {
    const std::shared_ptr<SentMessage> sent = queue.sent.front();
    queue.sent.pop_front();
    sent->result = Call(sent->message);
    sent->done = true;
    host_.Wake(sent.get());
  }
}

void WindowSystem::Post(const Message& message) {
  if (const Window* window = Find(message.window)) {
    Queue& queue = QueueOf(window->thread);
    queue.posted.push_back(message);
    host_.Wake(&queue);
  }
}

void WindowSystem::PostQuit() { OwnQueue().quit = true; }

bool WindowSystem::GetMessage(Message& message) {
  host_.Spend();
  if (!HasScreen()) {
    message = {0, message::kQuit, 0, 0};
    return false;
  }
  const std::uint32_t thread = host_.CurrentThread();
  Queue& queue = QueueOf(thread);
  for (;;) {
    HandleSentMessages(queue);
    if (!queue.posted.empty()) {
      message = queue.posted.front();
      queue.posted.pop_front();
      return true;
    }
    if (TakeInput(queue, message)) {
      return true;
    }
    if (queue.quit) {
      queue.quit = false;
      message = {0, message::kQuit, 0, 0};
      return false;
    }
    if (TakeTimer(queue, message) || TakePaint(thread, message)) {
      return true;
    }
    std::optional<std::uint64_t> due;
    for (const Timer& timer : queue.timers) {
      due = due ? std::min(*due, timer.due_ms) : timer.due_ms;
    }
    host_.Block(&queue, "a message", due);
  }
}

bool WindowSystem::TakeInput(Queue& queue, Message& message) {
  while (!queue.input.empty()) {
    const Input input = queue.input.front();
    queue.input.pop_front();
    if (input.kind == InputKind::kKey ? TakeKey(queue, input, message) : TakeMouse(input, message)) {
      return true;
    }
  }
  return false;
}

bool WindowSystem::TakeKey(Queue& queue, const Input& input, Message& message) {
  const WindowHandle target = queue.focus != 0 ? queue.focus : queue.active;
  if (target == 0) {
    return false;
  }
  message = {target, input.alt ? message::kSysKeyDown : message::kKeyDown, input.virtualKey, 0};
  queue.posted.push_front({target, input.alt ? message::kSysKeyUp : message::kKeyUp, input.virtualKey, 0});
  if (input.character != 0) {
    queue.posted.push_front({target, input.alt ? message::kSysChar : message::kChar, input.character, 0});
  }
  return true;
}

bool WindowSystem::TakeMouse(const Input& input, Message& message) {
  if (input.kind == InputKind::kMouseDown) {
    captured_ = WindowAt(input.x, input.y);
    if (const Window* window = Find(captured_)) {
      dragEdges_ = FrameEdgesAt(*window, input.x, input.y);
      dragX_ = input.x;
      dragY_ = input.y;
      SetForegroundWindow(TopLevelOf(captured_));
    }
  }
  const WindowHandle target = captured_;
  if (input.kind == InputKind::kMouseUp) {
    captured_ = 0;
  }
  const Window* window = Find(target);
  if (window == nullptr || window->thread != host_.CurrentThread()) {
    return false;
  }
  if (dragEdges_ != 0) {
    if (input.kind == InputKind::kMouseMove) {
      captured_ = target;
      DragFrame(input.x, input.y);
    }
    return false;
  }
  const Rectangle frame = ScreenRectangle(target);
  const auto packed = static_cast<std::intptr_t>((static_cast<std::uint32_t>(input.y - frame.top) & 0xFFFFU) << 16U |
                                                 (static_cast<std::uint32_t>(input.x - frame.left) & 0xFFFFU));
  switch (input.kind) {
    case InputKind::kMouseDown:
      message = {target, message::kLeftButtonDown, 1, packed};
      break;
    case InputKind::kMouseUp:
      message = {target, message::kLeftButtonUp, 0, packed};
      break;
    default:
      message = {target, message::kMouseMove, 1, packed};
      break;
  }
  return true;
}

// Which edges of a sizing frame a point is on, as bits; 0 for none.
int WindowSystem::FrameEdgesAt(const Window& window, int x, int y) const {
  constexpr int kCorner = 12;  // pixels from a corner where both edges are taken
  if ((window.style & style::kSizeFrame) == 0) {
    return 0;
  }
  const Rectangle frame = ScreenRectangle(window.handle);
  if (ClientOnScreen(window).Contains(x, y)) {
    return 0;
  }
  return (x < frame.left + kCorner ? kLeftEdge : 0) | (y < frame.top + kCorner ? kTopEdge : 0) |
         (x >= frame.right - kCorner ? kRightEdge : 0) | (y >= frame.bottom - kCorner ? kBottomEdge : 0);
}

void WindowSystem::DragFrame(int x, int y) {
  const Window* window = Find(captured_);
  const int dx = x - dragX_;
  const int dy = y - dragY_;
  const Rectangle before = window->area;
  Rectangle area = before;
  area.left += (dragEdges_ & kLeftEdge) != 0 ? dx : 0;
  area.right += (dragEdges_ & kRightEdge) != 0 ? dx : 0;
  area.top += (dragEdges_ & kTopEdge) != 0 ? dy : 0;
  area.bottom += (dragEdges_ & kBottomEdge) != 0 ? dy : 0;
  const WindowHandle handle = captured_;
  MoveWindow(handle, area.left, area.top, std::max(1, area.Width()), std::max(1, area.Height()));
  window = Find(handle);
  if (window == nullptr) {
    return;
  }
  // The edge that is not dragged stays where it was, also when a limit keeps the window from following the mouse.
  Rectangle now = window->area;
  const int left = (dragEdges_ & kLeftEdge) != 0 ? before.right - now.Width() : before.left;
  const int top = (dragEdges_ & kTopEdge) != 0 ? before.bottom - now.Height() : before.top;
  if (left != now.left || top != now.top) {
    MoveWindow(handle, left, top, now.Width(), now.Height());
  }
  dragX_ = x;
  dragY_ = y;
}

bool WindowSystem::TakeTimer(Queue& queue, Message& message) {
  const std::uint64_t now = host_.Now_ms();
  Timer* first = nullptr;
  for (Timer& timer : queue.timers) {
    if (timer.due_ms <= now && (first == nullptr || timer.due_ms < first->due_ms)) {
      first = &timer;
    }
  }
  if (first == nullptr) {
    return false;
  }
  // A thread that was busy gets one tick, not the missed ones.
  first->due_ms += first->period_ms;
  if (first->due_ms <= now) {
    first->due_ms = now + first->period_ms;
  }
  message = {first->window, message::kTimer, first->id, first->procedure ? 1 : 0};
  return true;
}

bool WindowSystem::TakePaint(std::uint32_t thread, Message& message) {
  for (const auto& [handle, window] : windows_) {
    if (window->thread == thread && window->dirty && IsShown(*window)) {
      message = {handle, message::kPaint, 0, 0};
      return true;
    }
  }
  return false;
}

void WindowSystem::Translate(const Message& /*message*/) {
  // Character messages are made where the key comes in.
}

void WindowSystem::Dispatch(const Message& message) {
  const Window* window = Find(message.window);
  if (window == nullptr) {
    return;
  }
  if (message.id == message::kTimer && message.lParam != 0) {
    for (const Timer& timer : QueueOf(window->thread).timers) {
      if (timer.window == message.window && timer.id == message.wParam && timer.procedure) {
        const TimerProcedure procedure = timer.procedure;
        host_.RunProcedure([&] { procedure(message.window, static_cast<std::uint32_t>(message.wParam)); });
        return;
      }
    }
    return;
  }
  Call(message);
  if (message.id == message::kPaint) {
    if (Window* painted = Find(message.window)) {
      painted->dirty = false;  // a procedure that did not paint is not asked again and again
    }
  }
}

std::intptr_t WindowSystem::DefaultProcedure(const Message& message) {
  switch (message.id) {
    case message::kClose:
      DestroyWindow(message.window);
      return 0;
    case message::kActivate:
      if (message.wParam != 0) {
        SetFocus(message.window);
      }
      return 0;
    case message::kPaint:
      BeginPaint(message.window);
      return 0;
    case message::kGetDefaultId:
      if (const Window* button = Find(DefaultButton(message.window))) {
        return kHasDefaultId | (button->id & 0xFFFF);
      }
      return 0;
    default:
      return 0;
  }
}

// ---- painting

std::unique_ptr<Canvas> WindowSystem::BeginPaint(WindowHandle handle) {
  if (Window* window = Find(handle)) {
    window->dirty = false;
    window->operations.clear();
    Changed();
  }
  return std::make_unique<PaintCanvas>(*this, handle);
}

void WindowSystem::Invalidate(WindowHandle handle) {
  if (Window* window = Find(handle); window != nullptr && window->kind == WindowKind::kPlain) {
    window->dirty = true;
    host_.Wake(&QueueOf(window->thread));
  }
}

Rectangle WindowSystem::MeasureText(std::u16string_view text, int width, const Font& font) {
  SceneDrawing* drawing = drawing_ ? drawing_() : nullptr;
  if (drawing == nullptr) {
    return {0, 0, width, font.height};
  }
  const auto [w, h] = drawing->MeasureText(text, width, font);
  return {0, 0, w, h};
}

void WindowSystem::SetScroll(WindowHandle bar, const ScrollState& state) {
  if (Window* window = Find(bar)) {
    window->scroll = state;
    const int highest = std::max(state.minimum, state.maximum - std::max(0, state.page - 1));
    window->scroll.position = std::clamp(state.position, state.minimum, highest);
    Changed();
  }
}

ScrollState WindowSystem::Scroll(WindowHandle bar) {
  const Window* window = Find(bar);
  return window == nullptr ? ScrollState{} : window->scroll;
}

// ---- controls

void WindowSystem::PressButton(WindowHandle button) {
  const Window* window = Find(button);
  if (window == nullptr || !window->enabled) {
    return;
  }
  Send({window->parent, message::kCommand, static_cast<std::uintptr_t>(window->id) & 0xFFFFU,
        static_cast<std::intptr_t>(button)});
}

// A control's mouse coordinates are those of its frame.
void WindowSystem::OnControlDown(WindowHandle control, int x, int y) {
  Window* window = Find(control);
  if (window->kind == WindowKind::kButton || window->kind == WindowKind::kEdit) {
    SetFocus(control);
    window = Find(control);
    if (window != nullptr && window->kind == WindowKind::kButton) {
      window->pressed = true;
      Changed();
    }
    return;
  }
  if (window->kind != WindowKind::kScrollBar) {
    return;
  }
  const bool vertical = (window->style & style::kScrollBarVertical) != 0;
  const ScrollParts parts =
      PartsOfScrollBar({0, 0, window->area.Width(), window->area.Height()}, vertical, window->scroll);
  if (parts.backArrow.Contains(x, y)) {
    SendScroll(control, scroll::kLineBack, 0);
  } else if (parts.forwardArrow.Contains(x, y)) {
    SendScroll(control, scroll::kLineForward, 0);
  } else if (parts.thumb.Contains(x, y)) {
    window->pressed = true;
    dragX_ = x - parts.thumb.left;
    dragY_ = y - parts.thumb.top;
  } else if (parts.track.Contains(x, y)) {
    const bool back = vertical ? y < parts.thumb.top : x < parts.thumb.left;
    SendScroll(control, back ? scroll::kPageBack : scroll::kPageForward, 0);
  }
}

void WindowSystem::OnControlMove(WindowHandle control, int x, int y) {
  Window* window = Find(control);
  if (window->kind == WindowKind::kButton) {
    const bool inside = Rectangle{0, 0, window->area.Width(), window->area.Height()}.Contains(x, y);
    if (captured_ == control && inside != window->pressed) {
      window->pressed = inside;
      Changed();
    }
  } else if (window->kind == WindowKind::kScrollBar && window->pressed) {
    const bool vertical = (window->style & style::kScrollBarVertical) != 0;
    const ScrollParts parts =
        PartsOfScrollBar({0, 0, window->area.Width(), window->area.Height()}, vertical, window->scroll);
    const int along = vertical ? y - dragY_ - parts.track.top : x - dragX_ - parts.track.left;
    const int position =
        window->scroll.minimum + static_cast<int>(static_cast<long long>(std::clamp(along, 0, parts.travel)) *
                                                  parts.distance / std::max(1, parts.travel));
    SendScroll(control, scroll::kThumbTrack, position);
  }
}

void WindowSystem::OnControlUp(WindowHandle control) {
  Window* window = Find(control);
  if (!window->pressed) {
    return;
  }
  window->pressed = false;
  Changed();
  if (window->kind == WindowKind::kButton) {
    PressButton(control);
  } else if (window->kind == WindowKind::kScrollBar) {
    SendScroll(control, scroll::kThumbPosition, window->scroll.position);
  }
}

void WindowSystem::SendScroll(WindowHandle bar, std::uint32_t request, int position) {
  const Window* window = Find(bar);
  const bool vertical = (window->style & style::kScrollBarVertical) != 0;
  Send({window->parent, vertical ? message::kVerticalScroll : message::kHorizontalScroll,
        (static_cast<std::uint32_t>(position) & 0xFFFFU) << 16U | request, static_cast<std::intptr_t>(bar)});
}

std::intptr_t WindowSystem::ControlProcedure(const Message& message) {
  Window* window = Find(message.window);
  if (window == nullptr) {
    return 0;
  }
  switch (message.id) {
    case message::kLeftButtonDown:
      OnControlDown(message.window, XOf(message), YOf(message));
      return 0;
    case message::kMouseMove:
      OnControlMove(message.window, XOf(message), YOf(message));
      return 0;
    case message::kLeftButtonUp:
      OnControlUp(message.window);
      return 0;
    case message::kKeyDown:
      if (window->kind == WindowKind::kButton && message.wParam == kSpaceKey) {
        PressButton(message.window);
      }
      return 0;
    case message::kChar:
      if (window->kind == WindowKind::kEdit) {
        if (message.wParam == 8) {
          if (!window->text.empty()) {
            window->text.pop_back();
          }
        } else if (message.wParam >= 32 && window->text.size() < kLimitEditCharacters) {
          window->text.push_back(static_cast<char16_t>(message.wParam));
        }
        Changed();
      }
      return 0;
    default:
      return 0;
  }
}

// ---- dialog keys

void WindowSystem::FocusNext(WindowHandle dialog, bool backwards) {
  std::vector<WindowHandle> stops;
  for (const WindowHandle child : Find(dialog)->children) {
    const Window* window = Find(child);
    if ((window->style & style::kTabStop) != 0 && window->enabled && window->visible) {
      stops.push_back(child);
    }
  }
  if (stops.empty()) {
    return;
  }
  const auto current = std::find(stops.begin(), stops.end(), OwnQueue().focus);
  std::size_t next = backwards ? stops.size() - 1 : 0;
  if (current != stops.end()) {
    const auto at = static_cast<std::size_t>(current - stops.begin());
    next = (at + (backwards ? stops.size() - 1 : 1)) % stops.size();
  }
  SetFocus(stops[next]);
}

void WindowSystem::FocusInGroup(WindowHandle dialog, bool backwards) {
  const std::vector<WindowHandle>& children = Find(dialog)->children;
  const auto current = std::find(children.begin(), children.end(), OwnQueue().focus);
  if (current == children.end()) {
    return;
  }
  const auto count = children.size();
  auto at = static_cast<std::size_t>(current - children.begin());
  for (std::size_t step = 0; step < count; ++step) {
    at = (at + (backwards ? count - 1 : 1)) % count;
    const Window* window = Find(children[at]);
    if (window->kind == WindowKind::kButton && window->enabled && window->visible) {
      SetFocus(window->handle);
      return;
    }
  }
}

WindowHandle WindowSystem::DefaultButton(WindowHandle dialog) const {
  for (const WindowHandle child : Find(dialog)->children) {
    const Window* window = Find(child);
    if (window->kind == WindowKind::kButton && (window->style & 0xFU) == style::kDefaultPushButton) {
      return child;
    }
  }
  return 0;
}

bool WindowSystem::PressMnemonic(WindowHandle dialog, char16_t letter) {
  for (const WindowHandle child : std::vector<WindowHandle>(Find(dialog)->children)) {
    const Window* window = Find(child);
    if (window->kind == WindowKind::kButton && window->enabled && window->visible &&
        MnemonicOf(window->text) == UpperLetter(letter) && letter != 0) {
      SetFocus(child);
      PressButton(child);
      return true;
    }
  }
  return false;
}

bool WindowSystem::IsDialogMessage(WindowHandle dialog, const Message& message) {
  if (Find(dialog) == nullptr || !IsDescendant(dialog, message.window)) {
    return false;
  }
  if (message.id == message::kKeyDown) {
    const WindowHandle focus = OwnQueue().focus;
    const Window* focused = Find(focus);
    switch (message.wParam) {
      case kTabKey:
      case WindowSystem::kShiftTabKey:
        FocusNext(dialog, message.wParam == WindowSystem::kShiftTabKey);
        return true;
      case kLeftKey:
      case kUpKey:
      case kRightKey:
      case kDownKey:
        if (focused != nullptr && focused->kind == WindowKind::kButton) {
          FocusInGroup(dialog, message.wParam == kLeftKey || message.wParam == kUpKey);
          return true;
        }
        break;
      case kEnterKey:
        if (focused != nullptr && focused->kind == WindowKind::kButton && IsDescendant(dialog, focus)) {
          PressButton(focus);
        } else {
          const std::intptr_t answer = Send({dialog, message::kGetDefaultId, 0, 0});
          const WindowHandle button = FindControl(dialog, static_cast<int>(answer & 0xFFFF));
          if ((answer & ~std::intptr_t{0xFFFF}) == kHasDefaultId && button != 0) {
            PressButton(button);
          } else {
            Send({dialog, message::kCommand, kOkCommand, 0});
          }
        }
        return true;
      case kEscapeKey:
        Send({dialog, message::kCommand, kCancelCommand, 0});
        return true;
      default:
        break;
    }
  }
  if (message.id == message::kSysChar && PressMnemonic(dialog, static_cast<char16_t>(message.wParam))) {
    return true;
  }
  Translate(message);
  Dispatch(message);
  return true;
}

// ---- the screen's side

WindowHandle WindowSystem::WindowAt(int x, int y) const {
  const auto isThere = [&](WindowHandle window) {
    return Find(window)->visible && ScreenRectangle(window).Contains(x, y);
  };
  // Labels and disabled controls leave clicks to their parent.
  const auto takesClick = [&](WindowHandle window) {
    const WindowKind kind = Find(window)->kind;
    return Find(window)->enabled && isThere(window) &&
           (kind == WindowKind::kPlain || kind == WindowKind::kButton || kind == WindowKind::kEdit ||
            kind == WindowKind::kScrollBar);
  };
  const auto top = std::find_if(order_.rbegin(), order_.rend(), isThere);
  WindowHandle deepest = top == order_.rend() ? 0 : *top;
  for (bool deeper = deepest != 0; deeper;) {
    const std::vector<WindowHandle>& children = Find(deepest)->children;
    const auto child = std::find_if(children.rbegin(), children.rend(), takesClick);
    deeper = child != children.rend();
    deepest = deeper ? *child : deepest;
  }
  return deepest;
}

void WindowSystem::Click(int x, int y) {
  MouseButton(x, y, true);
  MouseButton(x, y, false);
}

void WindowSystem::MouseButton(int x, int y, bool down) {
  if (down) {
    const Window* window = Find(WindowAt(x, y));
    mouseThread_ = window == nullptr ? 0 : window->thread;
  }
  PushMouse(down ? InputKind::kMouseDown : InputKind::kMouseUp, x, y);
}

void WindowSystem::MouseMove(int x, int y) {
  if (captured_ != 0) {
    PushMouse(InputKind::kMouseMove, x, y);
  }
}

// To the thread whose window the button went down on.
void WindowSystem::PushMouse(InputKind kind, int x, int y) {
  const auto found = queues_.find(mouseThread_);
  if (found == queues_.end()) {
    return;
  }
  Input input;
  input.kind = kind;
  input.x = x;
  input.y = y;
  found->second->input.push_back(input);
  host_.Wake(found->second.get());
}

void WindowSystem::Broadcast(std::uint32_t id, std::uintptr_t wParam) {
  for (const WindowHandle handle : std::vector<WindowHandle>(order_)) {
    Post({handle, id, wParam, 0});
  }
}

void WindowSystem::Key(std::uint32_t virtualKey, char16_t character, bool alt) {
  if (const Window* window = Find(foreground_)) {
    Queue& queue = QueueOf(window->thread);
    Input input;
    input.virtualKey = virtualKey;
    input.character = character;
    input.alt = alt;
    queue.input.push_back(input);
    host_.Wake(&queue);
  }
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
  picture.defaultButton = (window.style & 0xFU) == style::kDefaultPushButton;
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

Scene WindowSystem::MakeScene() const {
  Scene scene;
  scene.width = screenWidth_;
  scene.height = screenHeight_;
  scene.foreground = foreground_;
  for (const WindowHandle handle : order_) {
    AddToScene(scene, *Find(handle), {0, 0, screenWidth_, screenHeight_});
  }
  return scene;
}

}  // namespace panelglow::platform::desktop
