#include "board/MotherBoard.h"

#include <algorithm>
#include <array>
#include <vector>

#include "board/base/IniReader.h"
#include "board/base/mblib_exception.h"
#include "board/chips/NoneChip.h"
#include "harness/base/CDMException.h"
#include "harness/base/CDMUtil.h"
#include "hw/SMBIOSDiscovery.h"
#include "hw/Tsk.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr const char* kBoardMutex = "_HalcyonMotherBoardLib";
constexpr int kChipFileMissing = 990431;
constexpr int kChipFileMissingMessage = 70;
constexpr const char* kNotFound = "was_not_found";
constexpr const char* kUndef = "undef";

// System ids whose boards are served by the older path unless the INI data names a class.
constexpr std::array<std::string_view, 21> kOlderBoards{"A08",  "0A08", "A58",  "0A58", "AA8",  "0AA8", "A9C",
                                                        "0A9C", "A98",  "0A98", "2820", "3029", "A80",  "0A80",
                                                        "AA0",  "0AA0", "A1C",  "0A1C", "2821", "AC8",  "0AC8"};

bool IsOlderBoard(std::string_view systemId) {
  return std::find(kOlderBoards.begin(), kOlderBoards.end(), systemId) != kOlderBoards.end();
}

using BoardFactory = std::unique_ptr<MotherBoard> (*)(const std::string& systemId);

struct BoardRow {
  std::string_view name;
  BoardFactory make;  // null: a class still to be written, answered like an unknown one
};

std::unique_ptr<MotherBoard> MakeGeneric(const std::string& systemId) {
  return std::make_unique<MotherBoard>(systemId);
}

constexpr std::array<BoardRow, 6> kBoardClasses{{{"generic", MakeGeneric},
                                                 {"ich_win", nullptr},
                                                 {"sb7sch5", nullptr},
                                                 {"cbb", nullptr},
                                                 {"mistral", nullptr},
                                                 {"cobble", nullptr}}};

// The class that the INI data names; empty when it names none of this path.
std::string SelectClass(const std::string& classKey, const std::string& systemId) {
  std::string name = CDMUtil::ToLower(ReadIniValue(classKey, ""));
  if (!name.empty()) {
    return name;
  }
  if (ReadIniValue("MotherboardClass", kNotFound) != kNotFound || IsOlderBoard(systemId) ||
      ReadIniValue("chips", kNotFound) == kNotFound) {
    return {};
  }
  return "generic";
}

}  // namespace

std::unique_ptr<MotherBoard> MotherBoard::Instantiate(const std::string& detectIniPath,
                                                      const std::string& testIniPath, const std::string& chipIniPath,
                                                      const std::string& classKey,
                                                      const std::string& systemIdOverride) {
  if (!CDMUtil::FileExists(chipIniPath)) {
    CDMException missing(kChipFileMissing);
    missing.addMessage(LogOptions::DeviceErrors, kChipFileMissingMessage, chipIniPath);
    throw missing;
  }
  const std::string systemId = SMBIOSDiscovery::Instance().GetProductText();
  IniReader::Instance(systemIdOverride.empty() ? systemId : systemIdOverride, detectIniPath, testIniPath,
                      chipIniPath);
  const std::string wanted = SelectClass(classKey, systemId);
  const auto found = std::find_if(kBoardClasses.begin(), kBoardClasses.end(),
                                  [&](const BoardRow& row) { return row.name == wanted; });
  return found == kBoardClasses.end() || found->make == nullptr ? nullptr : found->make(systemId);
}

std::unique_ptr<MotherBoard> MotherBoard::Instance(const std::string& detectIniPath) {
  constexpr std::size_t kValueBuffer = 1024;
  std::uint16_t id = 0;
  Tsk_GetSystemID(id);
  const std::string section = CDMUtil::ToUpper(CDMUtil::ToHexString(id));
  std::string name(kValueBuffer, '\0');
  name.resize(platform::TheHost().profiles.GetValue(section, "MotherboardClass", "", name, detectIniPath));
  // "Lantern" and "Orchard" are still to be written: a board that names one is answered like an unknown one.
  return nullptr;
}

MotherBoard::MotherBoard(const std::string& systemIdText)
    : lock(platform::TheHost().mutexes, kBoardMutex), systemId(SystemIdOf(systemIdText)), className("generic") {
  const std::string list = CDMUtil::ToLower(ReadIniValue("chips", ""));
  chips[kPlainChipPlace - 1] = std::make_unique<Chip>();
  if (list.empty()) {
    BuildAllChips();
  } else {
    BuildListedChips(list);
  }
}

