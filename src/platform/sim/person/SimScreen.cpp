#include "platform/sim/person/SimScreen.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <string_view>
#include <utility>

#include "platform/Text.h"
#include "platform/posix/ModuleLoader.h"
#include "platform/sim/base/MachineError.h"

namespace panelglow::platform::sim {

namespace {

constexpr std::chrono::milliseconds kBetweenLooks{4};

// The panel's picture, in pixels.
constexpr int kPanelX = 20;
constexpr int kPanelY = 20;
constexpr int kPanelWidth = 330;
constexpr int kHeading = 44;
constexpr int kRow = 34;
constexpr int kLed = 18;
constexpr Font kHeadingFont{15, 600};
constexpr Font kNameFont{17, 600};
constexpr Font kDriverFont{13, 400};
constexpr Color kPanelColor = 0x00302C2A;
constexpr Color kBezel = 0x00100E0C;
constexpr Color kText = 0x00F0F0F0;
constexpr Color kFaint = 0x00A0A0A0;
constexpr WindowHandle kPanelWindow = 1;

struct ColorRow {
  std::string_view name;
  Color lit;
  Color dark;
};

constexpr std::array<ColorRow, 5> kColors{{{"green", 0x0040E020, 0x00183810},
                                           {"white", 0x00FFFFFF, 0x00484848},
                                           {"red", 0x003030FF, 0x00101048},
                                           {"amber", 0x0020B0FF, 0x00103048},
                                           {"blue", 0x00FF9030, 0x00482810}}};

Color ColorOf(const std::string& name, bool lit) {
  const auto* row = std::find_if(kColors.begin(), kColors.end(), [&](const ColorRow& c) { return c.name == name; });
  row = row == kColors.end() ? kColors.begin() : row;
  return lit ? row->lit : row->dark;
}

std::unique_ptr<desktop::Screen> OpenScreen() {
  using Opener = desktop::Screen* (*)(std::string*);
  std::string error;
  const auto open = reinterpret_cast<Opener>(posix::LoadSymbol("panelglow-drawing", "PanelglowOpenScreen", error));
  std::unique_ptr<desktop::Screen> screen(open == nullptr ? nullptr : open(&error));
  if (!screen) {
    throw MachineError("the windows cannot be shown: " + error);
  }
  return screen;
}

desktop::TextOperation Line(int x, int y, const std::string& text, const Font& font, Color color) {
  desktop::TextOperation line;
  line.area = {x, y, x, y};
  line.text = WideFromUtf8(text);
  line.font = font;
  line.color = color;
  return line;
}

}  // namespace

SimScreen::SimScreen(desktop::WindowSystem& windows, const FrontPanel& panel, std::string machineName)
    : windows_(windows),
      panel_(panel),
      machineName_(std::move(machineName)),
      screen_(OpenScreen()),
      panelScreen_(OpenScreen()) {}

desktop::Scene SimScreen::PanelScene(const FrontPanel& panel, const std::string& machineName) {
  const auto rows = static_cast<int>(panel.Leds().size());
  desktop::SceneWindow window;
  window.handle = kPanelWindow;
  window.topLevel = kPanelWindow;
  window.frame = {kPanelX, kPanelY, kPanelX + kPanelWidth, kPanelY + kHeading + rows * kRow + 8};
  window.client = window.frame;
  window.clip = window.frame;
  window.text = WideFromUtf8(machineName);
  window.background = kPanelColor;
  window.raisedFrame = true;
  desktop::TextOperation heading = Line(14, 6, machineName, kHeadingFont, kText);
  heading.area = {14, 6, kPanelWidth - 14, kHeading};  // room for two lines
  heading.boxed = true;
  heading.layout.wordBreak = true;
  window.operations.emplace_back(std::move(heading));
  for (int row = 0; row < rows; ++row) {
    const Led& led = panel.Leds()[static_cast<std::size_t>(row)];
    const int y = kHeading + row * kRow;
    const int top = y + (kRow - kLed) / 2;
    const bool lit = panel.IsLit(static_cast<std::size_t>(row));
    window.operations.emplace_back(desktop::DiscOperation{{16, top - 2, 16 + kLed + 4, top + kLed + 2}, kBezel});
    window.operations.emplace_back(desktop::DiscOperation{{18, top, 18 + kLed, top + kLed}, ColorOf(led.color, lit)});
    window.operations.emplace_back(Line(50, y + 2, led.name + (lit ? "  (lit)" : ""), kNameFont, kText));
    window.operations.emplace_back(
        Line(50, y + 18, led.color + ", " + led.device + "." + led.pin, kDriverFont, kFaint));
  }
  desktop::Scene scene;
  scene.windows.push_back(std::move(window));
  return scene;
}

void SimScreen::Look() {
  const auto now = std::chrono::steady_clock::now();
  if (now - looked_ < kBetweenLooks) {
    return;
  }
  looked_ = now;
  for (const desktop::ScreenEvent& event : screen_->TakeEvents()) {
    windows_.Take(event);
  }
  panelScreen_->TakeEvents();
  if (!screen_->IsAlive()) {
    LoseScreen();
    return;
  }
  if (std::exchange(shown_, windows_.Revision()) != windows_.Revision()) {
    screen_->Show(windows_.MakeScene());
  }
  if (!panelShown_ || changesShown_ != panel_.TimeLine().size()) {
    desktop::Scene panel = PanelScene(panel_, machineName_);
    panel.width = windows_.ScreenWidth();  // as large, on this display, as the windows beside it
    panel.height = windows_.ScreenHeight();
    panelScreen_->Show(panel);
    changesShown_ = panel_.TimeLine().size();
    panelShown_ = true;
  }
}

void SimScreen::LoseScreen() {
  if (!std::exchange(isLost_, true)) {
    std::fputs(
        "simulation: the display is gone. Open windows end unanswered: start the run again when there is a "
        "display.\n",
        stderr);
    windows_.LoseScreen();
  }
}

}  // namespace panelglow::platform::sim
