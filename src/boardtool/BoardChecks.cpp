#include "boardtool/BoardChecks.h"

#include <algorithm>
#include <array>
#include <map>

#include "board/ChipTable.h"
#include "boardtool/LayeredFiles.h"
#include "boardtool/MachineChecks.h"
#include "boardtool/NameChecks.h"
#include "harness/base/CDMUtil.h"

namespace panelglow::boardtool {

namespace {

using Files = std::vector<IniOutline>;

// What the library tells people begins with a place: `FILE, section [NAME], key "KEY": ...`.
struct Told {
  const IniOutline* file = nullptr;
  const IniEntry* entry = nullptr;
  std::string text;
};

Told Located(const std::string& notice, const LayeredFiles& files, const std::string& machine) {
  constexpr std::string_view kSection = ", section [";
  constexpr std::string_view kKey = "], key \"";
  constexpr std::string_view kEnd = "\": ";
  const std::size_t section = notice.find(kSection);
  const std::size_t key = notice.find(kKey);
  const std::size_t end = key == std::string::npos ? key : notice.find(kEnd, key + kKey.size());
  if (section == std::string::npos || end == std::string::npos || key < section) {
    return {nullptr, nullptr, notice};
  }
  Told told;
  told.file = files.File(notice.substr(0, section));
  told.text = notice.substr(end + kEnd.size());
  const std::string sectionName = notice.substr(section + kSection.size(), key - section - kSection.size());
  if (told.file != nullptr) {
    told.entry = told.file->Find(sectionName, notice.substr(key + kKey.size(), end - key - kKey.size()));
  }
  // A list that cannot be used because of another key says so.
  constexpr std::string_view kCheck = "Check ";
  if (const std::size_t check = told.text.find(kCheck); check != std::string::npos) {
    const std::size_t begin = check + kCheck.size();
    const std::string other = told.text.substr(begin, told.text.find(' ', begin) - begin);
    if (const PlacedEntry line = files.Chip(machine, sectionName, other)) {
      told.file = line.file;
      told.entry = line.entry;
    }
  }
  return told;
}

struct NoticeRule {
  std::string_view words;
  std::string_view rule;
};
constexpr std::array<NoticeRule, 9> kNoticeRules{{{"is no number", "not-a-number"},
                                                  {"does not fit into", "bit-out-of-range"},
                                                  {"neither yes nor no", "yes-or-no"},
                                                  {"there is no board class", "unknown-class"},
                                                  {"there is no chip", "unknown-chip"},
                                                  {"there is no section", "unknown-base"},
                                                  {"malformed sequence entry", "malformed-sequence"},
                                                  {"invalid ", "board-fails"},
                                                  {"", "unreadable"}}};

std::string_view RuleFor(const std::string& text) {
  return std::find_if(kNoticeRules.begin(), kNoticeRules.end(),
                      [&](const NoticeRule& rule) { return text.find(rule.words) != std::string::npos; })
      ->rule;
}

class BoardCheck {
 public:
  BoardCheck(const Files& files, const BoardFiles& names, platform::Host& machine, Findings& findings)
      : files_(files), names_(names), layers_(files, names), machine_(machine), findings_(findings) {}

  BoardKnowledge Run() {
    const std::vector<std::string> machines = MachinesOf(files_, names_);
    RehearsalWish wish;
    wish.withSources = false;
    wish.everything = true;
    for (std::size_t i = 0; i < machines.size() && i < kMostMachines; ++i) {
      const BoardPlan plan = Rehearse(files_, names_, machines[i], machine_, wish);
      CheckPlan(plan);
      CheckMachine(plan, layers_, names_, findings_);
      reached_.lookUps.insert(plan.lookUps.begin(), plan.lookUps.end());
    }
    if (machines.size() > kMostMachines) {
      findings_.Add("too-many-machines", files_.front().path, 1, 1,
                    "only the first " + std::to_string(kMostMachines) + " of " + std::to_string(machines.size()) +
                        " machines were tried");
    }
    CheckNames(files_, names_, machine_, reached_, findings_);
    return std::move(knowledge_);
  }

 private:
  void Add(std::string_view rule, const IniOutline* file, const IniEntry* entry, const std::string& text) {
    if (file != nullptr && entry != nullptr) {
      findings_.Add(rule, file->path, entry->line, entry->valueColumn, text);
    }
  }

  // Where something about a machine as a whole is told.
  void AddOfMachine(std::string_view rule, const std::string& machine, const std::string& text) {
    for (const char* const key : {"platform", "chips", "MotherboardClass"}) {
      if (const auto [file, entry] = layers_.Board(machine, key); entry != nullptr) {
        Add(rule, file, entry, text);
        return;
      }
    }
  }

