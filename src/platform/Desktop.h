// Windows, messages, timers and controls, cut to what the dialogs and prompts of this program ask.
//
// A window belongs to the thread that created it: its procedure runs there, and only there. Posted messages are taken
// in order; a sent message is a direct call on the owner's thread and waits for the owner from any other. Paint and
// timer messages are made only when nothing posted waits and no input does, timers last.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Text.h"

namespace panelglow::platform {

/// Names a window; 0 names none.
using WindowHandle = std::uint32_t;

/// A colour with red in the lowest byte, then green, then blue.
using Color = std::uint32_t;

inline constexpr Color kButtonFaceColor = 0x00F0F0F0;

/// Black or white: the one that can be read on `background`.
constexpr Color ReadableOn(Color background) {
  constexpr std::uint32_t kMiddle = 11700;  // of 65025, where both are equally far away
  const auto squared = [](std::uint32_t part) { return part * part; };
  const std::uint32_t brightness = (21 * squared(background & 0xFFU) + 72 * squared(background >> 8U & 0xFFU) +
                                    7 * squared(background >> 16U & 0xFFU)) /
                                   100;
  return brightness < kMiddle ? 0x00FFFFFF : 0;
}

/// A window's answer to kControlColorButton and kControlColorStatic: the control is to have this background. An
/// answer of 0 leaves the control its usual one.
constexpr std::intptr_t OwnControlColor(Color background) {
  return 0x01000000 | static_cast<std::intptr_t>(background);
}

/// Message numbers (the numbers are the home system's, so that a log of messages reads as its documentation does).
namespace message {
inline constexpr std::uint32_t kCreate = 0x0001;
inline constexpr std::uint32_t kDestroy = 0x0002;
inline constexpr std::uint32_t kSize = 0x0005;
inline constexpr std::uint32_t kActivate = 0x0006;
inline constexpr std::uint32_t kSetFocus = 0x0007;
inline constexpr std::uint32_t kKillFocus = 0x0008;
inline constexpr std::uint32_t kPaint = 0x000F;
inline constexpr std::uint32_t kClose = 0x0010;
inline constexpr std::uint32_t kQuit = 0x0012;
inline constexpr std::uint32_t kGetMinMaxInfo = 0x0024;
inline constexpr std::uint32_t kSetFont = 0x0030;
inline constexpr std::uint32_t kSyncPaint = 0x0088;
inline constexpr std::uint32_t kSelectAll = 0x00B1;  // 177, of an entry field
inline constexpr std::uint32_t kKeyDown = 0x0100;
inline constexpr std::uint32_t kKeyUp = 0x0101;
inline constexpr std::uint32_t kChar = 0x0102;
inline constexpr std::uint32_t kDeadChar = 0x0103;
inline constexpr std::uint32_t kSysKeyDown = 0x0104;
inline constexpr std::uint32_t kSysKeyUp = 0x0105;
inline constexpr std::uint32_t kSysChar = 0x0106;
inline constexpr std::uint32_t kSysDeadChar = 0x0107;
inline constexpr std::uint32_t kUnicodeChar = 0x0109;
inline constexpr std::uint32_t kCommand = 0x0111;
inline constexpr std::uint32_t kTimer = 0x0113;
inline constexpr std::uint32_t kHorizontalScroll = 0x0114;
inline constexpr std::uint32_t kVerticalScroll = 0x0115;
inline constexpr std::uint32_t kControlColorButton = 0x0135;  // asked of the parent, with the control in lParam
inline constexpr std::uint32_t kControlColorStatic = 0x0138;
inline constexpr std::uint32_t kSetImage = 0x0172;  // 370
inline constexpr std::uint32_t kMouseMove = 0x0200;
inline constexpr std::uint32_t kLeftButtonDown = 0x0201;
inline constexpr std::uint32_t kLeftButtonUp = 0x0202;
inline constexpr std::uint32_t kDeviceChange = 0x0219;
inline constexpr std::uint32_t kHotKey = 0x0312;
inline constexpr std::uint32_t kAppCommand = 0x0319;
inline constexpr std::uint32_t kGetDefaultId = 0x0400;  // which button Enter presses; see kHasDefaultId
}  // namespace message

/// Bits in the `lParam` of the messages of keys. The last two are our own; the home system leaves them free.
namespace key_data {
inline constexpr std::intptr_t kWasDown = 0x40000000;  // of a key going down and its character: it is held
inline constexpr std::intptr_t kShift = 0x02000000;    // the Shift key is down
inline constexpr std::intptr_t kNoKey = 0x04000000;    // of a character: it is part of a text that came in whole
}  // namespace key_data

/// What happened to a device, in the `wParam` of kDeviceChange.
namespace device_event {
inline constexpr std::uint32_t kNodesChanged = 0x0007;
inline constexpr std::uint32_t kArrival = 0x8000;
inline constexpr std::uint32_t kRemoveComplete = 0x8004;
}  // namespace device_event

/// In the answer to kGetDefaultId beside the button's id; without it there is no such button. The default procedure
/// answers with the first button of the default style.
inline constexpr std::intptr_t kHasDefaultId = 0x534B0000;

/// Window style bits.
namespace style {
inline constexpr std::uint32_t kPopup = 0x80000000;
inline constexpr std::uint32_t kChild = 0x40000000;
inline constexpr std::uint32_t kVisible = 0x10000000;
inline constexpr std::uint32_t kDisabled = 0x08000000;
inline constexpr std::uint32_t kBorder = 0x00800000;
inline constexpr std::uint32_t kDialogFrame = 0x00400000;
inline constexpr std::uint32_t kSizeFrame = 0x00040000;
inline constexpr std::uint32_t kTabStop = 0x00010000;
inline constexpr std::uint32_t kDefaultPushButton = 0x00000001;  // of a BUTTON
inline constexpr std::uint32_t kStaticTypeMask = 0x0000001F;     // of a STATIC
inline constexpr std::uint32_t kStaticCentred = 0x00000001;
inline constexpr std::uint32_t kStaticIcon = 0x00000003;
inline constexpr std::uint32_t kStaticBitmap = 0x0000000E;
inline constexpr std::uint32_t kScrollBarVertical = 0x00000001;  // of a SCROLLBAR
inline constexpr std::uint32_t kExTopmost = 0x00000008;          // extended style
}  // namespace style

/// Flags of SetWindowPosition.
namespace position {
inline constexpr std::uint32_t kNoSize = 0x0001;
inline constexpr std::uint32_t kNoMove = 0x0002;
inline constexpr std::uint32_t kNoZOrder = 0x0004;
inline constexpr std::uint32_t kShowWindow = 0x0040;
}  // namespace position

/// Scroll requests in the low word of a scroll message's `wParam`.
namespace scroll {
inline constexpr std::uint32_t kLineBack = 0;
inline constexpr std::uint32_t kLineForward = 1;
inline constexpr std::uint32_t kPageBack = 2;
inline constexpr std::uint32_t kPageForward = 3;
inline constexpr std::uint32_t kThumbPosition = 4;
inline constexpr std::uint32_t kThumbTrack = 5;
inline constexpr std::uint32_t kStart = 6;
inline constexpr std::uint32_t kEnd = 7;
inline constexpr std::uint32_t kReleased = 8;  // the mouse button, which ends what it asked for
}  // namespace scroll

struct Rectangle {
  int left = 0;
  int top = 0;
  int right = 0;   // exclusive
  int bottom = 0;  // exclusive

