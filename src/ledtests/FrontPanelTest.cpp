#include "ledtests/FrontPanelTest.h"

#include <exception>

#include "board/MotherBoard.h"
#include "harness/base/CDMException.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/Notices.h"
#include "hw/Tsk.h"
#include "ledtests/LedKind.h"
#include "ledtests/SuperDialog.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr const char* kDiagnosticName = "panelglow-diags";

// Status in the data-collection log.
constexpr const char* kStatusPassed = "1";
constexpr const char* kStatusFailed = "0";
constexpr const char* kStatusTerminated = "-1";

constexpr int kDriverMissing = 20472;
constexpr int kIconsMissing = 990618;
constexpr int kEndedByRunControl = 995000;
constexpr int kUnknownException = 990518;
constexpr int kStandardException = 995205;

constexpr int kFileMessage = 61;

std::uint32_t Now() { return platform::TheHost().clock.TickCount(); }

}  // namespace

FrontPanelTest::FrontPanelTest(CDevio& driverClient)
    : driver(driverClient), legacyPorts(driverClient), startTick(Now()) {}

FrontPanelTest::~FrontPanelTest() = default;

std::unique_ptr<MotherBoard> FrontPanelTest::MakeBoard() const {
  return MotherBoard::Instantiate(iniFile, testIni, chipIni, "platform", "");
}

std::unique_ptr<MotherBoard> FrontPanelTest::MakeAnyBoard() const {
  std::unique_ptr<MotherBoard> board = MakeBoard();
  return board ? std::move(board) : MotherBoard::Instance(iniFile);
}

std::string FrontPanelTest::CodeOf(std::string_view /*function*/) const { return {}; }

// ---- the run

void FrontPanelTest::BeginRun(const std::string& testName) {
  UpdatePercentage(1);
  details.name = testName;
  details.retriesspecified = CDMUtil::ToString(retries);
  details.errorcode = "0";
  xmlCorrupted = CDMUtil::isXMLCorrupted(dataCollectionFile);
  const bool isDriverThere = driver.LoadOnce();
  Tsk_GetSystemID(systemId);
  legacyPorts.SelectModel(systemId);
  if (!isDriverThere) {
    Notices::Tell(
        "There is no driver on this machine that reaches its LEDs, so nothing can be tested. To see a test on a "
        "simulated machine, try panelglow-diags-sim.");
    Fail({.recordedCode = CDMUtil::ToString(kDriverMissing), .exceptionCode = kDriverMissing, .messageId = 17});
  }
}

void FrontPanelTest::RequireIcons() {
  const std::string missing = CheckForResourceFiles(
      {"super.ico",    "diags.ico",    "spr_flop.ico", "spr_tape.ico",  "spr_num.ico", "spr_cd.ico",   "spr_dvd.ico",
       "spr_caps.ico", "spr_zip.ico",  "spr_ls.ico",   "spr_scr.ico",   "spr_pd.ico",  "spr_cdrw.ico", "spr_chrg.ico",
       "spr_hdrv.ico", "spr_jaz.ico",  "spr_pcsp.ico", "spr_redh.ico",  "spr_pwr.ico", "spr_net.ico",  "no_led.ico",
       "spr_redp.ico", "spr_wave.ico", "spr_webc.ico", "spr_chrgrd.ico"});
  if (!missing.empty()) {
    Notices::Tell("Icon files are missing (" + missing + "): start the program in the folder of the installation.");
    Fail({.recordedCode = CDMUtil::ToString(kIconsMissing),
          .exceptionCode = kIconsMissing,
          .messageId = kFileMessage,
          .text = missing});
  }
}

std::string FrontPanelTest::CheckForResourceFiles(std::initializer_list<const char*> names) {
  constexpr std::size_t kLongestList = 1023;
  std::string missing;
  for (const char* file : names) {
    if (!CDMUtil::FileExists(file)) {
      missing += (missing.empty() ? "" : ",") + std::string(file);
    }
  }
  return missing.substr(0, kLongestList);
}

bool FrontPanelTest::RunAttempts() {
  bool passed = false;
  for (attemptNumber = 0; !passed && attemptNumber <= retries; ++attemptNumber) {
    RunAttempt(passed);
  }
  return passed ? FinishPassed() : FinishFailed();
}

