#include "boardtool/BoardLed.h"

#include <algorithm>
#include <array>
#include <string>
#include <utility>

namespace panelglow::boardtool {

namespace {

using Board = MotherBoard;

constexpr std::array<BoardLed, 8> kLeds{{
    {"power-green", "power LED, green or white", "powergreen", "test.powerled.chip", "powerled.green",
     &Board::SavePowerLedState, &Board::BlinkPowerLedGreen, &Board::AssertPowerLedGreen, &Board::DeassertPowerLed,
     &Board::RestorePowerLedState},
    {"power-red", "power LED, red or amber", "powerred", "test.powerled.chip", "powerled.red",
     &Board::SavePowerLedState, &Board::BlinkPowerLedRed, &Board::AssertPowerLedRed, &Board::DeassertPowerLed,
     &Board::RestorePowerLedState},
    {"charge-white", "charge LED, white", "chargegreen", "test.chargeled.chip", "chargeled.white",
     &Board::SaveChargeLedState, &Board::BlinkChargeLedWhite, &Board::AssertChargeLedWhite,
     &Board::DeassertChargeLedWhite, &Board::RestoreChargeLedState},
    {"charge-red", "charge LED, red or amber", "chargered", "test.chargeled.chip", "chargeled.red",
     &Board::SaveChargeLedState, &Board::BlinkChargeLedRed, &Board::AssertChargeLedRed, &Board::DeassertChargeLedRed,
     &Board::RestoreChargeLedState},
    {"drive-red", "drive LED, red", "hdred", "test.hdled.chip", "hdled.red", &Board::SaveHdLedState,
     &Board::BlinkHdLedRed, &Board::AssertHdLedRed, &Board::DeassertHdLedRed, &Board::RestoreHdLedState},
    {"wireless", "wireless LED", "network", "test.wirelessled.chip", "wirelessled", &Board::SaveWirelessLedState,
     &Board::BlinkWirelessLed, &Board::AssertWirelessLed, &Board::DeassertWirelessLed,
     &Board::RestoreWirelessLedState},
    {"speaker", "speaker LED", "speakermute", "test.speakerled.chip", "", &Board::SaveSpeakerLedState, nullptr,
     &Board::AssertSpeakerLed, &Board::DeassertSpeakerLed, &Board::RestoreSpeakerLedState},
    {"microphone", "microphone LED", "microphone", "test.microphoneled.chip", "", &Board::SaveSpeakerLedState,
     nullptr, &Board::AssertMicrophoneLed, &Board::DeassertMicrophoneLed, &Board::RestoreSpeakerLedState},
}};

// One key serves the LED that is green on some machines and white on others, or red and amber.
constexpr std::array<std::pair<std::string_view, std::string_view>, 5> kOtherColours{
    {{"power-white", "power-green"},
     {"power-amber", "power-red"},
     {"charge-green", "charge-white"},
     {"charge-amber", "charge-red"},
     {"drive-amber", "drive-red"}}};

}  // namespace

std::span<const BoardLed> BoardLeds() { return kLeds; }

const BoardLed* FindBoardLed(std::string_view id) {
  const auto other =
      std::find_if(kOtherColours.begin(), kOtherColours.end(), [&](const auto& pair) { return pair.first == id; });
  id = other == kOtherColours.end() ? id : other->second;
  const auto found = std::find_if(kLeds.begin(), kLeds.end(), [&](const BoardLed& led) { return led.id == id; });
  return found == kLeds.end() ? nullptr : &*found;
}

std::string BoardLedNames() {
  std::string names;
  for (const BoardLed& led : kLeds) {
    names += (names.empty() ? "" : ", ") + std::string(led.id);
  }
  return names;
}

}  // namespace panelglow::boardtool
