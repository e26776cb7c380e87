#include "boardtool/KnownKeys.h"

#include <algorithm>
#include <array>

#include "board/ChipTable.h"
#include "boardtool/Installation.h"

namespace panelglow::boardtool {

namespace {

constexpr const char* kMachine = "1";
constexpr const char* kOwnSection = "own";
constexpr const char* kOwnPrefix = "chip.own.";
constexpr const char* kBaseKey = "base";

// Read by the tests themselves, or only on a machine with such a processor or card.
constexpr std::array kReadElsewhere{"test.panelglow.network.1.name",
                                    "test.panelglow.network.1.msgid",
                                    "test.powerled.color.1.msgid",
                                    "test.powerled.color.2.msgid",
                                    "test.tempcaution.processor.1.manufacturer",
                                    "test.tempcaution.processor.1.familyid",
                                    "test.tempcaution.processor.1.mechanism",
                                    "test.tempcaution.processor.1.maxtempreg",
                                    "test.tempcaution.processor.1.tempprobereg",
                                    "test.tempcaution.processor.1.tjmax",
                                    "test.graphics.1.pci_ids",
                                    "test.graphics.1.temp_zones",
                                    "test.graphics.1.upper_threshold",
                                    "test.graphics.1.lower_threshold"};

// What the numbered lists need so that their first entry is read.
constexpr const char* kLists =
    "chip.codec.hdabar=0xFE000000\n"
    "detect.fan.1.name=x\ndetect.fan.1.tach.chip=ich\ndetect.jumper.1.name=x\ndetect.frontpanel.1.name=x\n"
    "detect.security.1.name=x\ndetect.cable.1.name=x\ndetect.powereddevice.1.name=x\ndetect.heatsink.name=x\n"
    "detect.heatsink.cpufanname=x\ndetect.dashcable.name=x\ndetect.riser.name=x\ndetect.internalspeaker.is_present="
    "yes\n"
    "detect.touchscreen.is_present=yes\ntest.fans.group.1.name=x\ntest.fans.group.1.fans=1\n"
    "test.tempcaution.zone.1.name=x\ntest.tempcaution.zone.1.prochot=yes\ntest.tempcaution.zone.1.cpu.core=true\n"
    "test.tempzones.group.1.name=x\ntest.tempzones.group.1.zones=1\ntest.button.1.name=x\n"
    "test.hoodswitch.gpio=1\ntest.hoodlock.gpio.lock=1\nMaximumFans=1\nFan1Name=x\nMaxTempZones=1\nTSensor1Name=x\n";

constexpr std::array kLedKeys{"test.powerled.chip",    "test.chargeled.chip",  "test.hdled.chip",
                              "test.wirelessled.chip", "test.speakerled.chip", "test.microphoneled.chip",
                              "test.powerbutton.chip", "test.tempcaution.chip"};

bool IsGenericEc(std::string_view chip) { return chip == "g_ec" || chip == "g_ec_it8519"; }

}  // namespace

KnownKeys::KnownKeys(platform::Host& machine) {
  const BoardFiles names = BoardFilesIn(".");
  RehearsalWish wish;
  wish.withSources = false;
  wish.everything = true;
  const auto gather = [&](const std::string& selection, const std::string& chip) {
    std::string detect = "[" + std::string(kMachine) + "]\n" + selection;
    std::string test = "[" + std::string(kMachine) + "]\n";
    for (const char* const key : kLedKeys) {
      test += std::string(key) + "=" + chip + "\n";
    }
    const std::vector<IniOutline> files{{names.detectPath, detect + kLists},
                                        {names.testPath, test},
                                        {names.chipPath, "[" + std::string(kOwnSection) + "]\nbase=\n" +
                                                             (IsGenericEc(chip) ? "ec.set_pwm.cmd=1\n" : "")}};
    for (const LookUp& lookUp : Rehearse(files, names, kMachine, machine, wish).lookUps) {
      const bool isChipFile = lookUp.path == names.chipPath;
      if ((isChipFile ? chipPatterns_ : boardPatterns_).insert(PatternOf(lookUp.key)).second) {
        (isChipFile ? chip_ : board_).push_back(lookUp.key);
      }
    }
  };
  for (const ChipRow& row : ChipRows()) {
    if (row.place != kPlainChipPlace) {
      const std::string chip(row.name);
      gather("platform=generic\nchips=" + chip + "\nchip." + chip + ".data=" + kOwnSection + "\n", chip);
    }
  }
  for (const char* const board : {"Orchard", "Lantern"}) {
    gather("MotherboardClass=" + std::string(board) + "\n", "");
  }
  for (const char* const key : kReadElsewhere) {
    boardPatterns_.insert(PatternOf(key));
    board_.emplace_back(key);
  }
  chipPatterns_.insert(kBaseKey);
  chip_.emplace_back(kBaseKey);
}

const KnownKeys& KnownKeys::Once(platform::Host& machine) {
  static const KnownKeys kKnown(machine);
  return kKnown;
}

// Numbers in keys count things.
std::string KnownKeys::PatternOf(const std::string& key) {
  std::string pattern;
  for (const char c : key) {
    const bool isDigit = c >= '0' && c <= '9';
    if (!isDigit) {
      pattern += c;
    } else if (pattern.empty() || pattern.back() != '#') {
      pattern += '#';
    }
  }
  return pattern;
}

bool KnownKeys::IsReadElsewhere(const std::string& key) {
  const std::string pattern = PatternOf(key);
  return std::any_of(kReadElsewhere.begin(), kReadElsewhere.end(),
                     [&](const char* known) { return PatternOf(known) == pattern; });
}

bool KnownKeys::IsKnown(const std::string& key, bool isChipFile) const {
  const std::set<std::string>& patterns = isChipFile ? chipPatterns_ : boardPatterns_;
  if (patterns.contains(PatternOf(key))) {
    return true;
  }
  // A board's own value for a chip's section of any name.
  constexpr std::string_view kChip = "chip.";
  const std::size_t dot = key.starts_with(kChip) ? key.find('.', kChip.size()) : std::string::npos;
  return !isChipFile && dot != std::string::npos && patterns.contains(PatternOf(kOwnPrefix + key.substr(dot + 1)));
}

}  // namespace panelglow::boardtool
