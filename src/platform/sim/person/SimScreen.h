// A display for a person at a simulated machine: the program's windows, and beside them the front panel, whose LEDs
// glow as the simulated hardware has them.
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <string>

#include "platform/desktop/Screen.h"
#include "platform/desktop/WindowSystem.h"
#include "platform/sim/person/FrontPanel.h"

namespace panelglow::platform::sim {

class SimScreen {
 public:
  /// Opens the display that DISPLAY names. Throws MachineError when there is none.
  SimScreen(desktop::WindowSystem& windows, const FrontPanel& panel, std::string machineName);

  /// Takes what mouse and keyboard did and shows what is new. To be called often, by the holder of the baton.
  void Look();

  /// The panel as a picture.
  [[nodiscard]] static desktop::Scene PanelScene(const FrontPanel& panel, const std::string& machineName);

 private:
  void LoseScreen();

  desktop::WindowSystem& windows_;
  const FrontPanel& panel_;
  std::string machineName_;
  std::unique_ptr<desktop::Screen> screen_;       // of the windows
  std::unique_ptr<desktop::Screen> panelScreen_;  // of the panel
  std::uint64_t shown_ = 0;
  std::size_t changesShown_ = 0;
  bool panelShown_ = false;
  bool isLost_ = false;
  std::chrono::steady_clock::time_point looked_;
};

}  // namespace panelglow::platform::sim
