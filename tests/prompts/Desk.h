// A simulated machine on which a prompt is shown, and the hands of the person at it. Prompts run on the calling
// thread; what is to happen meanwhile is set up before, by the machine's time.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "platform/sim/Simulation.h"
#include "prompts/CDMWindow.h"
#include "prompts/PromptState.h"

namespace panelglow::prompttest {

using platform::WindowHandle;

class Desk {
 public:
  /// `machine` is the machine's file.
  explicit Desk(const char* machine = "") : sim(machine), windows(sim.Windows()) {
    PromptState& state = ThePromptState();
    state.topmost = false;
    state.timeoutSeconds = 0;
    state.promptEvents = 0;
    CDMWindow::SetServices({[](int, const wstring& fallback) { return fallback; }, [this] { return locale; },
                            [this] { return stopRequested; }});
  }
  ~Desk() { CDMWindow::SetServices({}); }
  Desk(const Desk&) = delete;
  Desk& operator=(const Desk&) = delete;

  [[nodiscard]] unsigned Now_ms() { return static_cast<unsigned>(sim.Time().Now() / 1000); }
  void At(unsigned time_ms, std::function<void()> action) {
    sim.Time().At(platform::sim::Microseconds{time_ms} * 1000, std::move(action));
  }
  void ClickAt(unsigned time_ms, int id) {
    At(time_ms, [this, id] {
      const platform::Rectangle place = windows.ScreenRectangle(windows.FindControl(Top(), id));
      windows.Click((place.left + place.right) / 2, (place.top + place.bottom) / 2);
    });
  }
  void PostAt(unsigned time_ms, std::uint32_t message, std::uintptr_t wParam = 0) {
    At(time_ms, [this, message, wParam] { windows.Post({Top(), message, wParam, 0}); });
  }

  /// The window in front; 0 when there is none.
  [[nodiscard]] WindowHandle Top() {
    const std::vector<WindowHandle> all = windows.TopLevelWindows();
    return all.empty() ? 0 : all.back();
  }

  /// "<text> <x>,<y> <width>x<height>" in client pixels, with "hidden" where it is.
  [[nodiscard]] std::string Describe(WindowHandle window) {
    const platform::Rectangle place = windows.WindowRectangle(window);
    return platform::Utf8FromWide(windows.WindowText(window)) + " " + std::to_string(place.left) + "," +
           std::to_string(place.top) + " " + std::to_string(place.Width()) + "x" + std::to_string(place.Height()) +
           (windows.IsWindowVisible(window) ? "" : " hidden");
  }

  /// The buttons of the front window, or all else in it, separated by " | ".
  [[nodiscard]] std::string Controls(bool buttons) {
    std::string text;
    for (const WindowHandle child : windows.Children(Top())) {
      const int id = windows.ControlId(child);
      if ((id > 1000 && id <= 1007) == buttons) {
        text += (text.empty() ? "" : " | ") + Describe(child);
      }
    }
    return text;
  }

  /// What windows have painted of one kind.
  template <class Operation>
  [[nodiscard]] std::vector<Operation> Painted() {
    std::vector<Operation> found;
    for (const platform::desktop::SceneWindow& window : windows.MakeScene().windows) {
      for (const platform::desktop::DrawOperation& operation : window.operations) {
        if (const auto* wanted = std::get_if<Operation>(&operation)) {
          found.push_back(*wanted);
        }
      }
    }
    return found;
  }

  platform::sim::Simulation sim;
  platform::desktop::WindowSystem& windows;
  std::string locale = "en_US";
  bool stopRequested = false;
};

}  // namespace panelglow::prompttest
