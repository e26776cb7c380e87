// A simulated machine on which a prompt is shown, and the hands of the person at it. Prompts run on the calling
// thread; what is to happen meanwhile is set up before, by the machine's time.
#pragma once

#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <functional>
#include <string>
#include <vector>

#include "platform/sim/Simulation.h"
#include "prompts/CDMWindow.h"
#include "prompts/PromptState.h"

namespace panelglow::prompttest {

using platform::WindowHandle;

// A file of a name of its own, gone with the object.
class TemporaryFile {
 public:
  TemporaryFile(const std::string& name, const std::string& content)
      : path_(std::filesystem::temp_directory_path() / ("panelglow-" + std::to_string(::getpid()) + "-" + name)) {
    std::ofstream(path_, std::ios::binary) << content;
  }
  ~TemporaryFile() { std::filesystem::remove(path_); }
  TemporaryFile(const TemporaryFile&) = delete;
  TemporaryFile& operator=(const TemporaryFile&) = delete;
  [[nodiscard]] std::string Path() const { return path_.string(); }
  [[nodiscard]] wstring WidePath() const { return platform::WideFromUtf8(Path()); }

 private:
  std::filesystem::path path_;
};

// A picture whose left half is black and whose right half is white.
inline std::string HalfBlack(int width, int height) {
  std::string pixels;
  for (int i = 0; i < width * height; ++i) {
    pixels += i % width < width / 2 ? '\0' : '\xFF';
  }
  return "P5\n" + std::to_string(width) + " " + std::to_string(height) + "\n255\n" + pixels;
}

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

  /// Another program that brings its window up at 500 ms, and lives until `end_ms`.
  void StartOther(const wstring& title, unsigned end_ms) {
    platform::TheHost().threads.Start("another program", [this, title, end_ms] {
      platform::TheHost().clock.Sleep(500);
      windows.RegisterWindowClass({"other", 0, 0, 0, nullptr});
      platform::WindowRequest request;
      request.className = "other";
      request.text = title;
      request.style = platform::style::kPopup | platform::style::kVisible;
      windows.CreateWindow(request);
      platform::TheHost().clock.Sleep(end_ms - 500);
    });
  }

  /// The window in front; 0 when there is none.
  [[nodiscard]] WindowHandle Top() {
    const std::vector<WindowHandle> all = windows.TopLevelWindows();
    return all.empty() ? 0 : all.back();
  }

  /// "<x>,<y> <width>x<height>" in client pixels, with "hidden" where it is.
  [[nodiscard]] static std::string Describe(const platform::Rectangle& place, bool visible = true) {
    return std::to_string(place.left) + "," + std::to_string(place.top) + " " + std::to_string(place.Width()) + "x" +
           std::to_string(place.Height()) + (visible ? "" : " hidden");
  }

  /// The same behind the window's text.
  [[nodiscard]] std::string Describe(WindowHandle window) {
    return platform::Utf8FromWide(windows.WindowText(window)) + " " +
           Describe(windows.WindowRectangle(window), windows.IsWindowVisible(window));
  }

  /// The front window, and behind it id and place of every control in the order of their creation.
  [[nodiscard]] std::string Layout() {
    std::string text = Describe(Top());
    for (const WindowHandle child : windows.Children(Top())) {
      text += "; " + std::to_string(windows.ControlId(child)) + ": " +
              Describe(windows.WindowRectangle(child), windows.IsWindowVisible(child));
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
