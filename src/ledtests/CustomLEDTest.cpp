#include "ledtests/CustomLEDTest.h"

#include "harness/base/CDMException.h"
#include "harness/base/CDMUtil.h"
#include "hw/Tsk.h"
#include "ledtests/SuperDialog.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr const char* kDiagnosticName = "panelglow-diags";
constexpr unsigned int kPromptStyle = kPromptTopmost;  // one OK button

// Status in the data-collection log.
constexpr const char* kStatusPassed = "1";
constexpr const char* kStatusFailed = "0";
constexpr const char* kStatusTerminated = "-1";

constexpr const char* kDefaultUiFile = ".\\ui.xml";
constexpr const char* kDefaultUiSchema = ".\\ui.xsd";
constexpr const char* kDefaultButtonFile = ".\\buttondefinition.xml";
constexpr const char* kDefaultButtonSchema = ".\\buttondefinition.xsd";

std::uint32_t Now() { return platform::TheHost().clock.TickCount(); }

}  // namespace

CustomLEDTest* g_pSuperPtrCustom = nullptr;
CDevio g_objDriverObjectCustom;
std::array<wstring, kMostButtons> CustomLEDTest::_sButtonArr;

CustomLEDTest::CustomLEDTest()
    : systemId([] {
        std::uint16_t id = 0;
        Tsk_GetSystemID(id);
        return id;
      }()),
      legacyPorts(g_objDriverObjectCustom, systemId),
      startTick(Now()) {
  SetDescription("This test allows the user to simultaneously test all the LEDs on the frontpanel.");
  DeclareArguments();
}

CustomLEDTest::~CustomLEDTest() = default;

void CustomLEDTest::DeclareArguments() {
  const auto range = [](int low, int high) { return std::make_unique<CDMConstraint>(low, high); };
  const auto atLeast = [](int low) {
    return std::make_unique<CDMConstraint>(low, CDMConstraintType::EqualToOrGreaterThan);
  };
  const auto declare = [this](const char* argument, CDMArgumentType type, const char* defaultValue, const char* text,
                              std::unique_ptr<CDMConstraint> constraint) {
    DeclareArgument(argument, type, defaultValue, text, false, std::move(constraint), false, false);
  };
  using Type = CDMArgumentType;
  declare("-Retries", Type::Integer, "1", "Number of retries if test fails.", range(0, 10));
  declare("-LEDTimeout", Type::Integer, "30", "Blink time duration for each LED in seconds", range(10, 60));
  declare("-INIFile", Type::String, ".\\mbdetect.ini", "INI file path", nullptr);
  declare("-TestIni", Type::String, ".\\mbtest.ini", "test settings .ini file name", nullptr);
  declare("-ChipIni", Type::String, ".\\chip.ini", "chip.ini file name", nullptr);
  declare("-MassStorageIniFile", Type::String, ".\\msctrl.ini", "Mass storage controllers.", nullptr);
  declare("-OperatorCheating", Type::Boolean, "true", "if true, then LED Blink Sequence is random", nullptr);
  declare("-UIFile", Type::String, kDefaultUiFile, "UI.xml file name and path", nullptr);
  declare("-UIValidationFile", Type::String, kDefaultUiSchema, "ui.xsd file name and path", nullptr);
  declare("-ButtonDefinitionFile", Type::String, kDefaultButtonFile, "ButtonDefinition.xml file name and path",
          nullptr);
  declare("-ButtonDefinitionValidationFile", Type::String, kDefaultButtonSchema,
          "ButtonDefinition.xsd file name and path", nullptr);
  declare("-SectionID", Type::String, "Default", "SectionID in UIFile to use for LED test", nullptr);
  declare("-AutoStart", Type::Boolean, "false", "if true, test will start automatically after confirming pop-prompt",
          nullptr);
  declare("-BeginPrompt", Type::Integer, "24",
          "This is customized message number from\n\tmessage file for BeginPrompt.", atLeast(0));
  declare("-RetryPrompt", Type::Integer, "24",
          "This is customized message number from\n\tmessage file for RetryPrompt.", atLeast(0));
}

