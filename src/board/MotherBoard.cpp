#include "board/MotherBoard.h"

#include <algorithm>
#include <array>
#include <set>
#include <utility>
#include <vector>

#include "board/Cbb.h"
#include "board/Cobble.h"
#include "board/IchWin.h"
#include "board/Lantern.h"
#include "board/Orchard.h"
#include "board/Saddle.h"
#include "board/Sb7Sch5.h"
#include "board/Thicket.h"
#include "board/base/IniReader.h"
#include "board/base/SelectedSystem.h"
#include "board/base/mblib_exception.h"
#include "board/chips/NoneChip.h"
#include "board/parts/Bits.h"
#include "harness/base/CDMException.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/Notices.h"
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
constexpr const char* kNoChip = "none";

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
  BoardFactory make;
};

template <class Board>
std::unique_ptr<MotherBoard> Make(const std::string& systemId) {
  return std::make_unique<Board>(systemId);
}

constexpr std::array<BoardRow, 6> kBoardClasses{{{"generic", Make<MotherBoard>},
                                                 {"ich_win", Make<IchWin>},
                                                 {"sb7sch5", Make<Sb7Sch5>},
                                                 {"cbb", Make<Cbb>},
                                                 {"mistral", Make<Thicket>},
                                                 {"cobble", Make<Cobble>}}};

constexpr std::uint16_t kSaddleId = 0x2A78;  // of the "Lantern" boards the one that is a "Saddle"

constexpr const char* kLegacyPorts =
    "a test that knows the ports of the oldest desktops uses them for power and drive";

// A name as it is compared, with its place.
Setting ReadName(const std::string& key, const std::string& defaultValue) {
  Setting name = IniReader::Instance().ReadIniSetting(key, defaultValue);
  name.text = CDMUtil::ToLower(name.text);
  return name;
}

// The class that the INI data names; empty when it names none of this path.
Setting SelectClass(const std::string& classKey, const std::string& systemId) {
  Setting name = ReadName(classKey, "");
  if (!name.text.empty()) {
    return name;
  }
  if (ReadIniValue("MotherboardClass", kNotFound) != kNotFound || IsOlderBoard(systemId)) {
    return {};
  }
  if (ReadIniValue("chips", kNotFound) != kNotFound) {
    return "generic";
  }
  Notices::Tell("This machine's board is not known: " +
                (systemId.empty() ? "the firmware tables name no base board product"
                                  : "its system id is \"" + systemId + "\"") +
                ", and " + IniReader::Instance().DescribeSections() + "; without \"" + classKey +
                "\" or \"chips\" there, " + kLegacyPorts + ".");
  return {};
}

const ChipRow* FindChipRow(std::string_view name) {
  const std::span<const ChipRow> rows = ChipRows();
  const auto found = std::find_if(rows.begin(), rows.end(), [&](const ChipRow& row) { return row.name == name; });
  return found == rows.end() ? nullptr : &*found;
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
  const SMBIOSDiscovery& firmware = SMBIOSDiscovery::Instance();
  const std::string systemId = firmware.GetProductText();
  const std::string section = systemIdOverride.empty() ? systemId : systemIdOverride;
  const ProcessorInfo processor = firmware.GetProcessor(0);
  IniReader::Instance(section, detectIniPath, testIniPath, chipIniPath);
  SetSelectedSystem({CDMUtil::Trim(processor.manufacturer), processor.family, detectIniPath, section});
  const Setting wanted = SelectClass(classKey, systemId);
  const auto found = std::find_if(kBoardClasses.begin(), kBoardClasses.end(),
                                  [&](const BoardRow& row) { return row.name == wanted.text; });
  if (found == kBoardClasses.end()) {
    if (wanted.text != "legacy") {
      TellOf(wanted, "there is no board class \"" + wanted.text + "\"; " + kLegacyPorts);
    }
    return nullptr;
  }
  return found->make(systemId);
}

