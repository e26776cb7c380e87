#include "harness/DiagnosticManager.h"

#include <array>
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
constexpr unsigned int kUnknownParameterMessage = 20003;
constexpr unsigned int kControlMessage = 1;

// Set once the command line can be asked for.
std::atomic<bool> isCommandLineRead{false};

// The version's lines as one line for the log.
std::string OnOneLine(std::string text) {
  CDMUtil::ReplaceAll(text, "\n", ", ");
  CDMUtil::ReplaceAll(text, "  ", " ");
  CDMUtil::ReplaceAll(text, "(", "");
  CDMUtil::ReplaceAll(text, ")", "");
  CDMUtil::ReplaceAll(text, " :", ":");
  return text;
}

}  // namespace

std::map<std::string, CDMDiag*> DiagnosticManager::subtests;
std::mutex DiagnosticManager::subtestsGuard;

DiagnosticManager::DiagnosticManager(int argc, const char* const* argv, const std::string& versionText,
                                     const std::string& diagnosticName)
    : version(versionText), name(diagnosticName) {
  platform::TheHost().console.SetControlHandler(HandleControl);
  CmdLineParser::GetInstance(argc, argv);
  isCommandLineRead = true;
  // What the leaves of the harness need of it. A log line asks for the command line, so it must not do so before that
  // is there: a line that is logged while it is being read is a plain one.
  CDMout::SetDebugQuery(
      [] { return CDMUtil::EqualIgnoreCase(CmdLineParser::GetInstance().GetParameter("-debug", "false"), "true"); });
  CDMout::SetMessageResolver(
      [](unsigned int id, const std::string& text) { return MessageFiles::Instance().ResolveLogMessage(id, text); });
  CDMWindow::SetServices({[](int id, const wstring& fallback) {
                            wstring noMedia;
                            return MessageFiles::Instance().GetResourceString(id, wstring(), fallback, noMedia);
                          },
                          [] { return CmdLineParser::GetInstance().GetParameter("-locale", "en_US"); },
                          [] { return CDMDiag::ShouldTestBeTerminated() || CDMDiag::IsSignalReceived(); }});
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

std::string DiagnosticManager::GetSubtestNames() {
  const std::lock_guard<std::mutex> lock(subtestsGuard);
  std::string names;
  for (const auto& [subtestName, test] : subtests) {
    names += (names.empty() ? "" : " | ") + subtestName;
  }
  return names;
}

CDMDiag* DiagnosticManager::FindSubtest(const std::string& subtestName) {
  const std::lock_guard<std::mutex> lock(subtestsGuard);
  const auto found = subtests.find(subtestName);
  return found == subtests.end() ? nullptr : found->second;
}

int DiagnosticManager::Run() {
  return RunSubtest(FindSubtest(CmdLineParser::GetInstance().GetParameter("-subtest", "")));
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
  } catch (char* text) {
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
  if (!IsAccepted(*test)) {
    CDMout::LogMessage(LogOptions::Invalid, kArgumentsRejectedMessage, "");
    CDMout::TestFailed(kArgumentsRejected);
    return kFailed;
  }
  const std::string programPath = CmdLineParser::GetInstance().GetProgramPath();
  if (!programPath.empty()) {
    CDMout::LogMessage(LogOptions::Debug, kFreeText, "diagnostic: " + programPath);
  }
  if (!version.empty()) {
    CDMout::LogMessage(LogOptions::Debug, kFreeText, "version: " + OnOneLine(version));
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

// The subtest's own check, and one more: who asks for information must not get a test of his hardware instead. Such
// requests are not answered yet, and refused like a parameter that nobody knows.
bool DiagnosticManager::IsAccepted(CDMDiag& test) {
  constexpr std::array<const char*, 4> kRequests{"-catalog", "-description", "-help", "-version"};
  if (!test.ValidateArguments()) {
    return false;
  }
  for (const char* request : kRequests) {
    if (CDMUtil::EqualIgnoreCase(CmdLineParser::GetInstance().GetParameter(request, ""), "true")) {
      CDMout::LogMessage(LogOptions::Invalid, kUnknownParameterMessage, request);
      return false;
    }
  }
  return true;
}

// Runs on the system's control thread. A break never ends the process: the subtest has to notice it.
bool DiagnosticManager::HandleControl(std::uint32_t type) {
  const bool isBreak = type == platform::kControlC || type == platform::kControlBreak;
  if (!isBreak) {
    return true;
  }
  // Before the command line is read nobody knows what will run: the break is kept for it.
  if (!isCommandLineRead || FindSubtest(CmdLineParser::GetInstance().GetParameter("-subtest", "")) != nullptr) {
    CDMDiag::AddSignal(type);
  } else {
    CDMout::LogMessage(LogOptions::Status, kControlMessage, "");
  }
  return true;
}

}  // namespace panelglow