bool CustomLEDTest::Run() {
  UpdatePercentage(0);
  g_pSuperPtrCustom = this;
  ReadArguments();
  hdOnTime = 500;
  hdOffTime = 500;
  functions.clear();
  xmlCorrupted = false;
  bool passed = false;
  UpdatePercentage(1);
  details.name = "CustomLEDTest";
  details.retriesspecified = CDMUtil::ToString(retries);
  details.errorcode = "0";
  xmlCorrupted = CDMUtil::isXMLCorrupted(dataCollectionFile);
  CheckPrerequisites();
  LogMessage(LogOptions::Subtests, 2, "");
  LoadXmlConfigs();
  UpdatePercentage(5);
  for (attemptNumber = 0; !passed && attemptNumber <= retries; ++attemptNumber) {
    RunAttempt(passed);
  }
  return passed ? FinishPassed() : FinishFailed();
}

void CustomLEDTest::ReadArguments() {
  retries = GetArgument("-Retries", 1);
  ledTimeout = GetArgument("-LEDTimeout", 30);
  operatorCheating = GetArgument("-OperatorCheating", true);
  iniFile = GetArgument("-INIFile", "");
  testIni = GetArgument("-TestIni", "");
  chipIni = GetArgument("-ChipIni", "");
  massStorageIniFile = GetArgument("-MassStorageIniFile", "");
  uiFile = GetArgument("-UIFile", "");
  uiValidationFile = GetArgument("-UIValidationFile", "");
  buttonDefinitionFile = GetArgument("-ButtonDefinitionFile", "");
  buttonDefinitionValidationFile = GetArgument("-ButtonDefinitionValidationFile", "");
  sectionId = GetArgument("-SectionID", "");
  autoStart = GetArgument("-AutoStart", false);
  const int beginPrompt = GetArgument("-BeginPrompt", 24);
  const int retryPrompt = GetArgument("-RetryPrompt", 24);
  const auto noteDefault = [this](const std::string& value, const char* defaultValue, const char* text) {
    if (value == defaultValue) {
      LogMessage(LogOptions::Status, kFreeText, text);
    }
  };
  noteDefault(uiFile, kDefaultUiFile, "Using default UI.xml file");
  noteDefault(uiValidationFile, kDefaultUiSchema, "Using default UI.xsd xml validation file");
  noteDefault(buttonDefinitionFile, kDefaultButtonFile, "Using default buttondefinition.xml file");
  noteDefault(buttonDefinitionValidationFile, kDefaultButtonSchema,
              "Using default buttondefinition.xsd xml validation file");
  beginPromptText =
      GetResourceString(beginPrompt, u"", CDMUtil::ToWString(CDMUtil::ToString(beginPrompt)), beginPromptMedia);
  retryPromptText =
      GetResourceString(retryPrompt, u"", CDMUtil::ToWString(CDMUtil::ToString(retryPrompt)), retryPromptMedia);
}

// The driver and the files that a run cannot do without.
void CustomLEDTest::CheckPrerequisites() {
  if (!g_objDriverObjectCustom.IsDriverLoaded()) {
    Fail({.recordedCode = "20472", .exceptionCode = 20472, .messageId = 17});
  }
  const auto require = [this](const std::string& path, int messageId) {
    if (!CDMUtil::FileExists(path)) {
      Fail({.recordedCode = "990100",
            .setsErrorCode = true,
            .exceptionCode = 990100,
            .option = LogOptions::ServiceErrors,
            .messageId = messageId,
            .text = path});
    }
  };
  constexpr int kBoardFileMissing = 49;
  constexpr int kFileMissing = 61;
  require(chipIni, kBoardFileMissing);
  require(iniFile, kBoardFileMissing);
  require(uiFile, kFileMissing);
  require(uiValidationFile, kFileMissing);
  require(buttonDefinitionFile, kFileMissing);
  require(buttonDefinitionValidationFile, kFileMissing);
  const std::string missing = CheckForResourceFiles(
      {"super.ico",    "diags.ico",    "spr_flop.ico", "spr_tape.ico",  "spr_num.ico", "spr_cd.ico",   "spr_dvd.ico",
       "spr_caps.ico", "spr_zip.ico",  "spr_ls.ico",   "spr_scr.ico",   "spr_pd.ico",  "spr_cdrw.ico", "spr_chrg.ico",
       "spr_hdrv.ico", "spr_jaz.ico",  "spr_pcsp.ico", "spr_redh.ico",  "spr_pwr.ico", "spr_net.ico",  "no_led.ico",
       "spr_redp.ico", "spr_wave.ico", "spr_webc.ico", "spr_chrgrd.ico"});
  if (!missing.empty()) {
    Fail({.recordedCode = "990618", .exceptionCode = 990618, .messageId = kFileMissing, .text = missing});
  }
}

