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
  /// Installs the console control handler and builds the command line's singleton.
  DiagnosticManager(int argc, const char* const* argv, const std::string& versionText,
                    const std::string& diagnosticName);

  /// Takes the control handler back, and forgets the subtests; they live to the end of the process.
  virtual ~DiagnosticManager();
  DiagnosticManager(const DiagnosticManager&) = delete;
  DiagnosticManager& operator=(const DiagnosticManager&) = delete;

  /// Adds a subtest under a name, replacing one of the same name, and tells the subtest its name. Not owned. A null
  /// test is ignored.
  void RegisterSubtest(const std::string& subtestName, CDMDiag* test);

  /// Runs what the command line asks for. The exit code: 0 when the subtest passed, otherwise 1.
  int Run();

  [[nodiscard]] const std::string& GetVersion() const { return version; }

  /// All names in order, joined by " | ".
  [[nodiscard]] static std::string GetSubtestNames();

  /// Null when there is none of exactly that name.
  [[nodiscard]] static CDMDiag* FindSubtest(const std::string& subtestName);

 private:
  int RunSubtest(CDMDiag* test) const;
  int RunGuarded(CDMDiag* test) const;
  static bool IsAccepted(CDMDiag& test);
  static bool HandleControl(std::uint32_t type);

  std::string version;
  std::string name;
  static std::map<std::string, CDMDiag*> subtests;
  static std::mutex subtestsGuard;  // the control handler looks a subtest up on a thread of its own
};

}  // namespace panelglow
