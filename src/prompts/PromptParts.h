// What the windows of this folder have in common: font, button sets, captions, titles, classes and controls.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>

#include "platform/Desktop.h"
#include "prompts/PromptLayout.h"
#include "prompts/PromptState.h"

namespace panelglow {

inline constexpr std::uint32_t kPromptClassStyle = 3;  // redraw on horizontal and vertical resize
inline constexpr platform::Font kPromptFont{18, 600};
inline constexpr std::uint32_t kDefaultButtonStyle = 0x50010301;
inline constexpr std::uint32_t kShowInPlace =
    platform::position::kNoSize | platform::position::kNoMove | platform::position::kShowWindow;  // 0x43
inline constexpr int kFirstButtonId = 1000;  // a button's id is this and its result

/// The buttons of a prompt by its style, in their order, and the default one.
struct ButtonSet {
  std::array<int, 3> results;
  std::size_t count;
  int defaultResult;
};

/// A style that is not known has OK alone.
const ButtonSet& ButtonSetOf(unsigned int promptStyle);

/// The caption of a result's button, in the operator's language.
wstring PromptCaption(int result);

/// A window's text: `title`, or the executable's full path in place of an empty one.
wstring PromptTitle(const wstring& title);

/// Says in the log that there is no display to show a window on.
void LogNoWindow();

/// A window class registered for the life of the object.
class RegisteredClass {
 public:
  RegisteredClass(platform::Desktop& desktop, const platform::WindowClass& windowClass);
  ~RegisteredClass();
  RegisteredClass(const RegisteredClass&) = delete;
  RegisteredClass& operator=(const RegisteredClass&) = delete;

 private:
  platform::Desktop& desktop_;
  std::string name_;
};

/// A child window of a parent, in the prompts' font. `place` is in the parent's client pixels; id 0 for none.
struct ControlRequest {
  const char* className;
  std::uint32_t style;
  int id;
  platform::Rectangle place;
  wstring text;
};
platform::WindowHandle CreateControl(platform::Desktop& desktop, platform::WindowHandle parent,
                                     const ControlRequest& request);

/// Gives a control another place in its parent.
void MoveControl(platform::Desktop& desktop, platform::WindowHandle control, const platform::Rectangle& place);

}  // namespace panelglow
