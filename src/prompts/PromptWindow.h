// The plain prompts: a window with a text, optionally an image with scroll bars, and buttons. A call shows it, waits
// in its own message loop until a button, a time-out or a worker ends it, and returns the result.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "platform/Desktop.h"
#include "prompts/CountDown.h"
#include "prompts/MarkedText.h"
#include "prompts/PromptState.h"

namespace panelglow {

/// An image with scroll bars, a text field and a row of buttons; resizable. Either may be missing. An image that
/// cannot be loaded is logged and replaced by its file's name. An empty title becomes the executable's full path.
int ImagePrompt(const wstring& text, const wstring& title, unsigned int style, const wstring& imagePath,
                AutoWorker autoWorker, int autoResult);

/// A text field and a column of buttons in a window of fixed size.
int TextPrompt(const wstring& text, const wstring& title, unsigned int style, AutoWorker autoWorker, int autoResult);

/// A text prompt with two words of the text on coloured ground; a plain text prompt where one of them is not in it.
int MarkedPrompt(const wstring& text, const wstring& title, unsigned int style, const wstring& greenMark,
                 const wstring& redMark);

/// The words of a text that are marked.
struct PromptMarks {
  wstring green;
  wstring red;
};

/// One prompt on its way from creation to result, of either family. Lives on the stack of the call that shows it.
class PromptWindow {
 public:
  /// What sets the families apart.
  struct Family {
    const char* className;
    platform::Color background;
    bool configurable;  // ends by run control; has no time-out, worker, count-down or device events
  };

  struct Request {
    wstring text;
    wstring title;
    unsigned int style = 0;
    bool imageForm = false;
    wstring imagePath = {};
    AutoWorker autoWorker = nullptr;
    int autoResult = 0;
    std::optional<PromptMarks> marks = std::nullopt;
  };

  PromptWindow(const Family& family, Request request);
  ~PromptWindow();
  PromptWindow(const PromptWindow&) = delete;
  PromptWindow& operator=(const PromptWindow&) = delete;

  /// Shows the prompt and returns its result; 0 when no window can be had.
  int Run();

 private:
  static constexpr std::uint32_t kTick_ms = 10;  // of the count-down, and of looking after the window
  static constexpr int kImageFormHeight = 300;   // of one without an image, and the least; pixels

  struct Button {
    int result;
    platform::WindowHandle window;
  };

  void MeasureImage();
  bool Create();
  void CreateButtons();
  void CreateTextField();
  void CreateMarkedPane(const std::vector<TextPiece>& pieces);
  void CreateImageArea();
  void RunLoop();
  void End(int result);
  std::intptr_t Handle(const platform::Message& message);
  std::intptr_t HandlePane(const platform::Message& message);
  void OnCreate(platform::WindowHandle created);
  void OnSize(const platform::Message& message);
  void OnTimer();
  void CheckWorker();
  void KeepForeground();
  void CountTick();
  void OnScroll(const platform::Message& message);
  std::intptr_t OnPaint(const platform::Message& message);
  void PaintImage();
  void PaintControl(platform::WindowHandle control);
  [[nodiscard]] std::optional<std::uint32_t> SecondsLeft() const;
  void PaintMarkedText(platform::Canvas& canvas) const;
  void OnDeviceChange(std::uintptr_t event);
  [[nodiscard]] bool IsButton(platform::WindowHandle control) const;
  void FocusFirstChild(bool onlyButton);
  void PlaceButtonRow();
  void SetScrollRanges();
  [[nodiscard]] platform::Rectangle TextFieldPlace() const;
  [[nodiscard]] platform::Rectangle ImageAreaPlace() const;
  [[nodiscard]] platform::Rectangle HorizontalBarPlace() const;
  [[nodiscard]] platform::Rectangle VerticalBarPlace() const;
  [[nodiscard]] bool HasPictureArea() const { return hasImage_ || imageFailed_; }

  Family family_;
  Request request_;
  platform::Desktop& desktop_;
  CountDown countDown_;
  bool topmost_ = false;
  int charWidth_ = 0;
  int result_ = 0;
  std::uint32_t timeoutTicks_ = 0;  // of 10 ms; 0: none
  std::uint32_t elapsedTicks_ = 0;
  platform::WindowHandle window_ = 0;
  platform::WindowHandle textControl_ = 0;
  platform::WindowHandle markedPane_ = 0;  // takes the text field's place
  std::vector<PlacedText> markedText_;     // of the pane
  platform::WindowHandle imageControl_ = 0;
  platform::WindowHandle horizontalBar_ = 0;
  platform::WindowHandle verticalBar_ = 0;
  std::vector<Button> buttons_;
  int buttonWidth_ = 0;
  bool hasImage_ = false;
  bool hasText_ = false;
  bool imageFailed_ = false;
  int imageWidth_ = 0;
  int imageHeight_ = 0;
  int windowWidth_ = 0;
  int windowHeight_ = 0;
  int clientWidth_ = 0;
  int clientHeight_ = 0;
  int imageAreaWidth_ = 0;
  int imageAreaHeight_ = 0;
  int horizontalPosition_ = 0;
  int verticalPosition_ = 0;
};

}  // namespace panelglow
