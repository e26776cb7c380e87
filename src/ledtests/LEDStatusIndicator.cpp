#include "ledtests/LEDStatusIndicator.h"

#include "board/MotherBoard.h"
#include "harness/base/CDMException.h"
#include "harness/base/Notices.h"
#include "ledtests/PutBack.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr int kNoBoard = 990431;
constexpr const char* kBlinkTypes = "RedPower,GreenPower,HardDrive,RedPower|HardDrive,GreenPower|HardDrive";
constexpr std::time_t kSecondsPerMinute = 60;

using BoardCall = bool (MotherBoard::*)();

}  // namespace

LEDStatusIndicator::LEDStatusIndicator() {
  SetDescription("This test allows the user to simultaneously test all the LEDs on the frontpanel.");
  const auto declare = [this](const char* argument, CDMArgumentType type, const char* defaultValue, const char* text,
                              std::unique_ptr<CDMConstraint> constraint) {
    DeclareArgument(argument, type, defaultValue, text, false, std::move(constraint), false, false);
  };
  declare("-BlinkTime", CDMArgumentType::Integer, "0",
          "The amount of time, in min, to blink the LED. If 0, then blink indefinately.",
          std::make_unique<CDMConstraint>(0, 1440));
  declare("-BlinkType", CDMArgumentType::String, "GreenPower", "The type of blink to show",
          std::make_unique<CDMConstraint>(std::string(kBlinkTypes)));
  declare("-BlinkSpeed", CDMArgumentType::Integer, "500",
          "the amount of time, in milliseconds, to wait between toggling the LED. Lower numbers mean the LED blinks "
          "faster.",
          std::make_unique<CDMConstraint>(1, 5000));
  declare("-INIFile", CDMArgumentType::String, ".\\mbdetect.ini", "INI file path", nullptr);
  declare("-TestIni", CDMArgumentType::String, ".\\mbtest.ini", "test settings .ini file name", nullptr);
  declare("-ChipIni", CDMArgumentType::String, ".\\chip.ini", "chip.ini file name", nullptr);
}

bool LEDStatusIndicator::Run() {
  platform::Clock& clock = platform::TheHost().clock;
  const int blinkTime_min = GetArgument("-BlinkTime", 0);
  const std::string blinkType = GetArgument("-BlinkType", "Green");
  const auto blinkSpeed_ms = static_cast<std::uint32_t>(GetArgument("-BlinkSpeed", 500));
  UpdatePercentage(1);
  // A type without a power colour blinks nothing, and leaves the lamp as it is: the steps around it stay the same.
  BoardCall assertLed = nullptr;
  if (blinkType.find("GreenPower") != std::string::npos) {
    assertLed = &MotherBoard::AssertPowerLedGreen;
  }
  if (blinkType.find("RedPower") != std::string::npos) {
    assertLed = &MotherBoard::AssertPowerLedRed;
  }
  if (assertLed == nullptr) {
    Notices::Tell("-BlinkType=" + blinkType +
                  " names neither GreenPower nor RedPower in this very spelling: no LED is "
                  "blinked.");
  }
  std::unique_ptr<MotherBoard> board = MotherBoard::Instantiate(
      GetArgument("-INIFile", ""), GetArgument("-TestIni", ""), GetArgument("-ChipIni", ""), "platform", "");
  if (!board) {
    auto failure = std::make_unique<CDMException>(kNoBoard);
    failure->addMessage(LogOptions::DeviceErrors, static_cast<int>(kFreeText),
                        "This machine's board is not known: the file " + GetArgument("-INIFile", "") +
                            " needs a section for it with the keys \"platform\" and \"chips\"; one that has only a "
                            "\"MotherboardClass\" serves the tests, and not the signal lamp.");
    throw failure.release();  // owned by whoever catches it
  }
  {
    const PutBack restore([&] { board->RestorePowerLedState(); });
    board->SavePowerLedState();
    const std::time_t begin = clock.WallTime();
    const std::time_t duration_s = blinkTime_min * kSecondsPerMinute;
    while ((blinkTime_min == 0 || clock.WallTime() - begin < duration_s) && !ShouldTestBeTerminated() &&
           !IsSignalReceived()) {
      if (assertLed != nullptr) {
        (board.get()->*assertLed)();
      }
      clock.Sleep(blinkSpeed_ms);
      if (assertLed != nullptr) {
        board->DeassertPowerLed();
      }
      clock.Sleep(blinkSpeed_ms);
    }
  }
  board.reset();
  UpdatePercentage(100);
  return true;
}

}  // namespace panelglow
