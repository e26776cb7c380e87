// A dialog on a machine of virtual time.
#pragma once

#include <gmock/gmock.h>

#include <string>
#include <utility>
#include <vector>

#include "platform/desktop/WindowSystem.h"
#include "platform/sim/Simulation.h"

namespace panelglow::platform::desktop {

inline constexpr std::uint32_t kButton = style::kChild | style::kVisible | style::kTabStop;

// A dialog of three buttons, ids 11 to 13, the second of them the default; its messages are noted.
class DialogTest : public ::testing::Test {
 protected:
  void SetUp() override {
    desktop_.RegisterWindowClass({"Dialog", 0, 1, kButtonFaceColor, [this](const Message& m) { return Handle(m); }});
    WindowRequest request;
    request.className = "Dialog";
    request.style = style::kPopup | style::kVisible;
    request.width = 300;
    request.height = 100;
    request.creationParameter = 42;
    dialog_ = desktop_.CreateWindow(request);
    for (int i = 0; i < 3; ++i) {
      buttons_.push_back(AddButton(i, 11 + i, i == 1 ? style::kDefaultPushButton : 0));
    }
    desktop_.SetFocus(buttons_[0]);
    notes_.clear();
  }

  WindowHandle AddButton(int column, int id, std::uint32_t more) {
    static const char16_t* const kCaptions[] = {u"&Red", u"Fish && Chips & more", u"&Green"};
    WindowRequest request;
    request.className = "BUTTON";
    request.text = kCaptions[column];
    request.style = kButton | more;
    request.x = 10 + column * 90;
    request.y = 10;
    request.width = 80;
    request.height = 25;
    request.parent = dialog_;
    const WindowHandle button = desktop_.CreateWindow(request);
    desktop_.SetControlId(button, id);
    return button;
  }

  // A child of the dialog.
  WindowHandle AddControl(const char* className, std::uint32_t more, const Rectangle& place) {
    WindowRequest request;
    request.className = className;
    request.style = style::kChild | style::kVisible | more;
    request.x = place.left;
    request.y = place.top;
    request.width = place.Width();
    request.height = place.Height();
    request.parent = dialog_;
    return desktop_.CreateWindow(request);
  }

  // A point on a button, on the screen.
  std::pair<int, int> On(std::size_t button) {
    const Rectangle place = desktop_.ScreenRectangle(buttons_[button]);
    return {place.left + 5, place.top + 5};
  }

  std::intptr_t Handle(const Message& m) {
    switch (m.id) {
      case message::kCreate:
        notes_.push_back("create " + std::to_string(m.lParam));
        break;
      case message::kCommand:
        notes_.push_back("command " + std::to_string(m.wParam));
        break;
      case message::kTimer:
        notes_.push_back("timer " + std::to_string(m.wParam));
        break;
      case message::kPaint:
        notes_.emplace_back("paint");
        break;
      case message::kDestroy:
        notes_.emplace_back("destroy");
        break;
      case message::kDeviceChange:
        notes_.push_back("device " + std::to_string(m.wParam));
        break;
      default:
        break;
    }
    return desktop_.DefaultProcedure(m);
  }

  // Handles messages until time `until_ms`.
  void Pump(std::uint32_t until_ms) {
    machine_.Time().At(std::uint64_t{until_ms} * 1000, [this] {
      desktop_.Post({dialog_, message::kUnicodeChar, 0, 0});
    });
    Message m;
    while (desktop_.GetMessage(m) && m.id != message::kUnicodeChar) {
      if (!desktop_.IsDialogMessage(dialog_, m)) {
        desktop_.Dispatch(m);
      }
    }
  }

  int FocusedId() { return desktop_.ControlId(desktop_.Focus()); }

  sim::Simulation machine_{""};
  WindowSystem& desktop_ = machine_.Windows();
  WindowHandle dialog_ = 0;
  std::vector<WindowHandle> buttons_;
  std::vector<std::string> notes_;
};

}  // namespace panelglow::platform::desktop
