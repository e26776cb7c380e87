// The machine that the executable was linked with, and the person in front of it: what differs between the program
// for this machine and the one for a simulated machine.
#pragma once

#include <cstddef>
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

/// The executable's name, as people are told it.
const char* ProgramName();

/// To be called before the machine is used. Throws WrongCall for options that this executable has no use for.
void UseMachine(const MachineOptions& options);

/// A moment in the life of a simulated machine's panel.
std::size_t PanelMark();

/// Which lamps a person would have seen moving on a simulated machine's panel since then, as "on the panel moves
/// power-green"; empty on a real one.
std::string PanelMoves(std::size_t mark);

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
