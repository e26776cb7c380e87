#include "harness/DiagnosticManager.h"

#include <atomic>
#include <cstdlib>
#include <exception>
#include <memory>

#include "harness/CDMDiag.h"
#include "harness/CmdLineParser.h"
#include "harness/MessageFiles.h"
#include "harness/base/CDMException.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "harness/base/Notices.h"
#include "hw/SMBIOSDiscovery.h"
#include "platform/Host.h"
#include "prompts/CDMWindow.h"

namespace panelglow {

namespace {

constexpr int kPassed = 0;
constexpr int kFailed = 1;

// Run-level results.
constexpr const char* kUnknownException = "990518";
constexpr const char* kArgumentsRejected = "990520";
constexpr const char* kNoSuchSubtest = "990521";
constexpr int kStandardException = 995205;

constexpr unsigned int kNoSuchSubtestMessage = 20001;
constexpr unsigned int kArgumentsRejectedMessage = 20002;
constexpr unsigned int kControlMessage = 1;

// Set once the command line can be asked for.
std::atomic<bool> isCommandLineRead{false};

}  // namespace

std::map<std::string, CDMDiag*> DiagnosticManager::subtests;
std::mutex DiagnosticManager::subtestsGuard;

DiagnosticManager::DiagnosticManager(int argc, const char* const* argv, const std::string& versionText,
                                     const std::string& diagnosticName)
    : version(versionText), name(diagnosticName) {
  platform::TheHost().console.SetControlHandler(HandleControl);
  CmdLineParser& parser = CmdLineParser::GetInstance(argc, argv);
  CDMout::SetDebugQuery(
      [] { return CDMUtil::EqualIgnoreCase(CmdLineParser::GetInstance().GetParameter("-debug", "false"), "true"); });
  // A parameter file may set the locale and the message files of the run: the process's own message files, which are
  // opened once, must not be needed before it is read.
  CDMout::SetMessageResolver([](unsigned int id, const std::string& text) {
    return MessageFiles::OfCommandLine().ResolveLogMessage(id, text);
  });
  parser.ReadParameterFile([] { return SMBIOSDiscovery::Instance().GetProductText(); });
  CDMout::SetMessageResolver(
      [](unsigned int id, const std::string& text) { return MessageFiles::Instance().ResolveLogMessage(id, text); });
  CDMWindow::SetServices({[](int id, const wstring& fallback) {
                            wstring noMedia;
                            return MessageFiles::Instance().GetResourceString(id, wstring(), fallback, noMedia);
                          },
                          [] { return CmdLineParser::GetInstance().GetParameter("-locale", "en_US"); },
                          [] { return CDMDiag::ShouldTestBeTerminated() || CDMDiag::IsSignalReceived(); }});
  isCommandLineRead = true;
}

// The handler goes first: an event that arrives while the process takes its static objects down finds nobody.
DiagnosticManager::~DiagnosticManager() {
  platform::TheHost().console.SetControlHandler(nullptr);
  const std::lock_guard<std::mutex> lock(subtestsGuard);
  subtests.clear();
}

void DiagnosticManager::RegisterSubtest(const std::string& subtestName, CDMDiag* test) {
  if (test == nullptr) {
    return;
  }
  test->SetName(subtestName);
  const std::lock_guard<std::mutex> lock(subtestsGuard);
  subtests[subtestName] = test;
}

std::map<std::string, CDMDiag*> DiagnosticManager::CopyOfSubtests() {
  const std::lock_guard<std::mutex> lock(subtestsGuard);
  return subtests;
}

std::string DiagnosticManager::GetSubtestNames() {
  std::string names;
  for (const auto& [subtestName, test] : CopyOfSubtests()) {
    names += (names.empty() ? "" : " | ") + subtestName;
  }
  return names;
}

CDMDiag* DiagnosticManager::FindSubtest(const std::string& subtestName) {
  const std::lock_guard<std::mutex> lock(subtestsGuard);
  const auto found = subtests.find(subtestName);
  return found == subtests.end() ? nullptr : found->second;
}

// What nobody could read is no answer and no pass.
int DiagnosticManager::Run() {
  const int exitCode = AnswerOrRun();
  const std::string problem = platform::TheHost().console.OutputProblem();
  if (problem.empty()) {
    return exitCode;
  }
  Notices::Tell("Standard output did not take all lines (" + problem +
                "), so the verdict may be among those that are lost: the exit code is 1, and the run has to be "
                "repeated with an output that can be written.");
  return kFailed;
}

int DiagnosticManager::AnswerOrRun() const {
  if (!AreRequestsValid()) {
    return kFailed;
  }
  CDMDiag* const test = FindSubtest(CmdLineParser::GetInstance().GetParameter("-subtest", ""));
  return AnswerRequests(test) ? kPassed : RunSubtest(test);
}

// Whatever is thrown leaves exactly one result line and one end of test.
int DiagnosticManager::RunSubtest(CDMDiag* test) const {
  int exitCode = kFailed;
  try {
    exitCode = RunGuarded(test);
  } catch (const CDMException& failure) {
    failure.Report();
  } catch (CDMException* failure) {
    const std::unique_ptr<CDMException> owned(failure);
    if (owned == nullptr) {
      CDMout::TestFailed(kUnknownException);  // a thrown nullptr is caught by the first pointer
    } else {
      owned->Report();
    }
  } catch (int code) {
    CDMout::TestFailed(code, "");
  } catch (const std::string& text) {
    CDMout::TestFailed(text);
  } catch (const char* text) {
    CDMout::TestFailed(std::atoi(text), "");
  } catch (const std::exception& failure) {
    CDMout::TestFailed(kStandardException, failure.what());
  } catch (std::exception* failure) {
    CDMout::TestFailed(kStandardException, failure->what());
  } catch (...) {
    CDMout::TestFailed(kUnknownException);
  }
  CDMout::EndOfTest();
  return exitCode;
}

int DiagnosticManager::RunGuarded(CDMDiag* test) const {
  if (test == nullptr) {
    CDMout::LogMessage(LogOptions::Invalid, kNoSuchSubtestMessage, GetSubtestNames());
    CDMout::TestFailed(kNoSuchSubtest);
    return kFailed;
  }
  if (!test->ValidateArguments()) {
    CDMout::LogMessage(LogOptions::Invalid, kArgumentsRejectedMessage, "");
    CDMout::TestFailed(kArgumentsRejected);
    return kFailed;
  }
  const std::string programPath = CmdLineParser::GetInstance().GetProgramPath();
  if (!programPath.empty()) {
    CDMout::LogMessage(LogOptions::Debug, kFreeText, "diagnostic: " + programPath);
  }
  if (!version.empty()) {
    CDMout::LogMessage(LogOptions::Debug, kFreeText, "version: " + VersionOnOneLine());
  }
  test->LogArguments(LogOptions::Debug, kFreeText);
  platform::Clock& clock = platform::TheHost().clock;
  const std::uint32_t begin = clock.TickCount();
  const bool passed = test->Run();
  const std::uint32_t end = clock.TickCount();
  if (passed) {
    CDMout::LogMessage(LogOptions::Debug, kFreeText,
                       "Test execution time: " + CDMUtil::ToString(end - begin) + " milliseconds");
  }
  return passed ? kPassed : kFailed;
}

// Runs on the system's control thread. A break never ends the process: the subtest has to notice it.
bool DiagnosticManager::HandleControl(std::uint32_t type) {
  const bool isBreak = type == platform::kControlC || type == platform::kControlBreak;
  if (!isBreak) {
    return true;
  }
  static std::atomic<int> heard{0};
  const std::string times = ++heard > 1 ? " (" + CDMUtil::ToString(heard.load()) + " times now)" : "";
  // Before the command line is read nobody knows what will run: the break is kept for it.
  if (!isCommandLineRead || FindSubtest(CmdLineParser::GetInstance().GetParameter("-subtest", "")) != nullptr) {
    CDMDiag::AddSignal(type);
    Notices::Tell("The request to stop was heard" + times +
                  ". The run ends at its next step, that of an LED test when the attempt under way is over (the "
                  "dialog's cancel button ends it at once), and puts every LED back first.");
  } else {
    CDMout::LogMessage(LogOptions::Status, kControlMessage, "");
    Notices::Tell("The request to stop was heard" + times + ". No subtest is running that it could end.");
  }
  return true;
}

}  // namespace panelglow