void MotherBoard::BuildListedChips(const std::string& list) {
  std::vector<std::string> names;
  CDMUtil::Split(list, names, ", ");
  for (const bool genericFamilies : {false, true}) {  // these two come last
    for (const ChipRow& row : ChipRows()) {
      const bool isGeneric = row.place == kGenericSuperIoPlace || row.place == kGenericEcPlace;
      const bool listed = std::find(names.begin(), names.end(), row.name) != names.end();
      std::unique_ptr<Chip>& chip = chips[row.place - 1];
      if (isGeneric == genericFamilies && listed && !chip && row.make != nullptr) {
        chip = row.make();
      }
    }
  }
  for (const std::size_t place : {kGenericSuperIoPlace, kGenericEcPlace}) {
    InitializeGeneric(place);
  }
  for (std::unique_ptr<Chip>& chip : chips) {
    if (!chip) {
      chip = std::make_unique<NoneChip>();
    }
  }
}

// The generic super-I/O and embedded controller need the chip file and have a second stage of construction.
void MotherBoard::InitializeGeneric(std::size_t place) {
  const std::unique_ptr<Chip>& chip = chips[place - 1];
  if (!chip) {
    return;
  }
  IniReader& reader = IniReader::Instance();
  if (!reader.IsChipIniPresent()) {
    throw mblib_exception("missing chipset settings file: " + reader.GetChipIniPath());
  }
  chip->Initialize();
}

// Without a list every class is built in its place; of the generic families the plainest, without its second stage.
void MotherBoard::BuildAllChips() {
  const std::span<const ChipRow> rows = ChipRows();
  for (auto row = rows.begin(); row != rows.end(); ++row) {
    const auto next = row + 1;
    const bool isPlainest = next == rows.end() || next->place != row->place;  // the last row of a place
    if (row->place != kPlainChipPlace && isPlainest) {
      chips[row->place - 1] = row->make != nullptr ? row->make() : std::make_unique<NoneChip>();
    }
  }
}

Chip& MotherBoard::ChipOf(ChipChoice& choice) {
  if (choice.chip == nullptr) {
    if (choice.name.empty()) {
      choice.name = CDMUtil::ToLower(ReadIniValue(choice.key, ""));
    }
    choice.chip = &GetChip(choice.name);
  }
  return *choice.chip;
}

bool MotherBoard::IsSupported(const char* key, ChipChoice& choice, bool (Chip::*ask)(bool&), bool& supported) {
  const std::string answer = CDMUtil::ToLower(ReadIniValue(key, kUndef));
  if (answer == "no" || answer == "yes") {
    supported = answer == "yes";
    return true;
  }
  return (ChipOf(choice).*ask)(supported);
}

bool MotherBoard::IsPanelLedLegacy() {
  return CDMUtil::ToLower(ReadIniValue("test.panelglow.uselegacy", "no")) == "yes";
}

bool MotherBoard::IsPowerLedRedSupported(bool& supported) {
  return IsSupported("test.powerled.redled.support", powerLed, &Chip::IsPowerLedRedSupported, supported);
}
bool MotherBoard::SavePowerLedState() { return ChipOf(powerLed).SavePowerLedState(); }
bool MotherBoard::AssertPowerLedGreen() { return ChipOf(powerLed).AssertPowerLedGreen(); }
bool MotherBoard::AssertPowerLedRed() { return ChipOf(powerLed).AssertPowerLedRed(); }
bool MotherBoard::DeassertPowerLed() { return ChipOf(powerLed).DeassertPowerLed(); }
bool MotherBoard::RestorePowerLedState() { return ChipOf(powerLed).RestorePowerLedState(); }
bool MotherBoard::BlinkPowerLedGreen() { return ChipOf(powerLed).BlinkPowerLedGreen(); }
bool MotherBoard::BlinkPowerLedRed() { return ChipOf(powerLed).BlinkPowerLedRed(); }

