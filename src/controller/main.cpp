// The reference controller and bench: picks a simulated machine, an operator and a seed, runs the program on it as a
// controller does, follows its output live, and shows what happened on the front panel.
#include <sys/stat.h>
#include <unistd.h>

#include <CLI/CLI.hpp>
#include <climits>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <fstream>
#include <iostream>
#include <sstream>
#include <string>
#include <vector>

#include "controller/ChildProcess.h"
#include "controller/Options.h"
#include "controller/PanelView.h"
#include "controller/ProtocolFollower.h"
#include "controller/RunReport.h"
#include "platform/sim/SimHost.h"
#include "platform/sim/person/Operator.h"

namespace {

using namespace panelglow::controller;
namespace sim = panelglow::platform::sim;

constexpr int kFailed = 1;
constexpr int kWrongCall = 2;
constexpr int kRunImpossible = 3;
constexpr std::size_t kStripColumns = 64;

int Complain(int code, const std::string& problem) {
  std::cerr << "panelglow-sim: " << problem << "\n";
  return code;
}

std::string AbsolutePath(const std::string& path) {
  if (path.empty() || path.front() == '/') {
    return path;
  }
  char here[PATH_MAX] = {};
  return ::getcwd(here, sizeof here) == nullptr ? path : std::string(here) + "/" + path;
}

std::string OwnFolder() {
  char path[PATH_MAX] = {};
  const ssize_t length = ::readlink("/proc/self/exe", path, sizeof path - 1);
  const std::string own(path, length < 0 ? 0 : static_cast<std::size_t>(length));
  return own.substr(0, own.find_last_of('/') + 1);
}

std::pair<std::string, std::string> SplitFault(const std::string& fault) {
  const std::size_t equals = fault.find('=');
  if (equals == std::string::npos) {
    throw sim::MachineError("the fault \"" + fault + "\" must have the form LED=KIND");
  }
  return {fault.substr(0, equals), fault.substr(equals + 1)};
}

// Builds the machine here once, so that everything wrong with the call is said before a program is started.
int Check(const Options& options) {
  std::ifstream file(options.machine, std::ios::binary);
  std::ostringstream text;
  if (!(text << file.rdbuf())) {
    return Complain(kRunImpossible, "the machine's file " + options.machine +
                                        " cannot be read: name one with --machine, as machines/notebook.toml");
  }
  try {
    sim::Simulation machine(sim::ParseMachine(text.str(), options.machine), {});
    try {
      for (const std::string& fault : options.faults) {
        const auto [led, kind] = SplitFault(fault);
        machine.Break(led, kind);
      }
      if (!options.person.empty()) {
        const sim::Operator person(machine.Seat(), {}, options.person);
      }
    } catch (const sim::MachineError& error) {
      return Complain(kWrongCall, error.what());
    }
  } catch (const sim::MachineError& error) {
    return Complain(kRunImpossible, error.what());
  }
  if (!options.screenshots.empty() && ::mkdir(options.screenshots.c_str(), 0777) != 0 && errno != EEXIST) {
    return Complain(kRunImpossible, "the folder " + options.screenshots + " cannot be made");
  }
  return 0;
}

// A file that is gone when the object is.
class TemporaryFile {
 public:
  TemporaryFile() {
    const char* folder = std::getenv("TMPDIR");
    path_ = std::string(folder == nullptr ? "/tmp" : folder) + "/panelglow-sim-XXXXXX";
    const int file = ::mkstemp(path_.data());
    if (file >= 0) {
      ::close(file);
    }
  }
  ~TemporaryFile() { ::unlink(path_.c_str()); }
  TemporaryFile(const TemporaryFile&) = delete;
  TemporaryFile& operator=(const TemporaryFile&) = delete;
  [[nodiscard]] const std::string& Path() const { return path_; }

 private:
  std::string path_;
};

ChildProcess::Command CommandFor(const Options& options, const std::string& reportPath) {
  ChildProcess::Command command;
  command.program = OwnFolder() + "panelglow-diags-sim";
  // Under its product's name the program finds the same message files as the product.
  command.arguments = {"panelglow-diags"};
  command.arguments.insert(command.arguments.end(), options.arguments.begin(), options.arguments.end());
  std::string faults;
  for (const std::string& fault : options.faults) {
    faults += (faults.empty() ? "" : ";") + fault;
  }
  command.environment = {{sim::kMachineVariable, AbsolutePath(options.machine)},
                         {sim::kOperatorVariable, options.person},
                         {sim::kSeedVariable, std::to_string(options.seed)},
                         {sim::kFaultsVariable, faults},
                         {sim::kRealTimeVariable, options.realTime ? "1" : ""},
                         {sim::kWindowVariable, options.window ? "1" : ""},
                         {sim::kScreenshotsVariable, AbsolutePath(options.screenshots)},
                         {sim::kTraceVariable, AbsolutePath(options.trace)},
                         {sim::kReportVariable, reportPath}};
  return command;
}

// Shows a run's lines to a person: a bar on a terminal, a line per step elsewhere.
class ProgressView {
 public:
  ProgressView() : terminal_(::isatty(STDOUT_FILENO) != 0) {}

