#include "prompts/PromptWindow.h"

#include <algorithm>
#include <memory>
#include <utility>

#include "platform/Host.h"
#include "prompts/CDMWindow.h"
#include "prompts/PromptParts.h"

namespace panelglow {

namespace message = platform::message;
using platform::Rectangle;
using platform::WindowHandle;

namespace {

constexpr const char* kPaneClass = "PromptWindowChildClassName";
constexpr std::uint32_t kImageWindowStyle = 0x90840001;
constexpr std::uint32_t kTextWindowStyle = 0x90800001;
constexpr std::uint32_t kTextFieldStyle = 0x50802000;
constexpr std::uint32_t kPaneStyle = 0x50800000;
constexpr std::uint32_t kButtonStyle = 0x50010300;
constexpr int kTextFieldId = 1000;

}  // namespace

PromptWindow::PromptWindow(const char* className, platform::Color background, const PromptRequest& request)
    : desktop_(platform::TheHost().desktop),
      className_(className),
      background_(background),
      request_(request),
      image_(desktop_, request_.imagePath),
      content_{request_.imageForm, !request_.imageForm || !request_.text.empty(), image_.HasArea()} {
  request_.style &= ~kPromptTopmost;
  request_.title = PromptTitle(request_.title);
}

int PromptWindow::Run() {
  const RegisteredClass registered(desktop_,
                                   {className_, kPromptClassStyle, 1, background_,
                                    [this](const platform::Message& received) { return Handle(received); }});
  std::optional<RegisteredClass> paneRegistered;
  std::vector<TextPiece> pieces;
  if (request_.marks) {
    paneRegistered.emplace(
        desktop_, platform::WindowClass{kPaneClass, kPromptClassStyle, 1, background_,
                                        [this](const platform::Message& received) { return HandlePane(received); }});
    pieces = CutAtMarks(request_.text, request_.marks->green, request_.marks->red);
  }
  // However the prompt ends, its window does not outlive the object that handles its messages.
  struct WindowLife {
    PromptWindow& prompt;
    ~WindowLife() { prompt.desktop_.DestroyWindow(std::exchange(prompt.window_, 0)); }
  };
  const WindowLife life{*this};
  if (!Create()) {
    LogNoWindow();
    return prompt_result::kNone;
  }
  CreateButtons();
  if (content_.hasText) {
    CreateText(pieces);
  }
  if (content_.hasPicture) {
    image_.Create(window_, PlacesOfPicture(content_, client_));
  }
  RunLoop();
  return result_;
}

bool PromptWindow::Create() {
  const PixelSize screen{desktop_.ScreenWidth(), desktop_.ScreenHeight()};
  const PixelSize size = WindowSizeOf(content_, image_.Size(), screen);
  platform::WindowRequest request;
  request.className = className_;
  request.text = request_.title;
  request.style = request_.imageForm ? kImageWindowStyle : kTextWindowStyle;
  request.x = screen.width / 2 - size.width / 2;
  request.y = screen.height / 2 - size.height / 2;
  request.width = size.width;
  request.height = size.height;
  window_ = desktop_.CreateWindow(request);
  if (window_ == 0) {
    return false;
  }
  desktop_.SetWindowPosition(window_, IsTopmost() ? platform::ZOrder::kTopmost : platform::ZOrder::kTop, 0, 0, 0, 0,
                             kShowInPlace);
  return true;
}

void PromptWindow::CreateButtons() {
  const ButtonSet& set = ButtonSetOf(request_.style);
  std::size_t longest = 0;
  for (std::size_t i = 0; i < set.count; ++i) {
    longest = std::max(longest, PromptCaption(set.results[i]).size());
  }
  buttonWidth_ = ButtonWidthOf(longest, CaptionCharWidth(CDMWindow::Locale(), request_.imageForm));
  const std::vector<Rectangle> places = ButtonPlaces(content_, client_, static_cast<int>(set.count), buttonWidth_);
  WindowHandle defaultButton = 0;
  for (std::size_t i = 0; i < set.count; ++i) {
    const int result = set.results[i];
    const bool isDefault = result == set.defaultResult;
    buttons_.push_back(CreateControl(desktop_, window_,
                                     {"BUTTON", isDefault ? kDefaultButtonStyle : kButtonStyle,
                                      kFirstButtonId + result, places[i], PromptCaption(result)}));
    defaultButton = isDefault ? buttons_.back() : defaultButton;
  }
  desktop_.SetFocus(defaultButton);
}

// A text without both its marks is an ordinary one. The pane's text is broken into lines once, and painted whenever
// the pane asks for it, so that it is still there after the pane was covered.
void PromptWindow::CreateText(const std::vector<TextPiece>& pieces) {
  const Rectangle place = TextPlace(content_, client_);
  if (pieces.empty()) {
    text_ = CreateControl(desktop_, window_, {"STATIC", kTextFieldStyle, kTextFieldId, place, request_.text});
    return;
  }
  pane_ = CreateControl(desktop_, window_, {kPaneClass, kPaneStyle, 0, place, request_.text});
  const Rectangle client = desktop_.ClientRectangle(pane_);
  markedText_ = PlacePieces(desktop_, pieces, kPromptFont, client.Width(), client.Height());
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

// The message loop looks at the result when it has a message, so it gets one.
void PromptWindow::End(int result) {
  result_ = result;
  desktop_.Post({window_, message::kChar, 0, 1});
}

// ---- the window's messages

std::intptr_t PromptWindow::Handle(const platform::Message& received) {
  if (const std::optional<std::intptr_t> answer = HandleOwn(received)) {
    return *answer;
  }
  switch (received.id) {
    case message::kCreate:
      window_ = received.window;
      CDMWindow::LockPrompt();  // the call that creates the window blocks while
                                // another prompt is open
      StartTimer();
      desktop_.SetForegroundWindow(window_);
      break;
    case message::kDestroy:
      CDMWindow::ReleasePrompt();
      break;
    case message::kSize:
      OnSize(received);
      break;
    case message::kSetFocus:
    case message::kLeftButtonUp:
      OnFocus();
      break;
    case message::kKillFocus:
      desktop_.SetWindowPosition(window_, platform::ZOrder::kTopmost, 0, 0, 0, 0, kShowInPlace);
      desktop_.SetForegroundWindow(window_);
      desktop_.SetActiveWindow(window_);
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
      return 0;  // a prompt asks for an answer, and closing is none; as with
                 // Escape, it stays
    case message::kTimer:
      OnTimer();
      break;
    case message::kHorizontalScroll:
    case message::kVerticalScroll:
      image_.Scroll(received);
      desktop_.Invalidate(window_);
      break;
    case message::kPaint:
      PaintImage();
      break;
    case message::kSyncPaint:
      PaintImage();
      return 0;
    default:
      break;
  }
  return desktop_.DefaultProcedure(received);
}

void PromptWindow::OnSize(const platform::Message& received) {
  const auto packed = static_cast<std::uint32_t>(received.lParam);
  const PixelSize size{static_cast<int>(packed & 0xFFFFU), static_cast<int>(packed >> 16U)};
  if (size.width == 0 || size.height == 0) {
    return;
  }
  client_ = size;
  if (!content_.imageForm) {
    return;  // of fixed size, and its controls with it
  }
  if (text_ != 0) {
    MoveControl(desktop_, text_, TextPlace(content_, client_));
  }
  image_.Place(PlacesOfPicture(content_, client_));
  if (!buttons_.empty()) {
    const std::vector<Rectangle> places =
        ButtonPlaces(content_, client_, static_cast<int>(buttons_.size()), buttonWidth_);
    for (std::size_t i = 0; i < buttons_.size(); ++i) {
      MoveControl(desktop_, buttons_[i], places[i]);
    }
  }
  desktop_.Invalidate(received.window);
}

std::optional<WindowHandle> PromptWindow::Intruder() const {
  const WindowHandle foreground = desktop_.ForegroundWindow();
  const bool isOwn = foreground == window_ || desktop_.WindowText(foreground) == request_.title;
  return isOwn ? std::nullopt : std::optional<WindowHandle>(foreground);
}

void PromptWindow::FocusFirstChild(bool onlyButton) {
  const std::vector<WindowHandle> children = desktop_.Children(window_);
  if (children.empty()) {
    return;
  }
  const bool isButton = std::find(buttons_.begin(), buttons_.end(), children.front()) != buttons_.end();
  if (isButton || !onlyButton) {
    desktop_.SetFocus(children.front());
  }
}

// ---- what it paints on its controls

std::intptr_t PromptWindow::HandlePane(const platform::Message& received) {
  if (received.id != message::kPaint) {
    return desktop_.DefaultProcedure(received);
  }
  PaintControl(received.window);
  return 0;
}

// What lies between the marks has the pane's own ground.
void PromptWindow::PaintControl(WindowHandle control) {
  const std::unique_ptr<platform::Canvas> canvas = desktop_.BeginPaint(control);
  if (control == pane_) {
    for (const PlacedText& part : markedText_) {
      const platform::Color ground = part.piece.background.value_or(background_);
      canvas->DrawText(part.x, part.y, part.piece.text, kPromptFont, platform::ReadableOn(ground),
                       part.piece.background);
    }
  }
  PaintOn(*canvas, control);
}

}  // namespace panelglow
