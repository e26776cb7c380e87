// The person at a simulated machine: looks at the panel and at the windows on the screen, never into the program, and
// clicks like a mouse would.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/desktop/WindowSystem.h"
#include "platform/sim/FrontPanel.h"
#include "platform/sim/Scheduler.h"

namespace panelglow::platform::sim {

class Simulation;

/// What the person did.
struct OperatorAction {
  Microseconds time = 0;
  std::string what;
};

class Operator {
 public:
  /// Policies, each with what follows a colon:
  ///   perfect          presses the button of the LED that blinks, "no LED" when none does
  ///   wrong[:N]        perfect, but wrong at the N-th answer (1)
  ///   slow[:SECONDS]   perfect, but so many seconds late (5)
  ///   cancel[:N]       perfect, but the cancel button at the N-th answer (1)
  ///   silent           confirms prompts and never answers a LED
  ///   random           never looks, presses any LED button
  ///   first            never looks, always presses the first LED button
  ///   elimination      never looks, presses each LED button once, in a random order
  ///   script:FILE      timed clicks: lines of "<milliseconds> <control id>"
  /// Throws MachineError for anything else.
  Operator(Simulation& simulation, const std::string& policy);

  [[nodiscard]] const std::vector<OperatorAction>& Actions() const { return actions_; }

  static std::string PolicyNames();

 private:
  enum class Policy { kPerfect, kWrong, kSlow, kCancel, kSilent, kRandom, kFirst, kElimination, kScript };

  struct Button {
    int id = 0;
    int x = 0;  // centre, on the screen
    int y = 0;
  };

  void LookAgain();
  void Look();
  void LookAtPrompt(const std::vector<Button>& buttons);
  void LookAtTest(const std::vector<Button>& buttons);
  [[nodiscard]] std::optional<int> JudgePanel(const std::vector<Button>& buttons) const;
  [[nodiscard]] std::optional<int> GuessButton(const std::vector<Button>& buttons);
  void Press(const std::vector<Button>& buttons, int id);
  void RunScript(const std::string& path);
  [[nodiscard]] std::vector<Button> ButtonsOnTop(desktop::WindowSystem& windows, WindowHandle top) const;

  Simulation& simulation_;
  Policy policy_ = Policy::kPerfect;
  unsigned number_ = 0;
  std::vector<Led> design_;  // the panel as the machine's leaflet shows it
  WindowHandle window_ = 0;
  Microseconds windowSeen_ = 0;
  Microseconds turnBegan_ = 0;
  std::optional<Microseconds> judged_;
  std::optional<int> answer_;
  unsigned answers_ = 0;
  std::vector<int> pressed_;
  std::vector<OperatorAction> actions_;
};

}  // namespace panelglow::platform::sim
