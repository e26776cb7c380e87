// A simulated machine with everything in it. While one exists, TheHost() is this machine.
//
// The thread that constructs it becomes the machine's first thread and holds the baton.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Host.h"
#include "platform/desktop/WindowSystem.h"
#include "platform/sim/DriverTrace.h"
#include "platform/sim/MachineDescription.h"
#include "platform/sim/SimFiles.h"
#include "platform/sim/base/Scheduler.h"
#include "platform/sim/person/FrontPanel.h"
#include "platform/sim/silicon/Buses.h"

namespace panelglow::platform::sim {

class Operator;
struct OperatorSeat;

struct SimulationOptions {
  std::uint64_t seed = 1;
  bool realTime = false;
  bool window = false;        // windows and front panel are shown on a display, for a person to take the test
  bool realFiles = false;     // the current directory's files are the machine's; otherwise all files live in memory
  bool captureOutput = true;  // standard output and standard error are kept instead of written
  std::string operatorPolicy = {};                                  // empty: nobody sits at the machine
  std::string screenshots = {};                                     // folder for PNG pictures, empty for none
  Microseconds timeLimit_us = Microseconds{25} * 3600 * 1'000'000;  // a little over the longest planned run, a day
};

class Simulation {
 public:
  /// Builds the machine from a description in TOML. Throws MachineError.
  explicit Simulation(std::string_view toml, const SimulationOptions& options = {});
  Simulation(MachineDescription description, const SimulationOptions& options);
  ~Simulation();
  Simulation(const Simulation&) = delete;
  Simulation& operator=(const Simulation&) = delete;

  [[nodiscard]] platform::Host& TheMachine();

  /// Puts the fault on an LED, as "wrong-color", "swapped:caps-lock". Throws MachineError when that cannot be.
  void Break(std::string_view led, std::string_view fault);

  Scheduler& Time();
  FrontPanel& Panel();
  Buses& Hardware();
  DriverTrace& Trace();
  SimFiles& DiskFiles();
  desktop::WindowSystem& Windows();
  Operator* Person();
  /// What a person at this machine has in front of them.
  OperatorSeat Seat();
  [[nodiscard]] const MachineDescription& Description() const;

  /// What the program has written to standard output, when it is captured.
  [[nodiscard]] const std::string& Output() const;
  /// What it has written to standard error, likewise.
  [[nodiscard]] const std::string& Errors() const;
  void ClearOutput();

  /// The next `count` threads that the program asks for do not start, as on a system that has no more of them.
  void RefuseThreads(unsigned count);

  /// A console control event, delivered on a thread of its own.
  void RaiseConsole(std::uint32_t type);

  /// Saves a picture of the screen as "<number>-<what>.png" when there is a folder for it.
  void Screenshot(std::string_view what);

  /// All registers and lock keys as text, as they are at this moment.
  [[nodiscard]] std::string HardwareState();

  /// The same once the silicon has finished what is under way; for comparing before and after. Time passes for it,
  /// but no thread runs.
  [[nodiscard]] std::string SettledState();

  /// The same at the very start of the machine.
  [[nodiscard]] const std::string& InitialState() const;

  /// A line of the state as it was before the run and as it is now that the silicon has settled; where there is none
  /// the text is empty.
  struct StateChange {
    std::string before;
    std::string after;
  };
  [[nodiscard]] std::vector<StateChange> StateChanges();

  [[nodiscard]] bool IsMutexOwned(std::string_view name) const;

 private:
  struct Parts;
  std::unique_ptr<Parts> parts_;
};

/// The simulation behind TheHost() at the moment; made from the environment when there is none.
Simulation& CurrentSimulation();

}  // namespace panelglow::platform::sim
