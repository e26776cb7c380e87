#include "ledtests/LEDTest.h"

#include <algorithm>

#include "board/MotherBoard.h"
#include "board/base/IniReader.h"
#include "harness/base/CDMException.h"
#include "harness/base/CDMUtil.h"
#include "hw/SetupDI.h"
#include "ledtests/DriveSelection.h"
#include "ledtests/LedKind.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr int kNothingSelected = 990471;
constexpr int kNothingSelectedMessage = 16;
constexpr unsigned int kPromptStyle = kPromptTopmost;  // one OK button

struct Declaration {
  const char* name;
  CDMArgumentType type;
  const char* defaultValue;
  const char* description;
};

constexpr CDMArgumentType kInteger = CDMArgumentType::Integer;
constexpr CDMArgumentType kString = CDMArgumentType::String;
constexpr CDMArgumentType kBoolean = CDMArgumentType::Boolean;

// Arguments without a constraint, behind the first two.
constexpr Declaration kDeclarations[] = {
    {"-HDLEDOnTime", kInteger, "500",
     "Duration for HDD LED to be in\t\t\t\t\t\t\t\t\t\t\t\t\t\t\t\"ON\" state in miliseconds"},
    {"-HDLEDOffTime", kInteger, "500", "Duration for HDD LED to be in\"OFF\" state in miliseconds"},
    {"-INIFile", kString, ".\\mbdetect.ini", "INI file path"},
    {"-TestIni", kString, ".\\mbtest.ini", "test settings .ini file name"},
    {"-ChipIni", kString, ".\\chip.ini", "chip.ini file name"},
    {"-MassStorageIniFile", kString, ".\\msctrl.ini", "Mass storage controllers."},
    {"-OperatorCheating", kBoolean, "true", "if true, then LED Blink Sequence is random"},
    {"-MultiColorPowerLED", kBoolean, "false", "Test multicolor power LED"},
    {"-FloppyDrv", kBoolean, "false", "Test Floppy drive LED"},
    {"-CapsLock", kBoolean, "false", "Test CAPS Lock LED"},
    {"-ScrollLock", kBoolean, "false", "Test Scroll Lock LED"},
    {"-NumLock", kBoolean, "false", "Test Num Lock LED"},
    {"-NoLED", kBoolean, "false", "No LED will be tested"},
    {"-IDEHardDrive", kBoolean, "false", "Test IDE Hdd LED"},
    {"-SCSIHardDrive", kBoolean, "false", "Test SCSI HDD LED"},
    {"-HDDOnControllers", kString, "", "Test HDD LED on a controller"},
    {"-MultiColorHDLED", kBoolean, "false", "Test multicolor HDD LED"},
    {"-NetworkLED", kBoolean, "false", "Test network/wireless LED"},
    {"-WebcamLED", kBoolean, "false", "Test Webcam LED"},
    {"-MultiColorChargeLED", kBoolean, "false", "Test multicolor Charging LED"},
    {"-AcknowledgeRetry", kBoolean, "false", "Acknowledge retry"},
};

// The buttons in grid order: their command ids rise from the first, as do the message numbers of their captions.
constexpr int kFirstButton = 1001;
constexpr int kFirstCaption = 26;

struct Button {
  const char16_t* caption;  // when the message file has none
  const char* icon;
};
constexpr std::array<Button, LEDTest::kButtons> kButtonTable{{
    {u"&FLOPPY", "spr_flop.ico"},     {u"&TAPE Drive", "spr_tape.ico"}, {u"N&um Lock", "spr_num.ico"},
    {u"&CDROM", "spr_cd.ico"},        {u"D&VD", "spr_dvd.ico"},         {u"C&aps Lock", "spr_caps.ico"},
    {u"&Zip Drive", "spr_zip.ico"},   {u"&LS120", "spr_ls.ico"},        {u"ScrollLoc&k", "spr_scr.ico"},
    {u"P&D-CDROM", "spr_pd.ico"},     {u"CD&RW", "spr_cdrw.ico"},       {u"Char&ge Green", "spr_chrg.ico"},
    {u"&Hard Drive", "spr_hdrv.ico"}, {u"&Jaz", "spr_jaz.ico"},         {u"Charge Red", "spr_chrgrd.ico"},
    {u"HDR&ed", "spr_redh.ico"},      {u"&PowerGreen", "spr_pwr.ico"},  {u"&Network", "spr_net.ico"},
    {u"No Bl&ink", "no_led.ico"},     {u"P&ower Red", "spr_redp.ico"},  {u"Wave", "spr_wave.ico"},
    {u"Co&mbo", "spr_cdrw.ico"},      {u"DVD&RW", "spr_dvd.ico"},       {u"&Webcam", "spr_webc.ico"},
}};