bool MotherBoard::IsChargeLedRedSupported(bool& supported) {
  return IsSupported("test.chargeled.redled.support", chargeLed, &Chip::IsChargeLedRedSupported, supported);
}
bool MotherBoard::AssertChargeLedWhite() { return ChipOf(chargeLed).AssertChargeLedWhite(); }
bool MotherBoard::DeassertChargeLedWhite() { return ChipOf(chargeLed).DeassertChargeLedWhite(); }
bool MotherBoard::AssertChargeLedRed() { return ChipOf(chargeLed).AssertChargeLedRed(); }
bool MotherBoard::DeassertChargeLedRed() { return ChipOf(chargeLed).DeassertChargeLedRed(); }
bool MotherBoard::BlinkChargeLedWhite() { return ChipOf(chargeLed).BlinkChargeLedWhite(); }
bool MotherBoard::BlinkChargeLedRed() { return ChipOf(chargeLed).BlinkChargeLedRed(); }
bool MotherBoard::SaveChargeLedState() { return ChipOf(chargeLed).SaveChargeLedState(); }
bool MotherBoard::RestoreChargeLedState() { return ChipOf(chargeLed).RestoreChargeLedState(); }

bool MotherBoard::IsHdLedRedSupported(bool& supported) {
  return IsSupported("test.hdled.red.support", hdLed, &Chip::IsHdLedRedSupported, supported);
}
bool MotherBoard::SaveHdLedState() { return ChipOf(hdLed).SaveHdLedState(); }
bool MotherBoard::RestoreHdLedState() { return ChipOf(hdLed).RestoreHdLedState(); }
bool MotherBoard::AssertHdLedRed() { return ChipOf(hdLed).AssertHdLedRed(); }
bool MotherBoard::DeassertHdLedRed() { return ChipOf(hdLed).DeassertHdLedRed(); }
bool MotherBoard::BlinkHdLedRed() { return ChipOf(hdLed).BlinkHdLedRed(); }

bool MotherBoard::IsWirelessLedSupported(bool& supported) {
  return IsSupported("test.wirelessled.support", wirelessLed, &Chip::IsWirelessLedSupported, supported);
}
bool MotherBoard::SaveWirelessLedState() { return ChipOf(wirelessLed).SaveWirelessLedState(); }
bool MotherBoard::RestoreWirelessLedState() { return ChipOf(wirelessLed).RestoreWirelessLedState(); }
bool MotherBoard::AssertWirelessLed() { return ChipOf(wirelessLed).AssertWirelessLed(); }
bool MotherBoard::DeassertWirelessLed() { return ChipOf(wirelessLed).DeassertWirelessLed(); }
bool MotherBoard::BlinkWirelessLed() { return false; }  // no chip can

bool MotherBoard::SaveSpeakerLedState() { return ChipOf(speakerLed).SaveSpeakerLedState(); }
bool MotherBoard::RestoreSpeakerLedState() { return ChipOf(speakerLed).RestoreSpeakerLedState(); }
bool MotherBoard::BlinkSpeakerLed() { return ChipOf(speakerLed).BlinkSpeakerLed(); }
bool MotherBoard::BlinkMicrophoneLed() { return ChipOf(microphoneLed).BlinkMicrophoneLed(); }
bool MotherBoard::AssertSpeakerLed() { return ChipOf(speakerLed).AssertSpeakerLed(); }
bool MotherBoard::DeassertSpeakerLed() { return ChipOf(speakerLed).DeassertSpeakerLed(); }
bool MotherBoard::AssertMicrophoneLed() { return ChipOf(microphoneLed).AssertMicrophoneLed(); }
bool MotherBoard::DeassertMicrophoneLed() { return ChipOf(microphoneLed).DeassertMicrophoneLed(); }

bool MotherBoard::SavePowerButton() { return ChipOf(powerButton).SavePowerButtonState(); }
bool MotherBoard::RestorePowerButton() { return ChipOf(powerButton).RestorePowerButtonState(); }
bool MotherBoard::ArmPowerButton() { return ChipOf(powerButton).ArmPowerButton(); }
bool MotherBoard::IsPowerButtonPressed(bool& pressed) { return ChipOf(powerButton).IsPowerButtonPressed(pressed); }

bool MotherBoard::ReadLatchedBit(std::uint16_t port, int bit) {
  bool value = false;
  chips[kPlainChipPlace - 1]->ReadLatchedPortDword(port, bit, value);
  return value;
}

bool MotherBoard::ClearLatchedBit(std::uint16_t port, int bit) {
  return chips[kPlainChipPlace - 1]->ClearLatchedPortDword(port, bit);
}

}  // namespace panelglow