std::unique_ptr<MotherBoard> MotherBoard::Instance(const std::string& detectIniPath) {
  constexpr std::size_t kValueBuffer = 1024;
  constexpr const char* kKey = "MotherboardClass";
  constexpr std::size_t kLongestId = 4;  // in digits
  std::uint16_t id = 0;
  Tsk_GetSystemID(id);
  std::string section = CDMUtil::ToUpper(CDMUtil::ToHexString(id));
  const auto look = [&] {
    std::string value(kValueBuffer, '\0');
    value.resize(platform::TheHost().profiles.GetValue(section, kKey, "", value, detectIniPath));
    return value;
  };
  std::string name = look();
  while (name.empty() && section.size() < kLongestId) {
    section.insert(0, "0");
    name = look();
  }
  SelectedSystem selected = GetSelectedSystem();
  selected.detectIniPath = detectIniPath;
  selected.section = section;
  SetSelectedSystem(selected);  // the flat keys stand where the class does
  if (name == "Lantern") {
    return id == kSaddleId ? std::unique_ptr<MotherBoard>(std::make_unique<Saddle>(id))
                           : std::make_unique<Lantern>(id);
  }
  if (name == "Orchard") {
    return std::make_unique<Orchard>(id);
  }
  if (!name.empty()) {
    TellOf({name, detectIniPath + ", section [" + section + "], key \"" + kKey + "\""},
           "there is no board class \"" + name + "\"; " + kLegacyPorts);
  }
  return nullptr;
}

MotherBoard::MotherBoard(std::string boardClass, std::uint16_t boardId)
    : lock(platform::TheHost().mutexes, kBoardMutex), systemId(boardId), className(std::move(boardClass)) {
  for (std::unique_ptr<Chip>& chip : chips) {
    chip = std::make_unique<NoneChip>();
  }
}

void MotherBoard::Place(std::string_view chipName) {
  if (const ChipRow* row = FindChipRow(chipName); row != nullptr) {
    Put(row->place, row->make());
  }
}

MotherBoard::MotherBoard(const std::string& systemIdText) : MotherBoard("generic", SystemIdOf(systemIdText)) {
  const Setting list = ReadName("chips", "");
  Place("chip");
  if (list.text.empty()) {
    BuildAllChips();
    return;
  }
  hasList = true;
  CDMUtil::Split(list.text, listed, ", ");
  for (const std::string& name : listed) {
    if (FindChipRow(name) == nullptr && name != kNoChip) {
      TellOf(list, "there is no chip \"" + name + "\"");
    }
  }
  BuildListedChips();
}

void MotherBoard::BuildListedChips() {
  const auto isListed = [this](std::string_view name) {
    return std::find(listed.begin(), listed.end(), name) != listed.end();
  };
  const auto build = [&](std::size_t place) {  // the first that is listed
    const std::span<const ChipRow> rows = ChipRows();
    const auto found = std::find_if(rows.begin(), rows.end(),
                                    [&](const ChipRow& row) { return row.place == place && isListed(row.name); });
    if (found != rows.end()) {
      Place(found->name);
    }
  };
  for (std::size_t place = kPlainChipPlace + 1; place <= kChipPlaces; ++place) {
    if (place != kGenericSuperIoPlace && place != kGenericEcPlace) {
      build(place);
    }
  }
  // The two generic families come last.
  build(kGenericSuperIoPlace);
  build(kGenericEcPlace);
  for (const std::size_t place : {kGenericSuperIoPlace, kGenericEcPlace}) {
    InitializeGeneric(place);
  }
}

// The generic super-I/O and embedded controller need the chip file and have a second stage of construction.
void MotherBoard::InitializeGeneric(std::size_t place) {
  Chip& chip = ChipAt(place);
  if (chip.GetName() == kNoChip) {
    return;
  }
  IniReader& reader = IniReader::Instance();
  if (!reader.IsChipIniPresent()) {
    throw mblib_exception("missing chipset settings file: " + reader.GetChipIniPath());
  }
  chip.Initialize();
}

// Without a list every class is built in its place; of the generic families the plainest, without its second stage.
void MotherBoard::BuildAllChips() {
  const std::span<const ChipRow> rows = ChipRows();
  for (auto row = rows.begin(); row != rows.end(); ++row) {
    const auto next = row + 1;
    const bool isPlainest = next == rows.end() || next->place != row->place;  // the last row of a place
    if (row->place != kPlainChipPlace && isPlainest) {
      Place(row->name);
    }
  }
}

// ---- whose chip, and what to say when it does nothing

Chip& MotherBoard::ChipOf(ChipChoice& choice) {
  if (choice.chip == nullptr) {
    choice.isPreset = !choice.name.empty();
    if (!choice.isPreset) {
      choice.name = ReadName(choice.key, "").text;
    }
    choice.chip = &GetChip(choice.name);
  }
  return *choice.chip;
}

// Composed once: an LED is asked again and again.
const std::string& MotherBoard::WhyNothing(ChipChoice& choice) const {
  if (choice.whyNothing.empty()) {
    choice.whyNothing = FindWhyNothing(choice);
  }
  return choice.whyNothing;
}