// Captions that a board may name otherwise.
struct BoardCaption {
  int button;
  const char* key;
  int message;  // without the key
};
constexpr BoardCaption kBoardCaptions[] = {{1017, "test.powerled.color.1.msgid", 42},
                                           {1020, "test.powerled.color.2.msgid", 45},
                                           {1018, "test.panelglow.network.1.msgid", 43}};

// Which parameter selects which LEDs.
struct Selection {
  const char* argument;
  std::initializer_list<const char*> functions;
};
const Selection kSelections[] = {{"-MultiColorHDLED", {"hdred"}},
                                 {"-IDEHardDrive", {"ide"}},
                                 {"-SCSIHardDrive", {"scsi"}},
                                 {"-ScrollLock", {"scrolllock"}},
                                 {"-CapsLock", {"capslock"}},
                                 {"-NumLock", {"numlock"}},
                                 {"-FloppyDrv", {"floppy"}},
                                 {"-NoLED", {"noled"}},
                                 {"-MultiColorPowerLED", {"powerred", "powergreen"}},
                                 {"-NetworkLED", {"network"}},
                                 {"-WebCamLed", {"webcam"}},
                                 {"-MultiColorChargeLED", {"chargered", "chargegreen"}}};

// A drive of floppy disks is there when the tree has a device of its enumerator.
bool HasFloppyDrive() {
  SetupDI list;
  return list.OpenDeviceList("FDC", platform::kPresentDevices | platform::kAllDeviceClasses, "") && list.NextDevice();
}

bool IsPresent(std::string_view function) {
  if (function == "ide" || function == "scsi") {
    return !FindDrivePath(function).empty();
  }
  return function != "floppy" || HasFloppyDrive();
}

}  // namespace

CDevio g_objDriverObject{CDevio::LoadLater{}};  // an informational request needs no hardware
std::array<wstring, LEDTest::kButtons> LEDTest::_sButtonArr;

LEDTest::LEDTest() : FrontPanelTest(g_objDriverObject) {
  SetDescription("This test allows the user to simultaneously test all the LEDs on the frontpanel.");
  DeclareArgument("-Retries", kInteger, "1", "Number of retries if test fails.", false,
                  std::make_unique<CDMConstraint>(0, 10), false, false);
  DeclareArgument("-LEDTimeout", kInteger, "30", "Blink time duration for each LED in seconds", false,
                  std::make_unique<CDMConstraint>(10, 60), false, false);
  for (const Declaration& declaration : kDeclarations) {
    DeclareArgument(declaration.name, declaration.type, declaration.defaultValue, declaration.description, false,
                    nullptr, false, false);
  }
  DeclareArgument("-RetryPrompt", kInteger, "260", "The message number for the acknowledge retry window prompt",
                  false, nullptr, false, true);
}

LEDTest::~LEDTest() = default;

bool LEDTest::Run() {
  UpdatePercentage(0);
  ReadArguments();
  BeginRun("LEDTest");
  RequireIcons();
  LogMessage(LogOptions::Subtests, 2, "");
  CheckSelection();
  UpdatePercentage(5);
  return RunAttempts();
}

