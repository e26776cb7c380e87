// The person at a simulated machine: looks at the panel and at the windows on the screen, never into the program, and
// clicks like a mouse would.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/desktop/WindowSystem.h"
#include "platform/sim/base/Scheduler.h"
#include "platform/sim/person/FrontPanel.h"

namespace panelglow::platform::sim {

/// What the person did.
struct OperatorAction {
  Microseconds time = 0;
  std::string what;
};

/// What the person has in front of them; all of it outlives the person.
struct OperatorSeat {
  Scheduler& time;
  const FrontPanel& panel;
  desktop::WindowSystem& windows;
  std::function<void(std::string_view)> picture;  // takes one of the screen, named after what is about to be done
};

class Operator {
 public:
  /// `design` is the panel as the machine's leaflet shows it; `policy` is a name of PolicyHelp, with what follows a
  /// colon. Throws MachineError for anything else.
  Operator(OperatorSeat seat, std::vector<Led> design, const std::string& policy);

  [[nodiscard]] const std::vector<OperatorAction>& Actions() const { return actions_; }

  static std::string PolicyNames();

  /// What each policy does, a line each.
  static std::string PolicyHelp();

 private:
  enum class Policy { kPerfect, kWrong, kSlow, kCancel, kSilent, kRandom, kFirst, kElimination, kScript };

  struct Button {
    int id = 0;
    int x = 0;  // centre, on the screen
    int y = 0;
    std::string caption = {};
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

  OperatorSeat seat_;
  Policy policy_ = Policy::kPerfect;
  unsigned number_ = 0;
  std::vector<Led> design_;
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
