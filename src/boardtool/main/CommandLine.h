// What the integrator's program takes on its command line, and what it does for it.
#pragma once

#include <CLI/CLI.hpp>
#include <functional>
#include <string>

#include "boardtool/Blink.h"
#include "boardtool/Check.h"
#include "boardtool/Explain.h"
#include "boardtool/Machine.h"
#include "boardtool/ReadVerbs.h"
#include "boardtool/Report.h"
#include "boardtool/Try.h"

namespace panelglow::boardtool {

// What stands between the verb and the machine.
struct Between {
  MachineOptions machine;
  std::string traceFile;
  std::string replayFile;
};

class CommandLine {
 public:
  explicit CommandLine(const char* name = ProgramName(), bool isSimulated = IsSimulated());
  CommandLine(const CommandLine&) = delete;
  CommandLine& operator=(const CommandLine&) = delete;

  /// Does what the call asks for. Returns the program's exit code; throws WrongCall and CannotRun.
  int Run(int argc, char** argv);

  /// The verbs and their options.
  [[nodiscard]] const CLI::App& App() const { return app_; }

 private:
  void RefuseWithReplay() const;
  std::string Verbs();
  void AddExplain();
  void AddCheck();
  void AddBlink();
  void AddReport();
  void AddReadings();
  void AddTry();
  void AddReplay();

  CLI::App app_;
  Between between_;
  ExplainOptions explain_;
  CheckOptions check_;
  BlinkOptions blink_;
  ReportOptions report_;
  ReadOptions read_;
  TryOptions try_;
  std::function<int()> run_;
};

}  // namespace panelglow::boardtool
