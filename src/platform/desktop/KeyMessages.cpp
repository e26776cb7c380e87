#include "platform/desktop/KeyMessages.h"

#include <string_view>

namespace panelglow::platform::desktop {

std::vector<Message> KeyMessages(WindowHandle window, const ScreenEvent& event) {
  using Kind = ScreenEvent::Kind;
  const std::intptr_t shift = event.shift ? key_data::kShift : 0;
  if (event.kind == Kind::kKeyUp) {
    return {{window, event.alt ? message::kSysKeyUp : message::kKeyUp, event.virtualKey, key_data::kWasDown | shift}};
  }
  std::vector<Message> messages;
  if (event.kind == Kind::kText) {
    const std::u16string_view text = event.text;
    for (const char16_t unit : text.substr(0, text.find_first_of(u"\r\n"))) {
      messages.push_back({window, message::kChar, unit, key_data::kNoKey});
    }
    return messages;
  }
  const std::intptr_t data = shift | (event.repeat ? key_data::kWasDown : 0);
  messages.push_back({window, event.alt ? message::kSysKeyDown : message::kKeyDown, event.virtualKey, data});
  if (event.character != 0) {
    messages.push_back({window, event.alt ? message::kSysChar : message::kChar, event.character, data});
  }
  return messages;
}

}  // namespace panelglow::platform::desktop