  [[nodiscard]] int Width() const { return right - left; }
  [[nodiscard]] int Height() const { return bottom - top; }
  [[nodiscard]] bool Contains(int x, int y) const { return x >= left && x < right && y >= top && y < bottom; }
  bool operator==(const Rectangle&) const = default;
};

struct Font {
  int height = 13;   // pixels
  int weight = 400;  // 400 normal, 600 semi-bold
  bool operator==(const Font&) const = default;
};

struct Message {
  WindowHandle window = 0;
  std::uint32_t id = 0;
  std::uintptr_t wParam = 0;
  std::intptr_t lParam = 0;
};

using WindowProcedure = std::function<std::intptr_t(const Message&)>;
using TimerProcedure = std::function<void(WindowHandle window, std::uint32_t timer)>;

struct WindowClass {
  std::string name;
  std::uint32_t style = 0;
  std::size_t extraWords = 0;  // pointer-sized words kept for the class's own use
  Color background = kButtonFaceColor;
  WindowProcedure procedure;
};

/// What a window is created with. `className` is a registered class or one of "STATIC", "BUTTON", "EDIT",
/// "SCROLLBAR". Position is on the screen for a window without a parent, in the parent's client area otherwise; the
/// size includes the frame.
struct WindowRequest {
  std::string className;
  wstring text;
  std::uint32_t style = 0;
  std::uint32_t extendedStyle = 0;
  int x = 0;
  int y = 0;
  int width = 0;
  int height = 0;
  WindowHandle parent = 0;
  std::intptr_t creationParameter = 0;  // lParam of the creation message
};

/// Minimum and maximum size of a window while it is resized; lParam of the kGetMinMaxInfo message points to it.
struct TrackLimits {
  int minimumWidth = 0;
  int minimumHeight = 0;
  int maximumWidth = 0;
  int maximumHeight = 0;
};

/// How DrawTextBox breaks lines.
struct TextLayout {
  bool wordBreak = false;
  bool editControl = false;  // break as a multi-line edit field does: a partly visible last line is left out
  bool operator==(const TextLayout&) const = default;
};

/// What a window draws on while it handles a paint message. Coordinates are client pixels.
class Canvas {
 public:
  virtual ~Canvas() = default;

