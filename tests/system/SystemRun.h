// Runs the built programs as a controller does, in an installation of their own.
#pragma once

#include <filesystem>
#include <map>
#include <set>
#include <string>
#include <vector>

namespace panelglow::systemtest {

/// The bytes of a file; empty when there is none.
std::string TextOf(const std::filesystem::path& path);

/// A copy of the installation in a temporary folder, gone with the object.
class Installation {
 public:
  Installation();
  ~Installation();
  Installation(const Installation&) = delete;
  Installation& operator=(const Installation&) = delete;

  [[nodiscard]] std::filesystem::path Path(const std::string& name) const { return folder_ / name; }
  void Write(const std::string& name, const std::string& content) const;
  /// Every occurrence of a text in a file; throws when there is none.
  void Replace(const std::string& name, const std::string& right, const std::string& wrong) const;
  [[nodiscard]] std::string Read(const std::string& name) const;  // empty when there is no such file

  /// A machine's file: machines/<base> with more text behind it. Returns its path.
  [[nodiscard]] std::string Machine(const std::string& base, const std::string& more = {}) const;

 private:
  std::filesystem::path folder_;
};

struct Edge {
  std::uint64_t time_us = 0;
  std::string led;
  bool lit = false;
};

/// What came of a run.
struct Outcome {
  int exitCode = -1;  // -1: ended by a signal
  std::string output;
  std::string errors;
  std::vector<std::string> lines;       // of the output
  std::vector<Edge> edges;              // the front panel's time line
  std::vector<std::string> leftBehind;  // registers that differ from before the run, locks still held
  std::uint64_t end_us = 0;             // of the simulation; 0 when it did not come to its end

  /// The lines that begin with a tag, as "TestFailed".
  [[nodiscard]] std::vector<std::string> Tagged(const std::string& tag) const;
  [[nodiscard]] std::size_t TimesLit(const std::string& led) const;
  /// The LEDs that are lit or dark as they were not before the run.
  [[nodiscard]] std::set<std::string> LeftChanged() const;
  /// Exactly one EndOfTest, last, and at most one result line of each kind.
  [[nodiscard]] bool IsOrderly() const;
};

/// A run of panelglow-diags-sim in an installation.
struct SimulatedRun {
  std::string machine;  // path of the machine's file
  std::string person = "perfect";
  unsigned seed = 1;
  std::vector<std::string> faults;  // "LED=KIND"
  std::vector<std::string> arguments;
  std::map<std::string, std::string> environment = {};

  [[nodiscard]] Outcome In(const Installation& installation) const;

  /// The command that shows this run again.
  [[nodiscard]] std::string Describe() const;
};

/// A run of the LED test with one section of buttons.
SimulatedRun LedRun(const std::string& machine, const std::string& section, const std::vector<std::string>& more = {},
                    const std::string& person = "perfect", unsigned seed = 1);

/// Runs a program of the build in a folder with an environment added.
Outcome RunProgram(const std::string& program, const std::vector<std::string>& arguments,
                   const std::filesystem::path& folder, const std::map<std::string, std::string>& environment);

/// A file of tests/data.
std::string Golden(const std::string& name);

/// The seeds of a campaign: PANELGLOW_CAMPAIGN_SEEDS of them, or `usual`.
std::vector<unsigned> Seeds(unsigned usual);

}  // namespace panelglow::systemtest