std::string MotherBoard::FindWhyNothing(const ChipChoice& choice) const {
  IniReader& reader = IniReader::Instance();
  if (choice.isPreset) {
    return "the board class " + className + " gives it to the chip \"" + choice.name + "\", which has nothing for it";
  }
  if (choice.name.empty()) {
    return std::string("the key \"") + choice.key + "\" names no chip for it; " + reader.DescribeSections();
  }
  const std::string place = reader.ReadIniSetting(choice.key, "").place;
  const std::string name = "chip \"" + choice.name + "\" (" + (place.empty() ? choice.key : place) + ")";
  const std::string chip = "the " + name;
  if (choice.name == kNoChip) {
    return chip + " stands for no chip at all";
  }
  if (FindChipRow(choice.name) == nullptr) {
    return chip + " does not exist";
  }
  if (hasList && std::find(listed.begin(), listed.end(), choice.name) == listed.end()) {
    return chip + " is not in the list of the key \"chips\"";
  }
  if (choice.chip != nullptr && choice.chip->GetName() == kNoChip) {
    return "the board class " + className + " has no " + name;
  }
  std::string missing;
  const std::string dataKey = "chip." + choice.name + ".data";
  const Setting data = reader.ReadIniSetting(dataKey, choice.name);
  for (const std::string& section : std::set<std::string>{choice.name, data.text}) {
    const std::string keys = reader.MissingKeys(section, choice.settings);
    missing += keys.empty() ? "" : "; without a value in [" + section + "]: " + keys;
  }
  if (!data.place.empty() && !reader.HasChipSection(data.text)) {
    missing += "; " + reader.GetChipIniPath() + " has no section [" + data.text + "], which " + data.place + " names";
  }
  return chip + " has nothing for it" + missing;
}

bool MotherBoard::SwitchOn(ChipChoice& choice, bool (Chip::*operation)()) {
  const bool done = (ChipOf(choice).*operation)();
  choice.wasLit = choice.wasLit || done;
  if (!done) {
    Notices::Tell(std::string("The ") + choice.what + " cannot be lit: " + WhyNothing(choice) + ".");
  }
  return done;
}

bool MotherBoard::SwitchOff(ChipChoice& choice, bool (Chip::*operation)()) {
  const bool done = (ChipOf(choice).*operation)();
  if (!done && choice.wasLit) {
    Notices::Tell(std::string("The ") + choice.what + " cannot be darkened: " + WhyNothing(choice) + ".");
  }
  return done;
}

bool MotherBoard::IsSupported(const char* key, ChipChoice& choice, bool (Chip::*ask)(bool&), bool& supported) {
  const Setting answer = ReadName(key, kUndef);
  if (answer.text == "no" || answer.text == "yes") {
    supported = answer.text == "yes";
    return true;
  }
  if (!answer.text.empty()) {
    TellOf(answer, "\"" + answer.text + "\" is neither yes nor no; the chip is asked");
  }
  return (ChipOf(choice).*ask)(supported);
}

bool MotherBoard::IsPanelLedLegacy() {
  const Setting answer = ReadName("test.panelglow.uselegacy", "no");
  if (!answer.text.empty() && answer.text != "yes" && answer.text != "no") {
    TellOf(answer, "\"" + answer.text + "\" is neither yes nor no and counts as no");
  }
  return answer.text == "yes";
}

// ---- operations

bool MotherBoard::IsPowerLedRedSupported(bool& supported) {
  return IsSupported("test.powerled.redled.support", powerLed, &Chip::IsPowerLedRedSupported, supported);
}
bool MotherBoard::SavePowerLedState() { return ChipOf(powerLed).SavePowerLedState(); }
bool MotherBoard::AssertPowerLedGreen() { return SwitchOn(powerLed, &Chip::AssertPowerLedGreen); }
bool MotherBoard::AssertPowerLedRed() { return SwitchOn(powerLed, &Chip::AssertPowerLedRed); }
bool MotherBoard::DeassertPowerLed() { return SwitchOff(powerLed, &Chip::DeassertPowerLed); }
bool MotherBoard::RestorePowerLedState() { return ChipOf(powerLed).RestorePowerLedState(); }
bool MotherBoard::BlinkPowerLedGreen() { return ChipOf(powerLed).BlinkPowerLedGreen(); }
bool MotherBoard::BlinkPowerLedRed() { return ChipOf(powerLed).BlinkPowerLedRed(); }