  void CheckPlan(const BoardPlan& plan) {
    bool isExplained = false;
    for (const std::string& notice : plan.notices) {
      const Told told = Located(notice, layers_, plan.systemId);
      if (told.entry != nullptr) {
        isExplained = true;
        Add(RuleFor(told.text), told.file, told.entry, WithNearestChip(told.text));
      } else if (notice.find("cannot be lit") == std::string::npos &&
                 notice.find("cannot be darkened") == std::string::npos &&
                 notice.find("is not known") == std::string::npos) {
        AddOfMachine("unreadable", plan.systemId, "[" + plan.systemId + "] " + notice);
      }
    }
    if (!plan.failure.empty() && !isExplained) {
      const std::string text = "[" + plan.systemId + "] cannot be built: " + plan.failure;
      if (const PlacedEntry bar = LineOfBase(plan)) {
        Add("board-fails", bar.file, bar.entry, text);
      } else {
        AddOfMachine("board-fails", plan.systemId, text);
      }
    }
    if (plan.className.empty()) {
      reached_.unbuilt.insert(LoweredName(plan.systemId));
      if (plan.failure.empty() && !isExplained) {
        reached_.unselected.push_back(plan.systemId);
      }
    }
    for (const LedPlan& led : plan.leds) {
      CheckLed(plan, led);
    }
    CheckSameBits(plan);
  }

  // The line that says where a Super-I/O's base stands, when a board fails for want of it.
  PlacedEntry LineOfBase(const BoardPlan& plan) const {
    for (const auto& [word, key] : {std::pair("HWMBAR", "hwmbar.bar.reg"), std::pair("GPIOBAR", "gpiobar.bar.reg")}) {
      if (plan.failure.find(word) == std::string::npos) {
        continue;
      }
      std::vector<std::string> chips;
      CDMUtil::Split(LoweredName(layers_.Board(plan.systemId, "chips").Value()), chips, ", ");
      for (const std::string& chip : chips) {
        if (const PlacedEntry line = layers_.Chip(plan.systemId, layers_.SectionOf(plan.systemId, chip), key)) {
          return line;
        }
      }
    }
    return {};
  }

  static std::string WithNearestChip(const std::string& text) {
    constexpr std::string_view kNoChip = "there is no chip \"";
    const std::size_t at = text.find(kNoChip);
    if (at == std::string::npos) {
      return text;
    }
    const std::size_t begin = at + kNoChip.size();
    const std::string name = text.substr(begin, text.find('"', begin) - begin);
    return WithNearest(text, name, ChipNames());
  }

  static std::vector<std::string> ChipNames() {
    std::vector<std::string> names;
    for (const ChipRow& row : ChipRows()) {
      names.emplace_back(row.name);
    }
    return names;
  }

  // The line of a chip's key that a finding about an LED is about; where there is none, that of the LED's chip.
  PlacedEntry LineOf(const BoardPlan& plan, const BoardLed& led, const std::string& key) const {
    const std::string chip = ChipOf(plan, led);
    const bool hasMasks = HasMasksOfFiles(plan, led);  // whose lists stand in the section of the chip's own name
    const PlacedEntry line =
        chip.empty() ? PlacedEntry{}
                     : layers_.Chip(plan.systemId, hasMasks ? chip : layers_.SectionOf(plan.systemId, chip), key);
    return line ? line : layers_.Board(plan.systemId, std::string(led.chipKey));
  }

  void CheckLed(const BoardPlan& plan, const LedPlan& led) {
    const auto [file, entry] = layers_.Board(plan.systemId, std::string(led.led->chipKey));
    const std::string title = "[" + plan.systemId + "] " + std::string(led.led->title);
    if (led.IsLit()) {
      knowledge_.litFunctions.insert(std::string(led.led->function));
    } else if (entry != nullptr) {
      CheckChipName(plan, led, file, *entry);
      return;
    }
    const PlannedStep* const on = led.Find("on");
    const PlannedStep* const off = led.Find("off");
    if (on != nullptr && off != nullptr && on->answer && !off->answer) {
      const PlacedEntry line = LineOf(plan, *led.led, std::string(led.led->chipPrefix) + ".deassert.sequence");
      Add("on-without-off", line.file, line.entry,
          title + " can be lit and not darkened: the chip has no keys for it");
    }
    if (const PlannedStep* const save = led.Find("save");
        !led.leftChanged.empty() && led.blinksByItself && save != nullptr && save->answer &&
        ChipOf(plan, *led.led).starts_with("g_")) {  // whose save list stands in a file
      std::string registers;
      for (const ImaginedHardware::Cell& cell : led.leftChanged) {
        registers += (registers.empty() ? "" : ", ") + Hex(cell.address);
      }
      const PlacedEntry line = LineOf(plan, *led.led, "powerled.state.regs");
      Add("not-saved", line.file, line.entry,
          title + ": the blink changes " + registers + ", which no save list has");
    }
    CheckRate(led, title, file, entry);
  }

