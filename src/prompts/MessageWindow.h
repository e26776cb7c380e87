// A window that shows a text for a time and swallows the keyboard meanwhile.
#pragma once

#include <cstdint>

#include "platform/Desktop.h"

namespace panelglow {

/// Results of a message window.
namespace message_result {
inline constexpr int kTimedOut = -2;
inline constexpr int kEnded = 1;  // by its hook, or because it could not be shown
inline constexpr int kClosed = 2;
}  // namespace message_result

/// Shows the window and blocks until it is gone; with `seconds` 0 or less there is no time limit and no count-down.
/// `hook` may be empty; otherwise it sees every message of the inner window first, from its creation on, and when it
/// returns 0 the message is finished with that. (The prompt lock is taken and released by the first and the last
/// one.)
int ShowMessageWindow(const wstring& text, const wstring& title, int seconds, platform::WindowProcedure hook);

/// A message window on its way from creation to result. Lives on the stack of the call that shows it.
///
/// It is two windows: an outer one, which is the frame that the operator sees, and an inner one, which paints, has
/// the keyboard focus, and holds the prompt lock.
class MessageWindow {
 public:
  MessageWindow(const wstring& text, const wstring& title, int seconds, platform::WindowProcedure hook);
  ~MessageWindow();
  MessageWindow(const MessageWindow&) = delete;
  MessageWindow& operator=(const MessageWindow&) = delete;

  int Run();

 private:
  bool Create();
  std::intptr_t Handle(const platform::Message& message);
  void OnTimer();
  void Paint();

  platform::Desktop& desktop_;
  wstring text_;
  wstring title_;
  platform::WindowProcedure hook_;
  std::uint32_t timeoutTicks_;  // of 100 ms; 0: none
  std::uint32_t elapsedTicks_ = 0;
  int result_ = message_result::kEnded;
  platform::WindowHandle frame_ = 0;
  platform::WindowHandle inner_ = 0;
};

}  // namespace panelglow
