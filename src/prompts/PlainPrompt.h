// The plain prompts. Besides a button a time-out or a worker ends them; they note devices that come and go.
#pragma once

#include <cstdint>
#include <optional>

#include "prompts/CountDown.h"
#include "prompts/PromptState.h"
#include "prompts/PromptWindow.h"

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

class PlainPrompt : public PromptWindow {
 public:
  PlainPrompt(const PromptRequest& request, AutoWorker autoWorker, int autoResult);

 protected:
  [[nodiscard]] bool IsTopmost() const override { return topmost_; }
  void StartTimer() override;
  void OnTimer() override;
  void OnFocus() override { FocusFirstChild(false); }
  std::optional<std::intptr_t> HandleOwn(const platform::Message& message) override;
  void PaintOn(platform::Canvas& canvas, platform::WindowHandle control) const override;

 private:
  void CheckWorker();
  void KeepForeground();
  void Count();
  std::optional<std::intptr_t> OnPaint();

  AutoWorker autoWorker_;
  int autoResult_;
  bool topmost_;
  CountDown countDown_;
};

}  // namespace panelglow