  void CheckRate(const LedPlan& led, const std::string& title, const IniOutline* file, const IniEntry* entry) {
    constexpr std::uint64_t kLongest_ms = 1500;
    for (const char* const name : {"on", "off"}) {
      const PlannedStep* const step = led.Find(name);
      std::uint64_t waits = 0;
      for (const PlannedAccess& access : step == nullptr ? std::vector<PlannedAccess>{} : step->accesses) {
        waits += access.access.kind == HardwareAccess::Kind::kWait ? access.access.value : 0;
      }
      if (!led.blinksByItself && waits > kLongest_ms) {
        Add("blink-rate", file, entry,
            title + ": switching it \"" + name + "\" takes " + std::to_string(waits) +
                " ms, which no eye takes for " + "blinking");
      }
    }
  }

  // An LED's key names a chip that does not light it.
  void CheckChipName(const BoardPlan& plan, const LedPlan& led, const IniOutline* file, const IniEntry& entry) {
    const std::string name = LoweredName(CDMUtil::Trim(entry.value.substr(0, entry.value.find(';'))));
    if (name.empty() || name == "undef" || name == "none") {
      return;
    }
    const std::vector<std::string> chips = ChipNames();
    if (std::find(chips.begin(), chips.end(), name) == chips.end()) {
      Add("unknown-chip", file, &entry, WithNearest("there is no chip \"" + name + "\"", name, chips));
      return;
    }
    const bool isBuilt = std::find(plan.chips.begin(), plan.chips.end(), name) != plan.chips.end();
    if (!isBuilt && !plan.className.empty()) {
      Add("unknown-chip", file, &entry,
          "[" + plan.systemId + "] has no chip \"" + name + "\": it is not in the list of the key \"chips\"");
      return;
    }
    // One key serves two colours: one of them is enough.
    const bool otherIsLit = std::any_of(plan.leds.begin(), plan.leds.end(), [&](const LedPlan& other) {
      return other.led->chipKey == led.led->chipKey && other.IsLit();
    });
    if (isBuilt && !otherIsLit && led.failure.empty()) {
      const PlacedEntry line = LineOf(plan, *led.led, std::string(led.led->chipPrefix) + ".assert.sequence");
      const bool isOff = line && line.IsUndefined();
      Add("led-not-lit", isOff ? line.file : file, isOff ? line.entry : &entry,
          "[" + plan.systemId + "] chip \"" + name + "\" lights no " + std::string(led.led->title) +
              ": it has no keys for it, or cannot");
    }
  }

  // Bits that an LED's "on" sets in a register of which it keeps the others.
  static std::map<std::pair<HardwareAccess::Kind, std::uint64_t>, std::uint64_t> BitsOf(const LedPlan& led) {
    std::map<std::pair<HardwareAccess::Kind, std::uint64_t>, std::uint64_t> bits;
    const PlannedStep* const on = led.Find("on");
    for (const PlannedAccess& access : on == nullptr ? std::vector<PlannedAccess>{} : on->accesses) {
      if (IsWrite(access.access.kind) && access.access.reg < 0 && access.kept != 0 && access.set != 0) {
        bits[{access.access.kind, access.access.address}] |= access.set;
      }
    }
    return bits;
  }

  std::string ChipOf(const BoardPlan& plan, const BoardLed& led) const {
    const auto [file, entry] = layers_.Board(plan.systemId, std::string(led.chipKey));
    return entry == nullptr ? std::string() : LoweredName(CDMUtil::Trim(entry->value));
  }

  // The classes whose masks stand in the files; others share bits by what they are.
  bool HasMasksOfFiles(const BoardPlan& plan, const BoardLed& led) const {
    const std::string chip = ChipOf(plan, led);
    return chip == "g_iospace" || chip == "g_memoryspace";
  }

  void CheckSameBits(const BoardPlan& plan) {
    for (auto first = plan.leds.begin(); first != plan.leds.end(); ++first) {
      if (!HasMasksOfFiles(plan, *first->led)) {
        continue;
      }
      const auto bits = BitsOf(*first);
      for (auto second = first + 1; second != plan.leds.end(); ++second) {
        for (const auto& [place, set] : BitsOf(*second)) {
          const auto same = bits.find(place);
          if (same == bits.end() || (same->second & set) == 0) {
            continue;
          }
          const auto [file, entry] =
              LineOf(plan, *second->led, std::string(second->led->chipPrefix) + ".assert.sequence");
          HardwareAccess access;
          access.kind = place.first;
          access.width = 1;
          access.address = place.second;
          Add("same-bit", file, entry,
              "[" + plan.systemId + "] " + std::string(first->led->title) + " and " +
                  std::string(second->led->title) + " hang on the same bit, " + Hex(same->second & set) + " of " +
                  boardtool::PlaceOf(access));
        }
      }
    }
  }

  const Files& files_;
  const BoardFiles& names_;
  LayeredFiles layers_;
  platform::Host& machine_;
  Findings& findings_;
  Reached reached_;
  BoardKnowledge knowledge_;
};

}  // namespace

BoardKnowledge CheckBoards(const std::vector<IniOutline>& files, const BoardFiles& names, platform::Host& machine,
                           Findings& findings) {
  return BoardCheck(files, names, machine, findings).Run();
}

}  // namespace panelglow::boardtool
