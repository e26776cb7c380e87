#include "ledtests/CustomLEDTest.h"

#include "board/MotherBoard.h"
#include "harness/base/CDMException.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/Notices.h"
#include "ledtests/DriveSelection.h"
#include "ledtests/LedKind.h"

namespace panelglow {

namespace {

constexpr unsigned int kPromptStyle = kPromptTopmost;  // one OK button

constexpr const char* kDefaultUiFile = ".\\ui.xml";
constexpr const char* kDefaultUiSchema = ".\\ui.xsd";
constexpr const char* kDefaultButtonFile = ".\\buttondefinition.xml";
constexpr const char* kDefaultButtonSchema = ".\\buttondefinition.xsd";

constexpr const char* kRequiredFileMissing = "990100";

}  // namespace

CDevio g_objDriverObjectCustom{CDevio::LoadLater{}};  // an informational request needs no hardware
std::array<wstring, kMostButtons> CustomLEDTest::_sButtonArr;

CustomLEDTest::CustomLEDTest() : FrontPanelTest(g_objDriverObjectCustom) {
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
  ReadArguments();
  hdOnTime = 500;
  hdOffTime = 500;
  functions.clear();
  BeginRun("CustomLEDTest");
  RequireFiles();
  RequireIcons();
  LogMessage(LogOptions::Subtests, 2, "");
  LoadXmlConfigs();
  UpdatePercentage(5);
  return RunAttempts();
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

void CustomLEDTest::RequireFiles() {
  const auto require = [this](const std::string& path, int messageId, const char* argument) {
    if (CDMUtil::FileExists(path)) {
      return;
    }
    Notices::Tell("The file " + path + " is missing: start the program in the folder of the installation, or name " +
                  "the file with " + argument + ".");
    Fail({.recordedCode = kRequiredFileMissing,
          .setsErrorCode = true,
          .exceptionCode = CDMUtil::ToInt(kRequiredFileMissing),
          .option = LogOptions::ServiceErrors,
          .messageId = messageId,
          .text = path});
  };
  constexpr int kBoardFileMissing = 49;
  constexpr int kFileMissing = 61;
  require(chipIni, kBoardFileMissing, "-ChipIni");
  require(iniFile, kBoardFileMissing, "-INIFile");
  require(uiFile, kFileMissing, "-UIFile");
  require(uiValidationFile, kFileMissing, "-UIValidationFile");
  require(buttonDefinitionFile, kFileMissing, "-ButtonDefinitionFile");
  require(buttonDefinitionValidationFile, kFileMissing, "-ButtonDefinitionValidationFile");
}

// ---- an attempt

void CustomLEDTest::PrepareAttempt() {
  MapButtonFunctionsToTests();
  PrepareDeviceArray();
  InitializeButtonArray();
  MakeDialogRules();
}

bool CustomLEDTest::PrepareDeviceArray() {
  // The order before the shuffle. The row of hdgreen stands for one entry for each controller.
  constexpr ArrayRow kRows[] = {
      {"hdred", nullptr},
      {"hdgreen", nullptr},
      {"scrolllock", nullptr},
      {"capslock", nullptr},
      {"numlock", nullptr},
      {"noled", nullptr},
      {"powerred", &MotherBoard::IsPowerLedRedSupported},
      {"powergreen", nullptr},
      {"network", nullptr},
      {"touchpadlock", nullptr},
      {"speakermute", nullptr},
      {"microphone", nullptr},
      {"webcam", nullptr},
      {"chargered", &MotherBoard::IsChargeLedRedSupported},
      {"chargegreen", nullptr},
  };
  const std::unique_ptr<MotherBoard> board = MakeAnyBoard();
  BeginArray();
  for (const ArrayRow& row : kRows) {
    if (row.function == "hdgreen") {
      if (!hdControllers.empty()) {
        AddDrives(getCntrlListForHDD(hdControllers, massStorageIniFile, false));
      }
    } else if (functions.count(row.function) != 0) {
      AddDevice(row, board.get());
    }
  }
  FinishArray();
  return true;
}

void CustomLEDTest::MakeDialogRules() {
  rules = {};
  for (std::size_t i = 0; i < buttons.size() && i < _sButtonArr.size(); ++i) {
    rules.buttons.push_back({buttons[i].buttonIco, _sButtonArr[i], CDMUtil::ToInt(buttons[i].buttonLParam)});
  }
  for (const LedKind& kind : LedKinds()) {
    rules.answers.push_back({kind.buttonCommand, {kind.deviceId}});
  }
}

void CustomLEDTest::BeforeDialog() {
  const wstring title = CDMUtil::ToWString(subtest);
  if (!autoStart && attemptNumber == 0) {
    PopWindow(beginPromptText, title, kPromptStyle, beginPromptMedia, nullptr, 0);
  }
  if (attemptNumber > 0) {
    PopWindow(retryPromptText, title, kPromptStyle, retryPromptMedia, nullptr, 0);
  }
}

bool CustomLEDTest::AfterFailure() {
  const std::string& code = devices[static_cast<std::size_t>(currentIndex)].errorCode;
  if (!code.empty()) {
    throw new CDMException(CDMUtil::ToInt(code));  // owned by whoever catches it
  }
  return false;
}

}  // namespace panelglow
