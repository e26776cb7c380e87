// The manager with one subtest, in a process of its own on a simulated machine.
#pragma once

#include <functional>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include "harness/CDMDiag.h"
#include "harness/DiagnosticManager.h"
#include "harness/OwnProcess.h"
#include "harness/base/CDMUtil.h"
#include "platform/sim/Simulation.h"

namespace panelglow {

class Probe : public CDMDiag {
 public:
  explicit Probe(std::function<bool()> runBody) : body(std::move(runBody)) {
    Declare("-Level", CDMArgumentType::Integer, "30", std::make_unique<CDMConstraint>(0, 100));
    Declare("-Loud", CDMArgumentType::Boolean, "TRUE");
    Declare("-Ratio", CDMArgumentType::Double, "");
    Declare("-Mode", CDMArgumentType::String, "Default", std::make_unique<CDMConstraint>("Default,Fast"));
    DeclareArgument("-Serial", CDMArgumentType::LargeInteger, "", "", false, nullptr, true, false);  // hidden
  }
  void Declare(const char* argument, CDMArgumentType type, const char* defaultValue,
               std::unique_ptr<CDMConstraint> rule = nullptr, bool required = false) {
    DeclareArgument(argument, type, defaultValue, "", required, std::move(rule), false, false);
  }
  bool Run() override { return body(); }
  using CDMDiag::GetArgument;

 private:
  std::function<bool()> body;
};

struct ProbeRun {
  std::string words;  // of the command line, behind the program
  std::function<bool()> body = [] { return true; };
  std::function<void(Probe&)> prepare = [](Probe&) {};
  std::map<std::string, std::string> files{};
  std::string version{};
  std::string boardProduct{};

  /// Standard output with the exit code behind it, as "= 0".
  [[nodiscard]] std::string Output() const {
    return Run([](const platform::sim::Simulation& machine, int exitCode) {
      return machine.Output() + "= " + std::to_string(exitCode);
    });
  }

  /// What people are told.
  [[nodiscard]] std::string Errors() const {
    return Run([](const platform::sim::Simulation& machine, int) { return machine.Errors(); });
  }

  [[nodiscard]] std::string Run(
      const std::function<std::string(const platform::sim::Simulation&, int)>& answer) const {
    return InOwnProcess([&] {
      platform::sim::MachineDescription description;
      description.firmware.boardProduct = boardProduct;
      platform::sim::Simulation machine(std::move(description), {});
      for (const auto& [path, content] : files) {
        machine.DiskFiles().Put(path, content);
      }
      std::vector<std::string> arguments{"C:\\suite\\probe.exe"};
      CDMUtil::Split(words, arguments, " ");
      std::vector<const char*> argv;
      for (const std::string& argument : arguments) {
        argv.push_back(argument.c_str());
      }
      DiagnosticManager manager(static_cast<int>(argv.size()), argv.data(), version, "Probe");
      Probe probe(body);
      prepare(probe);
      manager.RegisterSubtest("Probe", &probe);
      manager.RegisterSubtest("Other", nullptr);
      const int exitCode = manager.Run();
      return answer(machine, exitCode);
    });
  }

  /// The output without log lines of the class Debug, and with a line end.
  [[nodiscard]] std::string Lines() const {
    std::vector<std::string> lines;
    CDMUtil::Split(Output(), lines, "\n");
    std::string kept;
    for (const std::string& line : lines) {
      kept += line.starts_with("LogMessage 14 ") ? "" : line + "\n";
    }
    return kept;
  }
};

}  // namespace panelglow