  virtual void Fill(const Rectangle& area, Color color) = 0;

  /// One line of text with its top left corner at (x, y). Without `background` it is drawn transparently.
  virtual void DrawText(int x, int y, std::u16string_view text, const Font& font, Color color,
                        std::optional<Color> background) = 0;

  /// Text inside a rectangle, clipped to it.
  virtual void DrawTextBox(const Rectangle& area, std::u16string_view text, const TextLayout& layout,
                           const Font& font, Color color, std::optional<Color> background) = 0;

  /// An image file in its natural size with its top left corner at (x, y), clipped to `clip`.
  virtual void DrawImage(int x, int y, std::u16string_view path, const Rectangle& clip) = 0;
};

struct ScrollState {
  int minimum = 0;
  int maximum = 0;
  int page = 0;
  int position = 0;
  bool operator==(const ScrollState&) const = default;
};

enum class ZOrder { kTop, kTopmost };

class Desktop {
 public:
  virtual ~Desktop() = default;

  // ---- the screen
  virtual int ScreenWidth() = 0;   // pixels
  virtual int ScreenHeight() = 0;  // pixels

  // ---- classes and windows

  /// False when the name is taken.
  virtual bool RegisterWindowClass(const WindowClass& windowClass) = 0;
  virtual void UnregisterWindowClass(std::string_view name) = 0;

  /// Sends kCreate (a result of -1 cancels) and then kSize before it returns. 0 on failure: an unknown class, no
  /// display, or cancelled.
  virtual WindowHandle CreateWindow(const WindowRequest& request) = 0;

  /// Destroys the window and its children; each gets its kDestroy, the parent first.
  virtual void DestroyWindow(WindowHandle window) = 0;

  virtual bool IsWindow(WindowHandle window) = 0;
  virtual void SetWindowPosition(WindowHandle window, ZOrder order, int x, int y, int width, int height,
                                 std::uint32_t flags) = 0;
  virtual void MoveWindow(WindowHandle window, int x, int y, int width, int height) = 0;
  virtual void ShowWindow(WindowHandle window, bool visible) = 0;
  virtual void EnableWindow(WindowHandle window, bool enabled) = 0;
  virtual bool IsWindowEnabled(WindowHandle window) = 0;
  virtual bool IsWindowVisible(WindowHandle window) = 0;

  /// In client coordinates of the parent, or of the screen for a top-level window.
  virtual Rectangle WindowRectangle(WindowHandle window) = 0;
  virtual Rectangle ClientRectangle(WindowHandle window) = 0;