void LEDTest::ReadArguments() {
  retries = GetArgument("-Retries", 1);
  ledTimeout = GetArgument("-LEDTimeout", 30);
  hdOnTime = std::max(GetArgument("-HDLEDOnTime", 500), 0);
  hdOffTime = std::max(GetArgument("-HDLEDOffTime", 500), 0);
  iniFile = GetArgument("-INIFile", "");
  testIni = GetArgument("-TestIni", "");
  chipIni = GetArgument("-ChipIni", "");
  massStorageIniFile = GetArgument("-MassStorageIniFile", "");
  operatorCheating = GetArgument("-OperatorCheating", true);
  hdControllers = GetArgument("-HDDOnControllers", "");
  acknowledgeRetry = GetArgument("-AcknowledgeRetry", false);
  retryPrompt = GetArgument("-RetryPrompt", 260);
  selected.clear();
  for (const Selection& selection : kSelections) {
    if (GetArgument(selection.argument, false)) {
      selected.insert(selection.functions.begin(), selection.functions.end());
    }
  }
}

// That no LED blinks is no LED to test.
void LEDTest::CheckSelection() const {
  const bool isOnlyNoLed = selected.size() == 1 && selected.count("noled") == 1;
  if ((selected.empty() || isOnlyNoLed) && hdControllers.empty()) {
    auto failure = std::make_unique<CDMException>(kNothingSelected);
    failure->addMessage(LogOptions::DeviceErrors, kNothingSelectedMessage, "");
    throw failure.release();  // owned by whoever catches it
  }
}

// ---- an attempt

void LEDTest::BeforeAttempt() {
  if (acknowledgeRetry && attemptNumber > 0) {
    PopWindow(GetResourceString(retryPrompt, u""), std::string(), kPromptStyle);
  }
}

void LEDTest::PrepareAttempt() {
  const std::unique_ptr<MotherBoard> board = MakeAnyBoard();
  PrepareDeviceArray(board.get());
  InitializeButtonArray(board != nullptr);
  MakeDialogRules();
}

void LEDTest::PrepareDeviceArray(MotherBoard* board) {
  // The order before the shuffle. The row of hdgreen stands for one entry for each controller.
  constexpr ArrayRow kRows[] = {
      {"hdred", nullptr},       {"ide", nullptr},
      {"scsi", nullptr},        {"hdgreen", nullptr},
      {"scrolllock", nullptr},  {"capslock", nullptr},
      {"numlock", nullptr},     {"floppy", nullptr},
      {"noled", nullptr},       {"powerred", &MotherBoard::IsPowerLedRedSupported},
      {"powergreen", nullptr},  {"network", nullptr},
      {"webcam", nullptr},      {"chargered", &MotherBoard::IsChargeLedRedSupported},
      {"chargegreen", nullptr},
  };
  BeginArray();
  for (const ArrayRow& row : kRows) {
    if (row.function == "hdgreen") {
      if (!hdControllers.empty()) {
        AddDrives(getCntrlListForHDD(hdControllers, massStorageIniFile, true));
      }
    } else if (selected.count(row.function) != 0 && IsPresent(row.function)) {
      AddDevice(row, board);
    }
  }
  FinishArray();
}

// A message that has no text comes as its number, a blank and two quotation marks.
void LEDTest::InitializeButtonArray(bool hasBoard) {
  for (std::size_t i = 0; i < kButtons; ++i) {
    const int standard = kFirstCaption + static_cast<int>(i);
    int message = standard;
    for (const BoardCaption& caption : kBoardCaptions) {
      if (hasBoard && caption.button == kFirstButton + static_cast<int>(i)) {
        message = ReadIniInt(caption.key, caption.message);
      }
    }
    const bool hasText =
        GetResourceString(standard, u"") != CDMUtil::ToWString(CDMUtil::ToString(standard) + " \"\"");
    _sButtonArr[i] = hasText ? GetResourceString(message, u"") : wstring(kButtonTable[i].caption);
  }
}

void LEDTest::MakeDialogRules() {
  rules = {};
  rules.startsByItself = false;
  rules.writesLines = false;
  rules.waitsForUnstarted = true;
  for (std::size_t i = 0; i < kButtons; ++i) {
    const int command = kFirstButton + static_cast<int>(i);
    rules.buttons.push_back({kButtonTable[i].icon, _sButtonArr[i], command});
    ButtonAnswer& answer = rules.answers.emplace_back();
    answer.button = static_cast<std::uint32_t>(command);
    for (const LedKind& kind : AllLedKinds()) {
      if (kind.buttonCommand == answer.button) {
        answer.kinds.push_back(kind.deviceId);
      }
    }
  }
}

}  // namespace panelglow
