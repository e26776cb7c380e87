// Runs one subtest and decides what the controller sees of it: the result line, the end of test, and the exit code
// all come from here.
#pragma once

#include <cstdint>
#include <map>
#include <mutex>
#include <string>

namespace panelglow {

class CDMDiag;

class DiagnosticManager {
 public:
  /// Installs the console control handler, builds the command line's singleton and reads the parameter file: its log
  /// lines are the first that the program prints.
  DiagnosticManager(int argc, const char* const* argv, const std::string& versionText,
                    const std::string& diagnosticName);

  /// Takes the control handler back, and forgets the subtests; they live to the end of the process.
  virtual ~DiagnosticManager();
  DiagnosticManager(const DiagnosticManager&) = delete;
  DiagnosticManager& operator=(const DiagnosticManager&) = delete;

  /// Adds a subtest under a name, replacing one of the same name, and tells the subtest its name. Not owned. A null
  /// test is ignored.
  void RegisterSubtest(const std::string& subtestName, CDMDiag* test);

  /// Answers what the command line asks about the program, or else runs the subtest that it names. The exit code: 0
  /// when something was answered or the subtest passed, and standard output took all of it; otherwise 1.
  int Run();

  /// The XML description of the whole diagnostic, without a line end behind it.
  [[nodiscard]] std::string GetCatalog() const;

  /// The template of a resource file with the texts of all subtests.
  [[nodiscard]] static std::string GetDictionary();

  [[nodiscard]] const std::string& GetVersion() const { return version; }

  /// All names in order, joined by " | ".
  [[nodiscard]] static std::string GetSubtestNames();

  /// Null when there is none of exactly that name.
  [[nodiscard]] static CDMDiag* FindSubtest(const std::string& subtestName);

 private:
  static bool AreRequestsValid();
  int AnswerOrRun() const;
  bool AnswerRequests(CDMDiag* test) const;
  int RunSubtest(CDMDiag* test) const;
  int RunGuarded(CDMDiag* test) const;
  [[nodiscard]] std::string VersionOnOneLine() const;
  static std::map<std::string, CDMDiag*> CopyOfSubtests();
  static bool HandleControl(std::uint32_t type);

  std::string version;
  std::string name;
  static std::map<std::string, CDMDiag*> subtests;
  static std::mutex subtestsGuard;  // the control handler looks a subtest up on a thread of its own
};

}  // namespace panelglow
