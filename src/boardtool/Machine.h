// The machine that the executable was linked with, and the person in front of it: what differs between the program
// for this machine and the one for a simulated machine.
#pragma once

#include <functional>
#include <optional>
#include <string>

namespace panelglow::boardtool {

struct MachineOptions {
  std::string file;       // of a simulated machine
  bool realTime = false;  // a simulated machine that people watch
};

/// True when the executable has a simulated machine; everything that it shows says so.
bool IsSimulated();

/// To be called before the machine is used. Throws WrongCall for options that this executable has no use for.
void UseMachine(const MachineOptions& options);

/// What a person would see of a simulated machine's panel at this moment, as "power-green lit"; empty on a real one.
std::string PanelNow();

/// Lets a simulated machine take notice of what came from outside, as a signal, while somebody is waited for.
void LetMachineNotice();

/// A person at a terminal.
struct Person {
  bool isThere = false;                                // standard input is a terminal
  std::function<bool()> hasPressedKey;                 // never waits
  std::function<std::optional<std::string>()> answer;  // the next line; nothing when there is none any more
};

/// Whoever sits at standard input.
Person PersonAtTerminal();

/// Notes that the run is to end, by a signal or a lost terminal; what runs looks at it and puts everything back.
class StopRequest {
 public:
  StopRequest();
  [[nodiscard]] static bool IsMade();
};

}  // namespace panelglow::boardtool