  virtual wstring WindowText(WindowHandle window) = 0;
  virtual void SetWindowText(WindowHandle window, std::u16string_view text) = 0;
  virtual void SetFont(WindowHandle window, const Font& font) = 0;

  /// Shows an icon file on a STATIC control of the icon type. A file that does not decode leaves it blank.
  virtual void SetIcon(WindowHandle window, std::u16string_view path) = 0;

  virtual void SetControlId(WindowHandle window, int id) = 0;
  virtual int ControlId(WindowHandle window) = 0;
  virtual void SetExtraWord(WindowHandle window, std::size_t index, std::intptr_t value) = 0;
  virtual std::intptr_t ExtraWord(WindowHandle window, std::size_t index) = 0;

  /// Replaces the window's procedure and returns the former one.
  virtual WindowProcedure SetProcedure(WindowHandle window, WindowProcedure procedure) = 0;

  virtual WindowHandle Parent(WindowHandle window) = 0;
  virtual std::vector<WindowHandle> Children(WindowHandle window) = 0;  // in creation order
  virtual WindowHandle FindControl(WindowHandle parent, int id) = 0;

  // ---- focus and order

  /// Gives the keyboard focus to `window` of the calling thread; kKillFocus to the loser, then kSetFocus.
  virtual void SetFocus(WindowHandle window) = 0;
  virtual WindowHandle Focus() = 0;  // of the calling thread
  virtual bool SetForegroundWindow(WindowHandle window) = 0;

  /// Another program's window may be it, which has a title and nothing else.
  virtual WindowHandle ForegroundWindow() = 0;

  virtual void SetActiveWindow(WindowHandle window) = 0;

  /// The language of the texts that are drawn from now on, as "ja_JP": Chinese characters have other forms in each.
  virtual void SetLanguage(std::string_view locale) = 0;

  /// Shares the input state of the thread that owns `other` with the calling thread, or ends that; while shared,
  /// taking the foreground is not refused.
  virtual void AttachInput(WindowHandle other, bool attach) = 0;

  // ---- timers

  /// Starts, or restarts, a timer. Periods under 10 ms behave as 10 ms. Without a procedure each tick is a kTimer
  /// message with the timer's id in wParam. Returns the id.
  virtual std::uint32_t SetTimer(WindowHandle window, std::uint32_t timer, std::uint32_t period_ms,
                                 TimerProcedure procedure) = 0;
  virtual void KillTimer(WindowHandle window, std::uint32_t timer) = 0;

  // ---- messages
  virtual std::intptr_t Send(const Message& message) = 0;
  virtual void Post(const Message& message) = 0;

  /// Blocks until the calling thread has a message. False for the quit message, and when there is no display any
  /// more.
  virtual bool GetMessage(Message& message) = 0;

  /// Handles the keyboard rules of a dialog (Tab, arrows, Enter, Escape, mnemonics) for a message of `dialog` or one
  /// of its children. True: the message is dealt with, dispatched or not.
  virtual bool IsDialogMessage(WindowHandle dialog, const Message& message) = 0;
  virtual void Translate(const Message& message) = 0;
  virtual void Dispatch(const Message& message) = 0;
  virtual std::intptr_t DefaultProcedure(const Message& message) = 0;
  virtual void PostQuit() = 0;

  // ---- painting

  /// Starts painting the client area, erased with the class background. The returned canvas ends the painting when it
  /// is destroyed. On a control, what is painted lies on the control's own picture until the next painting.
  virtual std::unique_ptr<Canvas> BeginPaint(WindowHandle window) = 0;
  virtual void Invalidate(WindowHandle window) = 0;

  /// Height and width of `text` broken to `width` pixels.
  virtual Rectangle MeasureText(std::u16string_view text, int width, const Font& font) = 0;

  // ---- scroll bars (class "SCROLLBAR")
  virtual void SetScroll(WindowHandle bar, const ScrollState& state) = 0;
  virtual ScrollState Scroll(WindowHandle bar) = 0;
};

}  // namespace panelglow::platform
