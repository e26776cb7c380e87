// A window in which the operator enters one line.
#pragma once

#include <cstdint>
#include <string>

#include "platform/Desktop.h"

namespace panelglow {

/// Shows the window and blocks. Returns prompt_result::kOk for its button, or kNone when the line was ended with the
/// Enter key; both store the line, in the system's code page and cut to 256 characters, in `entered`. What was typed
/// is wiped when no further character comes within `clearInterval_ms`: the line is meant for a scanner, which types
/// fast, and half a line is none. Where no window can be had it returns kNone and leaves `entered` as it is.
int ShowTextWindow(const wstring& text, const wstring& title, std::string& entered, std::uint32_t clearInterval_ms);

/// A text window on its way from creation to result. Lives on the stack of the call that shows it.
class TextWindow {
 public:
  TextWindow(const wstring& text, const wstring& title, std::uint32_t clearInterval_ms);
  ~TextWindow();
  TextWindow(const TextWindow&) = delete;
  TextWindow& operator=(const TextWindow&) = delete;

  int Run(std::string& entered);

 private:
  bool Create();
  void CreateControls();
  std::intptr_t Handle(const platform::Message& message);
  std::intptr_t FilterInput(const platform::Message& message);
  void OnCreate(const platform::Message& message);
  [[nodiscard]] std::string EnteredLine();

  platform::Desktop& desktop_;
  wstring text_;
  wstring title_;
  std::uint32_t clearInterval_ms_;
  int result_ = 0;
  platform::WindowHandle window_ = 0;
  platform::WindowHandle input_ = 0;
  platform::WindowProcedure inputProcedure_;  // the field's own
};

}  // namespace panelglow
