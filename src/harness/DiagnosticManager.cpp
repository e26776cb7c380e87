#include "harness/DiagnosticManager.h"

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
constexpr unsigned int kControlMessage = 1;

int EndOfTest(int exitCode) {
  CDMout::EndOfTest();
  return exitCode;
}

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

DiagnosticManager::DiagnosticManager(int argc, const char* const* argv, const std::string& versionText,
                                     const std::string& diagnosticName)
    : version(versionText), name(diagnosticName) {
  platform::TheHost().console.SetControlHandler(HandleControl);
  // What the leaves of the harness need of it, before anything is logged.
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
  CmdLineParser::GetInstance(argc, argv);
}

DiagnosticManager::~DiagnosticManager() { subtests.clear(); }

void DiagnosticManager::RegisterSubtest(const std::string& subtestName, CDMDiag* test) {
  if (test == nullptr) {
    return;
  }
  subtests[subtestName] = test;
  test->SetName(subtestName);
}

std::string DiagnosticManager::GetSubtestNames() {
  std::string names;
  for (const auto& [subtestName, test] : subtests) {
    names += (names.empty() ? "" : " | ") + subtestName;
  }
  return names;
}

CDMDiag* DiagnosticManager::FindSubtest(const std::string& subtestName) {
  const auto found = subtests.find(subtestName);
  return found == subtests.end() ? nullptr : found->second;
}

int DiagnosticManager::Run() {
  return RunSubtest(FindSubtest(CmdLineParser::GetInstance().GetParameter("-subtest", "")));
}

// Whatever is thrown leaves exactly one result line and one end of test.
int DiagnosticManager::RunSubtest(CDMDiag* test) const {
  try {
    return RunGuarded(test);
  } catch (const CDMException& failure) {
    failure.Report();
  } catch (CDMException* failure) {
    const std::unique_ptr<CDMException> owned(failure);
    owned->Report();
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
  return EndOfTest(kFailed);
}

int DiagnosticManager::RunGuarded(CDMDiag* test) const {
  if (test == nullptr) {
    CDMout::LogMessage(LogOptions::Invalid, kNoSuchSubtestMessage, GetSubtestNames());
    CDMout::TestFailed(kNoSuchSubtest);
    return EndOfTest(kFailed);
  }
  if (!test->ValidateArguments()) {
    CDMout::LogMessage(LogOptions::Invalid, kArgumentsRejectedMessage, "");
    CDMout::TestFailed(kArgumentsRejected);
    return EndOfTest(kFailed);
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
  return EndOfTest(passed ? kPassed : kFailed);
}

// Runs on the system's control thread. A break never ends the process: the subtest has to notice it.
bool DiagnosticManager::HandleControl(std::uint32_t type) {
  const bool isBreak = type == platform::kControlC || type == platform::kControlBreak;
  if (!isBreak) {
    return true;
  }
  if (FindSubtest(CmdLineParser::GetInstance().GetParameter("-subtest", "")) != nullptr) {
    CDMDiag::AddSignal(type);
  } else {
    CDMout::LogMessage(LogOptions::Status, kControlMessage, "");
  }
  return true;
}

}  // namespace panelglow