bool MotherBoard::IsChargeLedRedSupported(bool& supported) {
  return IsSupported("test.chargeled.redled.support", chargeLed, &Chip::IsChargeLedRedSupported, supported);
}
bool MotherBoard::AssertChargeLedWhite() { return SwitchOn(chargeLed, &Chip::AssertChargeLedWhite); }
bool MotherBoard::DeassertChargeLedWhite() { return SwitchOff(chargeLed, &Chip::DeassertChargeLedWhite); }
bool MotherBoard::AssertChargeLedRed() { return SwitchOn(chargeLed, &Chip::AssertChargeLedRed); }
bool MotherBoard::DeassertChargeLedRed() { return SwitchOff(chargeLed, &Chip::DeassertChargeLedRed); }
bool MotherBoard::BlinkChargeLedWhite() { return ChipOf(chargeLed).BlinkChargeLedWhite(); }
bool MotherBoard::BlinkChargeLedRed() { return ChipOf(chargeLed).BlinkChargeLedRed(); }
bool MotherBoard::SaveChargeLedState() { return ChipOf(chargeLed).SaveChargeLedState(); }
bool MotherBoard::RestoreChargeLedState() { return ChipOf(chargeLed).RestoreChargeLedState(); }

bool MotherBoard::IsHdLedRedSupported(bool& supported) {
  return IsSupported("test.hdled.red.support", hdLed, &Chip::IsHdLedRedSupported, supported);
}
bool MotherBoard::SaveHdLedState() { return ChipOf(hdLed).SaveHdLedState(); }
bool MotherBoard::RestoreHdLedState() { return ChipOf(hdLed).RestoreHdLedState(); }
bool MotherBoard::AssertHdLedRed() { return SwitchOn(hdLed, &Chip::AssertHdLedRed); }
bool MotherBoard::DeassertHdLedRed() { return SwitchOff(hdLed, &Chip::DeassertHdLedRed); }
bool MotherBoard::BlinkHdLedRed() { return ChipOf(hdLed).BlinkHdLedRed(); }

bool MotherBoard::IsWirelessLedSupported(bool& supported) {
  return IsSupported("test.wirelessled.support", wirelessLed, &Chip::IsWirelessLedSupported, supported);
}
bool MotherBoard::SaveWirelessLedState() { return ChipOf(wirelessLed).SaveWirelessLedState(); }
bool MotherBoard::RestoreWirelessLedState() { return ChipOf(wirelessLed).RestoreWirelessLedState(); }
bool MotherBoard::AssertWirelessLed() { return SwitchOn(wirelessLed, &Chip::AssertWirelessLed); }
bool MotherBoard::DeassertWirelessLed() { return SwitchOff(wirelessLed, &Chip::DeassertWirelessLed); }
bool MotherBoard::BlinkWirelessLed() { return false; }  // no chip can

bool MotherBoard::SaveSpeakerLedState() { return ChipOf(speakerLed).SaveSpeakerLedState(); }
bool MotherBoard::RestoreSpeakerLedState() { return ChipOf(speakerLed).RestoreSpeakerLedState(); }
bool MotherBoard::BlinkSpeakerLed() { return ChipOf(speakerLed).BlinkSpeakerLed(); }
bool MotherBoard::BlinkMicrophoneLed() { return ChipOf(microphoneLed).BlinkMicrophoneLed(); }
bool MotherBoard::AssertSpeakerLed() { return SwitchOn(speakerLed, &Chip::AssertSpeakerLed); }
bool MotherBoard::DeassertSpeakerLed() { return SwitchOff(speakerLed, &Chip::DeassertSpeakerLed); }
bool MotherBoard::AssertMicrophoneLed() { return SwitchOn(microphoneLed, &Chip::AssertMicrophoneLed); }
bool MotherBoard::DeassertMicrophoneLed() { return SwitchOff(microphoneLed, &Chip::DeassertMicrophoneLed); }

bool MotherBoard::SavePowerButton() { return ChipOf(powerButton).SavePowerButtonState(); }
bool MotherBoard::RestorePowerButton() { return ChipOf(powerButton).RestorePowerButtonState(); }
bool MotherBoard::ArmPowerButton() { return ChipOf(powerButton).ArmPowerButton(); }
bool MotherBoard::IsPowerButtonPressed(bool& pressed) { return ChipOf(powerButton).IsPowerButtonPressed(pressed); }

bool MotherBoard::ReadLatchedBit(std::uint16_t port, int bit) {
  bool value = false;
  ChipAt(kPlainChipPlace).ReadLatchedPortDword(port, MaskOfBit(bit, 32), value);
  return value;
}

bool MotherBoard::ClearLatchedBit(std::uint16_t port, int bit) {
  return ChipAt(kPlainChipPlace).ClearLatchedPortDword(port, MaskOfBit(bit, 32));
}

}  // namespace panelglow
