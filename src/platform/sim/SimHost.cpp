#include "platform/sim/SimHost.h"

#include <charconv>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>

#include "platform/sim/person/Operator.h"

namespace panelglow::platform::sim {

namespace {

constexpr int kRunImpossible = 3;

std::string Setting(const char* name) {
  const char* value = std::getenv(name);
  return value == nullptr ? std::string() : std::string(value);
}

[[noreturn]] void GiveUp(const std::string& why) {
  std::fprintf(stderr, "simulation: %s\n", why.c_str());
  std::_Exit(kRunImpossible);
}

const char* NameOf(LedFault fault) {
  switch (fault) {
    case LedFault::kNone:
      return "-";
    case LedFault::kDead:
      return "dead";
    case LedFault::kStuck:
      return "stuck";
    case LedFault::kWrongColor:
      return "wrong-color";
    case LedFault::kSwapped:
      return "swapped";
    case LedFault::kShorted:
      return "shorted";
    case LedFault::kInverted:
      return "inverted";
    case LedFault::kLyingWrite:
      return "lying-write";
    case LedFault::kAbsentChip:
      return "absent-chip";
  }
  return "-";
}

// What the run did to the panel, for the reference controller and for tests; one fact per line:
//   led <index> <name> <symbol> <color> <device>.<pin> <fault>
//   edge <microseconds> <index> <0|1>
//   press <microseconds> <what>
//   end <microseconds>
//   before <register = value>, after <register = value>: registers that a run left changed, when silicon has settled
//   owned <mutex>: a lock that is still held
void WriteReport(Simulation& simulation, const std::string& path) {
  std::ofstream file(path, std::ios::binary);
  const FrontPanel& panel = simulation.Panel();
  for (std::size_t i = 0; i < panel.Leds().size(); ++i) {
    const Led& led = panel.Leds()[i];
    file << "led " << i << ' ' << led.name << ' ' << led.symbol << ' ' << led.color << ' ' << led.device << '.'
         << led.pin << ' ' << NameOf(led.fault) << '\n';
  }
  for (const LedChange& change : panel.TimeLine()) {
    file << "edge " << change.time << ' ' << change.led << ' ' << (change.lit ? 1 : 0) << '\n';
  }
  if (const Operator* person = simulation.Person()) {
    for (const OperatorAction& action : person->Actions()) {
      file << "press " << action.time << ' ' << action.what << '\n';
    }
  }
  file << "end " << simulation.Time().Now() << '\n';
  for (const auto& [before, after] : simulation.StateChanges()) {
    file << "before " << before << "\nafter " << after << '\n';
  }
  for (const char* mutex : {"_HalcyonPromptLock", "_HalcyonMotherBoardLib"}) {
    if (simulation.IsMutexOwned(mutex)) {
      file << "owned " << mutex << '\n';
    }
  }
}

}  // namespace

namespace {

// The last thing that a run does. What follows it in the process writes no requests.
void CloseTrace(std::FILE* file) {
  CurrentSimulation().Trace().WriteTo(nullptr);
  const bool isWhole = std::ferror(file) == 0;
  if (std::fclose(file) != 0 || !isWhole) {
    GiveUp("the trace file " + Setting(kTraceVariable) + " did not take everything");
  }
}

}  // namespace

std::unique_ptr<Simulation> MakeSimulationFromEnvironment() {
  SimulationOptions options;
  options.realFiles = true;
  options.captureOutput = false;
  options.operatorPolicy = Setting(kOperatorVariable);
  options.screenshots = Setting(kScreenshotsVariable);
  options.realTime = Setting(kRealTimeVariable) == "1";
  options.window = Setting(kWindowVariable) == "1";
  const std::string seed = Setting(kSeedVariable);
  if (!seed.empty()) {
    const auto [end, error] = std::from_chars(seed.data(), seed.data() + seed.size(), options.seed);
    if (error != std::errc() || end != seed.data() + seed.size()) {
      GiveUp("the seed \"" + seed + "\" is no number");
    }
  }
  const std::string machineFile = Setting(kMachineVariable);
  try {
    MachineDescription description;
    description.driver.present = false;
    if (!machineFile.empty()) {
      std::ifstream file(machineFile, std::ios::binary);
      file.peek();
      if (file.fail()) {  // also a folder, which opens
        GiveUp("the machine's file " + machineFile + " cannot be read");
      }
      std::ostringstream text;
      text << file.rdbuf();
      description = ParseMachine(text.str(), machineFile);
    }
    auto simulation = std::make_unique<Simulation>(std::move(description), options);
    std::istringstream faults(Setting(kFaultsVariable));
    for (std::string fault; std::getline(faults, fault, ';');) {
      const std::size_t equals = fault.find('=');
      if (equals == std::string::npos) {
        GiveUp("the fault \"" + fault + "\" must have the form LED=KIND");
      }
      simulation->Break(fault.substr(0, equals), fault.substr(equals + 1));
    }
    if (const std::string trace = Setting(kTraceVariable); !trace.empty()) {
      std::FILE* file = std::fopen(trace.c_str(), "w");
      if (file == nullptr) {
        GiveUp("the trace file " + trace + " cannot be written");
      }
      simulation->Trace().WriteTo(file);
      static std::FILE* written = nullptr;
      written = file;
      std::atexit([] { CloseTrace(written); });
    }
    if (const std::string report = Setting(kReportVariable); !report.empty()) {
      simulation->Time().OnStuck([raw = simulation.get(), report](const std::string&) { WriteReport(*raw, report); });
      std::atexit([] { WriteReport(CurrentSimulation(), Setting(kReportVariable)); });
    }
    std::atexit([] { CurrentSimulation().Time().ReapEnded(); });
    return simulation;
  } catch (const MachineError& error) {
    GiveUp(error.what());
  }
}

}  // namespace panelglow::platform::sim