std::string CustomLEDTest::CheckForResourceFiles(std::initializer_list<const char*> names) {
  constexpr std::size_t kLongestList = 1023;
  std::string missing;
  for (const char* file : names) {
    if (!CDMUtil::FileExists(file)) {
      missing += (missing.empty() ? "" : ",") + std::string(file);
    }
  }
  return missing.substr(0, kLongestList);
}

void CustomLEDTest::RunAttempt(bool& passed) {
  attemptStartTick = Now();
  UpdatePercentage(10);
  MapButtonFunctionsToTests();
  PrepareDeviceArray();
  InitializeButtonArray();
  UpdatePercentage(20);
  LogMessage(LogOptions::Status, 57, "");
  const wstring title = CDMUtil::ToWString(subtest);
  if (!autoStart && attemptNumber == 0) {
    PopWindow(beginPromptText, title, kPromptStyle, beginPromptMedia, nullptr, 0);
  }
  if (attemptNumber > 0) {
    PopWindow(retryPromptText, title, kPromptStyle, retryPromptMedia, nullptr, 0);
  }
  passed = RunSuperLEDTest() && testResult != kTimedOut;
  if (ShouldTestBeTerminated() || IsSignalReceived()) {
    Fail({.attemptNumber = attemptNumber,
          .recordedCode = "995000",
          .status = kStatusTerminated,
          .exceptionCode = 995000,
          .messageId = 5});
  }
  PopulateAttemptInformation(attemptNumber, passed ? "0" : failureCode);
}

bool CustomLEDTest::RunSuperLEDTest() {
  platform::Threads& threads = platform::TheHost().threads;
  timerCounting = false;
  testStarted = false;
  const platform::ThreadHandle dialog = threads.Start("dialog", [this] { SuperDialog(*this).CreateSuperDialog(); });
  if (dialog == 0) {
    LogMessage(LogOptions::ServiceErrors, 12, "");
    return false;
  }
  UpdatePercentage(30);
  threads.Wait(dialog, platform::Threads::kNoLimit);
  threads.Close(dialog);
  return testResult > 0;
}

bool CustomLEDTest::FinishPassed() {
  UpdatePercentage(100);
  details.status = kStatusPassed;
  WriteLog();
  LogMessage(LogOptions::Subtests, 3, "");
  return true;
}

bool CustomLEDTest::FinishFailed() {
  LogMessage(LogOptions::ServiceErrors, 4, "");
  ReportFailure(testResult == kTimedOut ? CDMUtil::ToString(kTimedOut) : failureCode);
  details.status = kStatusFailed;
  WriteLog();
  // Without a dialog no LED has had its turn, and none is to blame.
  const std::string& code = devices[static_cast<std::size_t>(currentIndex)].errorCode;
  if (testStarted && !code.empty()) {
    throw new CDMException(CDMUtil::ToInt(code));  // owned by whoever catches it
  }
  return false;
}

// The log is written before the throw, so that it holds the attempt.
void CustomLEDTest::Fail(const Failure& failure) {
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

void CustomLEDTest::PopulateAttemptInformation(int retriesAttempted, const std::string& errorCode) {
  CDMUtil::PopulateAttemptInformation(retriesAttempted, errorCode, details, attempt, attemptStartTick);
}

void CustomLEDTest::WriteLog() {
  CDMUtil::PopulateSubtestInfoAndWriteLog(dataCollectionFile, kDiagnosticName, details, startTick, xmlCorrupted);
}

}  // namespace panelglow
