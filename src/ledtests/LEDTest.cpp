#include "ledtests/LEDTest.h"

#include "harness/base/CDMException.h"

namespace panelglow {

namespace {

constexpr int kNothingTested = 990471;

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

}  // namespace

LEDTest::LEDTest() {
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

bool LEDTest::Run() {
  UpdatePercentage(0);
  auto failure = std::make_unique<CDMException>(kNothingTested);
  failure->addMessage(LogOptions::ServiceErrors, static_cast<int>(kFreeText),
                      "LEDTest cannot run in this version: nothing was tested. Use CustomLEDTest.");
  throw failure.release();  // owned by whoever catches it
}

}  // namespace panelglow
