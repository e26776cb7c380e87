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

}  // namespace panelglow