void FrontPanelTest::RunAttempt(bool& passed) {
  BeforeAttempt();
  attemptStartTick = Now();
  UpdatePercentage(10);
  PrepareRecorded();
  UpdatePercentage(20);
  LogMessage(LogOptions::Status, 57, "");
  BeforeDialog();
  passed = RunSuperLEDTest() && testResult != kTimedOut;
  if (ShouldTestBeTerminated() || IsSignalReceived()) {
    Fail({.attemptNumber = attemptNumber,
          .recordedCode = CDMUtil::ToString(kEndedByRunControl),
          .status = kStatusTerminated,
          .exceptionCode = kEndedByRunControl,
          .messageId = 5});
  }
  PopulateAttemptInformation(attemptNumber, passed ? "0" : failureCode);
}

// What ends the run here, as an entry of a chip that is malformed, leaves its attempt in the log all the same.
void FrontPanelTest::PrepareRecorded() {
  try {
    PrepareAttempt();
  } catch (const CDMException* failure) {
    RecordEnd(failure->code);
    throw;
  } catch (const CDMException& failure) {
    RecordEnd(failure.code);
    throw;
  } catch (const std::exception&) {
    RecordEnd(kStandardException);
    throw;
  } catch (int code) {
    RecordEnd(code);
    throw;
  } catch (const std::string&) {
    RecordEnd(kUnknownException);
    throw;
  }
}

void FrontPanelTest::RecordEnd(int code) {
  PopulateAttemptInformation(attemptNumber, CDMUtil::ToString(code));
  details.status = kStatusFailed;
  WriteLog();
}

bool FrontPanelTest::RunSuperLEDTest() {
  platform::Threads& threads = platform::TheHost().threads;
  timerCounting = false;
  testStarted = false;
  dialogLost = false;
  const platform::ThreadHandle dialog = threads.Start("dialog", [this] { SuperDialog(*this).CreateSuperDialog(); });
  if (dialog == 0) {
    LogMessage(LogOptions::ServiceErrors, 12, "");
    dialogLost = true;
  } else {
    UpdatePercentage(30);
    threads.Wait(dialog, platform::Threads::kNoLimit);
    threads.Close(dialog);
  }
  if (dialogLost) {
    failureCode = CDMUtil::ToString(kNoDialog);
    testResult = kWrongAnswer;
  }
  return testResult > 0;
}

bool FrontPanelTest::FinishPassed() {
  UpdatePercentage(100);
  details.status = kStatusPassed;
  WriteLog();
  LogMessage(LogOptions::Subtests, 3, "");
  return true;
}

bool FrontPanelTest::FinishFailed() {
  LogMessage(LogOptions::ServiceErrors, 4, "");
  ReportFailure(testResult == kTimedOut ? CDMUtil::ToString(kTimedOut) : failureCode);
  details.status = kStatusFailed;
  WriteLog();
  if (dialogLost) {
    throw new CDMException(kNoDialog);  // owned by whoever catches it
  }
  return AfterFailure();
}

// The log is written before the throw, so that it holds the attempt.
void FrontPanelTest::Fail(const Failure& failure) {
  PopulateAttemptInformation(failure.attemptNumber, failure.recordedCode);
  if (failure.setsErrorCode) {
    details.errorcode = failure.recordedCode;
  }
  details.status = failure.status;
  WriteLog();
  auto exception = std::make_unique<CDMException>(failure.exceptionCode);
  exception->addMessage(failure.option, failure.messageId, failure.text);
  throw exception.release();  // owned by whoever catches it
}

void FrontPanelTest::PopulateAttemptInformation(int retriesAttempted, const std::string& errorCode) {
  CDMUtil::PopulateAttemptInformation(retriesAttempted, errorCode, details, attempt, attemptStartTick);
}

void FrontPanelTest::WriteLog() {
  CDMUtil::PopulateSubtestInfoAndWriteLog(dataCollectionFile, kDiagnosticName, details, startTick, xmlCorrupted);
}

}  // namespace panelglow