  void Show(const std::string& line, ProtocolFollower::Kind kind, int percentage) {
    switch (kind) {
      case ProtocolFollower::Kind::kPercentage:
        ShowPercentage(percentage);
        break;
      case ProtocolFollower::Kind::kEnd:
        ClearBar();
        break;
      case ProtocolFollower::Kind::kLog:
      case ProtocolFollower::Kind::kResult:
      case ProtocolFollower::Kind::kOther:
        ClearBar();
        std::cout << "  " << line << "\n";
        ShowBar();
        break;
    }
    std::cout << std::flush;
  }

 private:
  static constexpr int kBarCells = 40;

  void ShowPercentage(int percentage) {
    percentage_ = percentage;
    if (terminal_) {
      ShowBar();
    } else {
      std::cout << "  " << percentage << " %\n";
    }
  }
  void ShowBar() {
    if (terminal_) {
      const auto filled = static_cast<std::size_t>(percentage_ * kBarCells / 100);
      std::cout << "\r[" << std::string(filled, '#') << std::string(kBarCells - filled, '-') << "] " << percentage_
                << " % ";
    }
  }
  void ClearBar() {
    if (terminal_) {
      std::cout << "\r" << std::string(kBarCells + 10, ' ') << "\r";
    }
  }

  bool terminal_;
  int percentage_ = 0;
};

int Follow(ChildProcess& child, const Options& options, ProtocolFollower& follower) {
  ProgressView view;
  std::string pending;
  while (const std::optional<std::string> piece = child.Read()) {
    if (options.raw) {
      std::cout << *piece << std::flush;
    }
    pending += *piece;
    for (std::size_t end = 0; (end = pending.find('\n')) != std::string::npos; pending.erase(0, end + 1)) {
      const std::string line = pending.substr(0, end);
      const ProtocolFollower::Kind kind = follower.Take(line);
      if (!options.raw) {
        view.Show(line, kind, follower.Percentage());
      }
    }
  }
  const ChildProcess::End end = child.Wait();
  if (end.bySignal) {
    return Complain(kRunImpossible, "the program was ended by signal " + std::to_string(end.code));
  }
  if (end.code > 1) {
    return Complain(kRunImpossible, "the program ended with code " + std::to_string(end.code));
  }
  if (!follower.IsOrderly()) {
    return Complain(kRunImpossible,
                    "the program broke the line protocol: more than one result, or lines behind its end");
  }
  return end.code;
}

std::string ReproducingCommand(const Options& options) {
  std::string command = "panelglow-sim --machine " + options.machine;
  command += options.person.empty() ? "" : " --operator " + options.person;
  command += " --seed " + std::to_string(options.seed);
  for (const std::string& fault : options.faults) {
    command += " --fault " + fault;
  }
  command += " --";
  for (const std::string& argument : options.arguments) {
    command += " '" + argument + "'";
  }
  return command;
}

int Run(const Options& options) {
  if (const int problem = Check(options)) {
    return problem;
  }
  const TemporaryFile reportFile;
  ProtocolFollower follower;
  int code = 0;
  try {
    ChildProcess child(CommandFor(options, reportFile.Path()));
    code = Follow(child, options, follower);
  } catch (const std::runtime_error& error) {
    return Complain(kRunImpossible, error.what());
  }
  std::ostream& people = options.raw ? std::cerr : std::cout;
  if (!options.raw) {
    std::ifstream file(reportFile.Path());
    const RunReport report = ReadRunReport(file);
    people << "\n" << ShowPanel(report, kStripColumns);
  }
  if (code == kRunImpossible) {
    people << "BROKEN RUN. To see it again: " << ReproducingCommand(options) << "\n";
  } else if (!options.raw) {
    people << follower.Verdict(code) << "\n";
  }
  return code;
}

int RunCommandLine(int argc, char** argv) {
  Options options;
  CLI::App app;
  AddOptions(app, options);
  try {
    app.parse(argc, argv);
  } catch (const CLI::ParseError& error) {
    return app.exit(error) == 0 ? 0 : kWrongCall;
  }
  options.realTime = options.realTime || options.window;
  if (options.person.empty() && !options.window) {
    options.person = "perfect";
  }
  const int code = Run(options);
  std::cout.flush();
  // A verdict that nobody could read is none.
  return std::cout ? code : Complain(kFailed, "standard output did not take everything, and the verdict may be lost");
}

}  // namespace

int main(int argc, char** argv) {
  try {
    return RunCommandLine(argc, argv);
  } catch (const std::exception& error) {
    std::fprintf(stderr, "panelglow-sim: %s\n", error.what());
    return kRunImpossible;
  }
}
