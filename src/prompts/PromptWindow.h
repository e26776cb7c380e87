// What the two families of prompts share: a window with a text, optionally an image with scroll bars, and buttons. A
// call shows it, waits in its own message loop until something ends it, and returns the result.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "platform/Desktop.h"
#include "prompts/MarkedText.h"
#include "prompts/PromptImage.h"
#include "prompts/PromptLayout.h"
#include "prompts/PromptState.h"

namespace panelglow {

/// The words of a text that are marked.
struct PromptMarks {
  wstring green;
  wstring red;
};

struct PromptRequest {
  wstring text;
  wstring title;
  unsigned int style = 0;
  bool imageForm = false;
  wstring imagePath = {};
  std::optional<PromptMarks> marks = std::nullopt;
};

/// One prompt on its way from creation to result. Lives on the stack of the call that shows it. A family adds what
/// ends its prompts besides a button, and what they do while they wait.
class PromptWindow {
 public:
  PromptWindow(const char* className, platform::Color background, const PromptRequest& request);
  virtual ~PromptWindow() = default;
  PromptWindow(const PromptWindow&) = delete;
  PromptWindow& operator=(const PromptWindow&) = delete;

  /// Shows the prompt and returns its result; 0 when no window can be had.
  int Run();

 protected:
  // What a family does.
  [[nodiscard]] virtual bool IsTopmost() const = 0;
  virtual void StartTimer() = 0;
  virtual void OnTimer() = 0;
  virtual void OnFocus() = 0;  // the window itself has got the keyboard, or was clicked

  /// An answer to a message that only this family knows.
  virtual std::optional<std::intptr_t> HandleOwn(const platform::Message& message) = 0;

  /// Adds to what is painted on one of the window's controls.
  virtual void PaintOn(platform::Canvas& /*canvas*/, platform::WindowHandle /*control*/) const {}

  // What a family does it with.

  /// Sets the result; 0 leaves the prompt open.
  void End(int result);

  /// The foreground window, when that is another one. One with the same title is none: prompts of sister processes do
  /// not fight.
  [[nodiscard]] std::optional<platform::WindowHandle> Intruder() const;
  void FocusFirstChild(bool onlyButton);
  void PaintImage() const { image_.Paint(); }
  void PaintControl(platform::WindowHandle control);

  [[nodiscard]] platform::Desktop& TheDesktop() const { return desktop_; }
  [[nodiscard]] platform::WindowHandle TheWindow() const { return window_; }
  [[nodiscard]] const std::vector<platform::WindowHandle>& Buttons() const { return buttons_; }

 private:
  bool Create();
  void CreateButtons();
  void CreateText(const std::vector<TextPiece>& pieces);
  void RunLoop();
  std::intptr_t Handle(const platform::Message& message);
  std::intptr_t HandlePane(const platform::Message& message);
  void OnSize(const platform::Message& message);

  platform::Desktop& desktop_;
  const char* className_;
  platform::Color background_;
  PromptRequest request_;
  PromptImage image_;
  PromptContent content_;
  PixelSize client_;
  int result_ = 0;
  platform::WindowHandle window_ = 0;
  platform::WindowHandle text_ = 0;     // the field
  platform::WindowHandle pane_ = 0;     // takes the field's place for a marked text
  std::vector<PlacedText> markedText_;  // of the pane
  std::vector<platform::WindowHandle> buttons_;
  int buttonWidth_ = 0;
};

}  // namespace panelglow
