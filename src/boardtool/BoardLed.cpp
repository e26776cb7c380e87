#include "boardtool/BoardLed.h"

#include <algorithm>
#include <array>
#include <string>

namespace panelglow::boardtool {

namespace {

using Board = MotherBoard;

constexpr std::array<BoardLed, 8> kLeds{{
    {"power-green", "power LED, green or white", "powergreen", "test.powerled.chip", &Board::SavePowerLedState,
     &Board::BlinkPowerLedGreen, &Board::AssertPowerLedGreen, &Board::DeassertPowerLed, &Board::RestorePowerLedState},
    {"power-red", "power LED, red or amber", "powerred", "test.powerled.chip", &Board::SavePowerLedState,
     &Board::BlinkPowerLedRed, &Board::AssertPowerLedRed, &Board::DeassertPowerLed, &Board::RestorePowerLedState},
    {"charge-white", "charge LED, white", "chargegreen", "test.chargeled.chip", &Board::SaveChargeLedState,
     &Board::BlinkChargeLedWhite, &Board::AssertChargeLedWhite, &Board::DeassertChargeLedWhite,
     &Board::RestoreChargeLedState},
    {"charge-red", "charge LED, red or amber", "chargered", "test.chargeled.chip", &Board::SaveChargeLedState,
     &Board::BlinkChargeLedRed, &Board::AssertChargeLedRed, &Board::DeassertChargeLedRed,
     &Board::RestoreChargeLedState},
    {"drive-red", "drive LED, red", "hdred", "test.hdled.chip", &Board::SaveHdLedState, &Board::BlinkHdLedRed,
     &Board::AssertHdLedRed, &Board::DeassertHdLedRed, &Board::RestoreHdLedState},
    {"wireless", "wireless LED", "network", "test.wirelessled.chip", &Board::SaveWirelessLedState,
     &Board::BlinkWirelessLed, &Board::AssertWirelessLed, &Board::DeassertWirelessLed,
     &Board::RestoreWirelessLedState},
    {"speaker", "speaker LED", "speakermute", "test.speakerled.chip", &Board::SaveSpeakerLedState, nullptr,
     &Board::AssertSpeakerLed, &Board::DeassertSpeakerLed, &Board::RestoreSpeakerLedState},
    {"microphone", "microphone LED", "microphone", "test.microphoneled.chip", &Board::SaveSpeakerLedState, nullptr,
     &Board::AssertMicrophoneLed, &Board::DeassertMicrophoneLed, &Board::RestoreSpeakerLedState},
}};

}  // namespace

std::span<const BoardLed> BoardLeds() { return kLeds; }

const BoardLed* FindBoardLed(std::string_view id) {
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
