#include "prompts/PromptWindow.h"

#include <algorithm>
#include <array>
#include <string_view>
#include <utility>

#include "harness/base/CDMout.h"
#include "platform/Host.h"
#include "prompts/CDMWindow.h"
#include "prompts/PromptParts.h"

namespace panelglow {

namespace message = platform::message;
using platform::Rectangle;
using platform::WindowHandle;

namespace {

constexpr const char* kPlainClass = "PromptWindowClassName";
constexpr const char* kPaneClass = "PromptWindowChildClassName";
constexpr std::uint32_t kImageWindowStyle = 0x90840001;
constexpr std::uint32_t kTextWindowStyle = 0x90800001;
constexpr std::uint32_t kTextFieldStyle = 0x50802000;
constexpr std::uint32_t kPaneStyle = 0x50800000;
constexpr std::uint32_t kButtonStyle = 0x50010300;
constexpr std::uint32_t kImageAreaStyle = 0x5000000E;
constexpr std::uint32_t kFailedImageStyle = 0x50800000;
constexpr std::uint32_t kHorizontalBarStyle = 0x50000004;
constexpr std::uint32_t kVerticalBarStyle = 0x50000005;

constexpr int kTextFieldId = 1000;
constexpr int kImageAreaId = 1008;

// Layout, in pixels.
constexpr int kImageFormHeight = 300;  // of one without an image, and the least
constexpr int kImageMarginX = 50;
constexpr int kImageMarginY = 140;
constexpr int kFailedImageWidth = 490;
constexpr int kFailedImageHeight = 160;
constexpr int kMargin = 10;
constexpr int kButtonHeight = 25;
constexpr int kNarrowestButton = 80;
constexpr int kColumnX = 365;
constexpr int kColumnStep = 30;
constexpr int kColumnTextWidth = 340;
constexpr int kColumnTextHeight = 270;
constexpr int kBarThickness = 20;

// Timers.
constexpr std::uint32_t kTickTimer = 0;
constexpr std::uint32_t kTick_ms = 10;
constexpr std::uint32_t kTicksPerSecond = 1000 / kTick_ms;
constexpr std::uint32_t kStopTimer = 1;
constexpr std::uint32_t kStopPeriod_ms = 5000;

// Button sets by style: the buttons in order, and the default one. Every other style has the first set.
struct ButtonSet {
  std::array<int, 3> results;
  std::size_t count;
  int defaultResult;
};
constexpr std::array<ButtonSet, 6> kButtonSets{{
    {{prompt_result::kOk, 0, 0}, 1, prompt_result::kOk},
    {{prompt_result::kOk, prompt_result::kCancel, 0}, 2, prompt_result::kOk},
    {{prompt_result::kAbort, prompt_result::kRetry, prompt_result::kIgnore}, 3, prompt_result::kIgnore},
    {{prompt_result::kYes, prompt_result::kNo, prompt_result::kCancel}, 3, prompt_result::kYes},
    {{prompt_result::kYes, prompt_result::kNo, 0}, 2, prompt_result::kYes},
    {{prompt_result::kRetry, prompt_result::kCancel, 0}, 2, prompt_result::kRetry},
}};

const ButtonSet& ButtonSetOf(unsigned int promptStyle) {
  return kButtonSets[promptStyle < kButtonSets.size() ? promptStyle : 0];
}

// Estimated width of a caption's character: only this changes with the language.
int CharWidthOf(bool imageForm) {
  constexpr std::array<std::string_view, 4> kWideLocales{"zh_CN", "zh_TW", "ko_KR", "ja_JP"};
  const std::string locale = CDMWindow::Locale();
  if (std::find(kWideLocales.begin(), kWideLocales.end(), locale) != kWideLocales.end()) {
    return 18;
  }
  return imageForm ? 30 : 10;
}

}  // namespace

int ImagePrompt(const wstring& text, const wstring& title, unsigned int promptStyle, const wstring& imagePath,
                AutoWorker autoWorker, int autoResult) {
  ThePromptState().workerRunning = false;
  ThePromptState().workerDone = false;
  return PromptWindow({kPlainClass, platform::kButtonFaceColor, false},
                      {text, title, promptStyle, true, imagePath, std::move(autoWorker), autoResult})
      .Run();
}

int TextPrompt(const wstring& text, const wstring& title, unsigned int promptStyle, AutoWorker autoWorker,
               int autoResult) {
  return PromptWindow({kPlainClass, platform::kButtonFaceColor, false},
                      {text, title, promptStyle, false, {}, std::move(autoWorker), autoResult})
      .Run();
}

int MarkedPrompt(const wstring& text, const wstring& title, unsigned int promptStyle, const wstring& greenMark,
                 const wstring& redMark) {
  PromptWindow::Request request{text, title, promptStyle};
  request.marks = {greenMark, redMark};
  return PromptWindow({kPlainClass, platform::kButtonFaceColor, false}, std::move(request)).Run();
}

PromptWindow::PromptWindow(const Family& family, Request request)
    : family_(family),
      request_(std::move(request)),
      desktop_(platform::TheHost().desktop),
      countDown_(desktop_, family.background) {
  topmost_ = (request_.style & kPromptTopmost) != 0;
  request_.style &= ~kPromptTopmost;
  if (!family_.configurable) {
    // The plain family's flag is the process's: once a prompt was topmost, all are.
    PromptState& state = ThePromptState();
    state.topmost = state.topmost || topmost_;
    topmost_ = state.topmost;
    timeoutTicks_ = std::exchange(state.timeoutSeconds, 0U) * 1000 / kTick_ms;
  }
  charWidth_ = CharWidthOf(request_.imageForm);
  request_.title = PromptTitle(request_.title);
  MeasureImage();
}

// However the prompt ends, its window does not outlive the object that handles its messages.
PromptWindow::~PromptWindow() { desktop_.DestroyWindow(window_); }

// Window size, image size, and whether there is an image and a text.
void PromptWindow::MeasureImage() {
  windowWidth_ = kFormWidth;
  windowHeight_ = request_.imageForm ? kImageFormHeight : kFormHeight;
  hasText_ = !request_.imageForm || !request_.text.empty();
  if (request_.imagePath.empty()) {
    return;
  }
  const std::optional<platform::ImageSize> size = platform::TheHost().images.Size(request_.imagePath);
  hasImage_ = size.has_value();
  imageFailed_ = !hasImage_;
  if (imageFailed_) {
    CDMout::LogMessage(LogOptions::Debug, kNote, "Error Loading Image File.");
    imageWidth_ = kFailedImageWidth;
    imageHeight_ = kFailedImageHeight;
    return;
  }
  imageWidth_ = size->width;
  imageHeight_ = size->height;
  // Not below the least size that the window can be dragged to: a small picture leaves no room for buttons and text.
  windowWidth_ = std::clamp(imageWidth_ + kImageMarginX, kFormWidth, std::max(kFormWidth, desktop_.ScreenWidth()));
  windowHeight_ =
      std::clamp(imageHeight_ + kImageMarginY, kImageFormHeight, std::max(kImageFormHeight, desktop_.ScreenHeight()));
}

int PromptWindow::Run() {
  const RegisteredClass registered(desktop_,
                                   {family_.className, kPromptClassStyle, 1, family_.background,
                                    [this](const platform::Message& received) { return Handle(received); }});
  std::optional<RegisteredClass> paneRegistered;
  std::vector<TextPiece> pieces;
  if (request_.marks) {
    paneRegistered.emplace(
        desktop_, platform::WindowClass{kPaneClass, kPromptClassStyle, 1, family_.background,
                                        [this](const platform::Message& received) { return HandlePane(received); }});
    pieces = CutAtMarks(request_.text, request_.marks->green, request_.marks->red);
  }
  if (!Create()) {
    LogNoWindow();
    return prompt_result::kNone;
  }
  CreateButtons();
  if (!pieces.empty()) {
    CreateMarkedPane(pieces);
  } else if (hasText_) {
    CreateTextField();
  }
  if (HasPictureArea()) {
    CreateImageArea();
  }
  RunLoop();
  desktop_.DestroyWindow(std::exchange(window_, 0));
  return result_;
}

bool PromptWindow::Create() {
  platform::WindowRequest request;
  request.className = family_.className;
  request.text = request_.title;
  request.style = request_.imageForm ? kImageWindowStyle : kTextWindowStyle;
  request.x = desktop_.ScreenWidth() / 2 - windowWidth_ / 2;
  request.y = desktop_.ScreenHeight() / 2 - windowHeight_ / 2;
  request.width = windowWidth_;
  request.height = windowHeight_;
  window_ = desktop_.CreateWindow(request);
  if (window_ == 0) {
    return false;
  }
  desktop_.SetWindowPosition(window_, topmost_ ? platform::ZOrder::kTopmost : platform::ZOrder::kTop, 0, 0, 0, 0,
                             kShowInPlace);
  return true;
}

void PromptWindow::CreateButtons() {
  const ButtonSet& set = ButtonSetOf(request_.style);
  std::size_t longest = 0;
  for (std::size_t i = 0; i < set.count; ++i) {
    longest = std::max(longest, PromptCaption(set.results[i]).size());
  }
  buttonWidth_ = std::max(kNarrowestButton, static_cast<int>(longest) * charWidth_);
  // A column's button ends with its window, so that the middle of its caption can be seen.
  const int width = std::min(buttonWidth_, clientWidth_ - kColumnX);
  WindowHandle defaultButton = 0;
  for (std::size_t i = 0; i < set.count; ++i) {
    const int result = set.results[i];
    const WindowHandle button = CreateControl(
        desktop_, window_,
        {"BUTTON", result == set.defaultResult ? kDefaultButtonStyle : kButtonStyle, kFirstButtonId + result,
         PlaceAt(kColumnX, kMargin + static_cast<int>(i) * kColumnStep, width, kButtonHeight),
         PromptCaption(result)});
    buttons_.push_back({result, button});
    defaultButton = result == set.defaultResult ? button : defaultButton;
  }
  if (request_.imageForm) {
    PlaceButtonRow();
  }
  desktop_.SetFocus(defaultButton);
}

// Spreads the buttons over the window's lower edge with equal gaps. Where the row does not fit, by long captions in a
// small window, the buttons share the edge without gaps: each stays within reach of the mouse.
void PromptWindow::PlaceButtonRow() {
  const auto count = static_cast<int>(buttons_.size());
  const int width = std::min(buttonWidth_, clientWidth_ / count);
  const int gap = (clientWidth_ - count * width) / (count + 1);
  for (int i = 0; i < count; ++i) {
    const int left = gap + i * (width + gap);
    desktop_.MoveWindow(buttons_[static_cast<std::size_t>(i)].window, left, clientHeight_ - kButtonHeight, width,
                        kButtonHeight);
  }
}

Rectangle PromptWindow::TextFieldPlace() const {
  if (!request_.imageForm) {
    return PlaceAt(kMargin, kMargin, kColumnTextWidth, kColumnTextHeight);
  }
  return HasPictureArea() ? PlaceAt(kMargin, clientHeight_ - 90, clientWidth_ - 40, 60)
                          : PlaceAt(kMargin, kMargin, clientWidth_ - 40, clientHeight_ - 40);
}

Rectangle PromptWindow::ImageAreaPlace() const {
  const int height = clientHeight_ - (hasText_ ? 130 : 50);
  return PlaceAt(kMargin, kMargin, clientWidth_ - 40, height);
}

Rectangle PromptWindow::HorizontalBarPlace() const {
  const int top = clientHeight_ - (hasText_ ? 120 : 50);
  return PlaceAt(kMargin, top, clientWidth_ - 30, kBarThickness);
}

Rectangle PromptWindow::VerticalBarPlace() const {
  return PlaceAt(clientWidth_ - kBarThickness, kMargin, kBarThickness, ImageAreaPlace().Height());
}

void PromptWindow::CreateTextField() {
  textControl_ =
      CreateControl(desktop_, window_, {"STATIC", kTextFieldStyle, kTextFieldId, TextFieldPlace(), request_.text});
}

// The pane's text is broken into lines once, and painted whenever the pane asks for it, so that it is still there
// after the pane was covered. What lies between the marks has the pane's own ground.
void PromptWindow::CreateMarkedPane(const std::vector<TextPiece>& pieces) {
  markedPane_ = CreateControl(desktop_, window_, {kPaneClass, kPaneStyle, 0, TextFieldPlace(), request_.text});
  const Rectangle client = desktop_.ClientRectangle(markedPane_);
  markedText_ = PlacePieces(desktop_, pieces, kPromptFont, client.Width(), client.Height());
}

void PromptWindow::CreateImageArea() {
  imageControl_ = CreateControl(desktop_, window_,
                                {"STATIC", hasImage_ ? kImageAreaStyle : kFailedImageStyle, kImageAreaId,
                                 ImageAreaPlace(), hasImage_ ? wstring() : request_.imagePath});
  horizontalBar_ =
      CreateControl(desktop_, window_, {"SCROLLBAR", kHorizontalBarStyle, 0, HorizontalBarPlace(), wstring()});
  verticalBar_ = CreateControl(desktop_, window_, {"SCROLLBAR", kVerticalBarStyle, 0, VerticalBarPlace(), wstring()});
  SetScrollRanges();
}

// Both bars show the whole image's size and a page of the area's; a bar is there only when the image is larger.
void PromptWindow::SetScrollRanges() {
  const Rectangle area = desktop_.ClientRectangle(imageControl_);
  imageAreaWidth_ = area.Width();
  imageAreaHeight_ = area.Height();
  desktop_.SetScroll(horizontalBar_, {0, imageWidth_, imageAreaWidth_, 0});
  desktop_.SetScroll(verticalBar_, {0, imageHeight_, imageAreaHeight_, 0});
  desktop_.ShowWindow(horizontalBar_, imageWidth_ > imageAreaWidth_);
  desktop_.ShowWindow(verticalBar_, imageHeight_ > imageAreaHeight_);
}

void PromptWindow::RunLoop() {
  platform::Message received;
  while (desktop_.GetMessage(received) && result_ == 0) {
    if (!desktop_.IsDialogMessage(window_, received)) {
      desktop_.Translate(received);
      desktop_.Dispatch(received);
    }
  }
}

// Sets the result; 0 leaves the prompt open. The message loop looks at it when it has a message, so it gets one.
void PromptWindow::End(int result) {
  result_ = result;
  desktop_.Post({window_, message::kChar, 0, 1});
}

// ---- the window's messages

std::intptr_t PromptWindow::Handle(const platform::Message& received) {
  switch (received.id) {
    case message::kCreate:
      OnCreate(received.window);
      break;
    case message::kDestroy:
      CDMWindow::ReleasePrompt();
      break;
    case message::kSize:
      OnSize(received);
      break;
    case message::kSetFocus:
    case message::kLeftButtonUp:
      if (!family_.configurable) {
        FocusFirstChild(false);
      } else if (desktop_.Parent(desktop_.Focus()) != received.window) {
        FocusFirstChild(true);
      }
      break;
    case message::kKillFocus:
      desktop_.SetWindowPosition(received.window, platform::ZOrder::kTopmost, 0, 0, 0, 0, kShowInPlace);
      desktop_.SetForegroundWindow(received.window);
      desktop_.SetActiveWindow(received.window);
      break;
    case message::kGetMinMaxInfo: {
      // A message carries the address as a number. NOLINTNEXTLINE(performance-no-int-to-ptr)
      auto* limits = reinterpret_cast<platform::TrackLimits*>(received.lParam);
      *limits = {kFormWidth, kImageFormHeight, desktop_.ScreenWidth(), desktop_.ScreenHeight()};
      break;
    }
    case message::kCommand: {
      const auto id = static_cast<int>(received.wParam & 0xFFFFU);
      if (id > kFirstButtonId && id <= kFirstButtonId + prompt_result::kYes) {
        End(id - kFirstButtonId);
      }
      break;
    }
    case message::kClose:
      return 0;  // a prompt asks for an answer, and closing is none; as with Escape, it stays
    case message::kTimer:
      OnTimer();
      break;
    case message::kHorizontalScroll:
    case message::kVerticalScroll:
      OnScroll(received);
      break;
    case message::kPaint:
      return OnPaint(received);
    case message::kSyncPaint:
      if (hasImage_) {
        PaintImage();
      }
      return 0;
    case message::kControlColorButton:
    case message::kControlColorStatic:
      if (family_.configurable) {
        return platform::OwnControlColor(family_.background);  // buttons and texts take the configured colour
      }
      break;
    case message::kDeviceChange:
      if (!family_.configurable) {
        OnDeviceChange(received.wParam);
      }
      break;
    default:
      break;
  }
  return desktop_.DefaultProcedure(received);
}

// The lock is taken while the window is being created: the call blocks while another prompt is open.
void PromptWindow::OnCreate(WindowHandle created) {
  window_ = created;
  CDMWindow::LockPrompt();
  if (family_.configurable) {
    desktop_.SetTimer(created, kStopTimer, kStopPeriod_ms, nullptr);
  } else if (topmost_) {
    desktop_.SetTimer(created, kTickTimer, kTick_ms, nullptr);
  }
  desktop_.SetForegroundWindow(created);
}

void PromptWindow::OnSize(const platform::Message& received) {
  const auto packed = static_cast<std::uint32_t>(received.lParam);
  const int width = static_cast<int>(packed & 0xFFFFU);
  const int height = static_cast<int>(packed >> 16U);
  if (width == 0 || height == 0) {
    return;
  }
  clientWidth_ = width;
  clientHeight_ = height;
  const auto move = [this](WindowHandle control, const Rectangle& place) {
    desktop_.MoveWindow(control, place.left, place.top, place.Width(), place.Height());
  };
  if (!request_.imageForm) {
    return;  // of fixed size, and its controls with it
  }
  if (textControl_ != 0) {
    move(textControl_, TextFieldPlace());
  }
  if (imageControl_ != 0) {
    move(imageControl_, ImageAreaPlace());
    SetScrollRanges();
    move(horizontalBar_, HorizontalBarPlace());
    move(verticalBar_, VerticalBarPlace());
  }
  if (!buttons_.empty()) {
    PlaceButtonRow();
  }
  horizontalPosition_ = 0;
  verticalPosition_ = 0;
  desktop_.Invalidate(received.window);
}

void PromptWindow::OnTimer() {
  if (family_.configurable) {
    if (CDMWindow::IsStopRequested()) {
      End(prompt_result::kTerminated);
      return;
    }
    desktop_.SetTimer(window_, kStopTimer, kStopPeriod_ms, nullptr);
    if (topmost_) {
      KeepForeground();
    }
    return;
  }
  ThePromptState().promptEvents |= kPromptTick;
  CheckWorker();
  if (topmost_) {
    KeepForeground();
  }
  CountTick();
}

// A worker that returns without being done is started again at the next tick.
void PromptWindow::CheckWorker() {
  PromptState& state = ThePromptState();
  if (!request_.autoWorker || state.workerRunning) {
    return;
  }
  if (state.workerDone) {
    End(request_.autoResult);
    return;
  }
  state.workerRunning = true;
  const platform::ThreadHandle thread =
      platform::TheHost().threads.Start("prompt worker", [worker = request_.autoWorker, &state] {
        worker(state.workerDone);
        state.workerRunning = false;
      });
  if (thread == 0) {
    state.workerRunning = false;  // tried again at the next tick
  }
}

// Takes the foreground back, but not from a window with the same title: prompts of sister processes do not fight.
void PromptWindow::KeepForeground() {
  const WindowHandle foreground = desktop_.ForegroundWindow();
  if (foreground == window_ || desktop_.WindowText(foreground) == request_.title) {
    return;
  }
  if (!family_.configurable) {
    desktop_.AttachInput(foreground, true);
  }
  desktop_.SetForegroundWindow(window_);
  if (!family_.configurable) {
    desktop_.SetFocus(window_);
    desktop_.AttachInput(foreground, false);
  }
  FocusFirstChild(true);
}

void PromptWindow::CountTick() {
  if (timeoutTicks_ == 0) {
    return;
  }
  ++elapsedTicks_;
  if (elapsedTicks_ > timeoutTicks_) {
    End(ThePromptState().timeoutResult);
    timeoutTicks_ = 0;
    desktop_.Invalidate(window_);  // which stays when the result is 0, and has nothing to count any more
  }
  if (elapsedTicks_ % kTicksPerSecond == 0) {
    desktop_.Invalidate(window_);
  }
}

void PromptWindow::OnScroll(const platform::Message& received) {
  const bool vertical = received.id == message::kVerticalScroll;
  const WindowHandle bar = vertical ? verticalBar_ : horizontalBar_;
  const int largest = vertical ? imageHeight_ : imageWidth_;
  int place = desktop_.Scroll(bar).position;
  switch (received.wParam & 0xFFFFU) {
    case platform::scroll::kLineBack:
      place = std::max(0, place - 1);
      break;
    case platform::scroll::kLineForward:
      place = std::min(largest, place + 1);
      break;
    case platform::scroll::kThumbPosition:
    case platform::scroll::kThumbTrack:
      place = static_cast<int>(received.wParam >> 16U & 0xFFFFU);
      break;
    case platform::scroll::kStart:
      place = 0;
      break;
    case platform::scroll::kEnd:
      place = largest;
      break;
    default:
      break;
  }
  (vertical ? verticalPosition_ : horizontalPosition_) = place;
  platform::ScrollState state = desktop_.Scroll(bar);
  state.position = place;
  desktop_.SetScroll(bar, state);
  desktop_.Invalidate(received.window);
}

std::intptr_t PromptWindow::OnPaint(const platform::Message& received) {
  if (hasImage_) {
    PaintImage();
  }
  const std::vector<WindowHandle> former = countDown_.Controls();
  std::vector<WindowHandle> buttons;
  for (const Button& button : buttons_) {
    buttons.push_back(button.window);
  }
  countDown_.Arrange(window_, buttons, SecondsLeft());
  for (const WindowHandle control : former) {
    if (!countDown_.IsOn(control)) {
      PaintControl(control);  // takes the number away
    }
  }
  if (timeoutTicks_ == 0) {
    return desktop_.DefaultProcedure(received);
  }
  for (const WindowHandle control : countDown_.Controls()) {
    PaintControl(control);
  }
  countDown_.Paint(*desktop_.BeginPaint(received.window), received.window);
  return 0;
}

void PromptWindow::PaintImage() {
  const std::unique_ptr<platform::Canvas> canvas = desktop_.BeginPaint(imageControl_);
  canvas->DrawImage(-horizontalPosition_, -verticalPosition_, request_.imagePath,
                    desktop_.ClientRectangle(imageControl_));
}

// What this window paints on one of its controls: the marked text, and the count-down where that lies on it.
void PromptWindow::PaintControl(WindowHandle control) {
  const std::unique_ptr<platform::Canvas> canvas = desktop_.BeginPaint(control);
  if (control == markedPane_) {
    PaintMarkedText(*canvas);
  }
  if (countDown_.IsOn(control)) {
    countDown_.Paint(*canvas, control);
  }
}

std::optional<std::uint32_t> PromptWindow::SecondsLeft() const {
  if (timeoutTicks_ == 0) {
    return std::nullopt;
  }
  return (timeoutTicks_ - elapsedTicks_) * kTick_ms / 1000;
}

void PromptWindow::PaintMarkedText(platform::Canvas& canvas) const {
  for (const PlacedText& part : markedText_) {
    const platform::Color ground = part.piece.background.value_or(family_.background);
    canvas.DrawText(part.x, part.y, part.piece.text, kPromptFont, platform::ReadableOn(ground),
                    part.piece.background);
  }
}

std::intptr_t PromptWindow::HandlePane(const platform::Message& received) {
  if (received.id != message::kPaint) {
    return desktop_.DefaultProcedure(received);
  }
  PaintControl(received.window);
  return 0;
}

void PromptWindow::OnDeviceChange(std::uintptr_t event) {
  std::atomic<std::uint32_t>& events = ThePromptState().promptEvents;
  switch (event) {
    case platform::device_event::kNodesChanged:
      events |= kDeviceTreeChanged;
      break;
    case platform::device_event::kArrival:
      events |= kDeviceArrived;
      break;
    case platform::device_event::kRemoveComplete:
      events |= kDeviceRemoved;
      break;
    default:
      break;
  }
}

bool PromptWindow::IsButton(WindowHandle control) const {
  return std::any_of(buttons_.begin(), buttons_.end(), [&](const Button& b) { return b.window == control; });
}

void PromptWindow::FocusFirstChild(bool onlyButton) {
  const std::vector<WindowHandle> children = desktop_.Children(window_);
  if (children.empty()) {
    return;
  }
  if (IsButton(children.front()) || !onlyButton) {
    desktop_.SetFocus(children.front());
  }
}

}  // namespace panelglow
