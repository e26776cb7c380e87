#include "boardtool/BoardChecks.h"

#include <algorithm>
#include <array>
#include <map>
#include <optional>

#include "board/ChipTable.h"
#include "boardtool/KnownKeys.h"
#include "harness/base/CDMUtil.h"

namespace panelglow::boardtool {

namespace {

using Files = std::vector<IniOutline>;

const IniOutline* FileOf(const Files& files, const std::string& path) {
  const auto found =
      std::find_if(files.begin(), files.end(), [&](const IniOutline& file) { return file.path == path; });
  return found == files.end() ? nullptr : &*found;
}

// What the library tells people begins with a place: `FILE, section [NAME], key "KEY": ...`.
struct Told {
  const IniOutline* file = nullptr;
  const IniEntry* entry = nullptr;
  std::string text;
};

Told Located(const std::string& notice, const Files& files) {
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
  told.file = FileOf(files, notice.substr(0, section));
  told.text = notice.substr(end + kEnd.size());
  if (told.file != nullptr) {
    told.entry = told.file->Find(notice.substr(section + kSection.size(), key - section - kSection.size()),
                                 notice.substr(key + kKey.size(), end - key - kKey.size()));
  }
  return told;
}

struct NoticeRule {
  std::string_view words;
  std::string_view rule;
};
constexpr std::array<NoticeRule, 8> kNoticeRules{{{"is no number", "not-a-number"},
                                                  {"does not fit into", "bit-out-of-range"},
                                                  {"neither yes nor no", "yes-or-no"},
                                                  {"there is no board class", "unknown-class"},
                                                  {"there is no chip", "unknown-chip"},
                                                  {"there is no section", "unknown-base"},
                                                  {"malformed sequence entry", "malformed-sequence"},
                                                  {"", "unreadable"}}};

std::string_view RuleFor(const std::string& text) {
  return std::find_if(kNoticeRules.begin(), kNoticeRules.end(),
                      [&](const NoticeRule& rule) { return text.find(rule.words) != std::string::npos; })
      ->rule;
}

class BoardCheck {
 public:
  BoardCheck(const Files& files, const BoardFiles& names, platform::Host& machine, Findings& findings)
      : files_(files), names_(names), machine_(machine), findings_(findings) {}

  BoardKnowledge Run() {
    const std::vector<std::string> machines = MachinesOf(files_, names_);
    RehearsalWish wish;
    wish.withSources = false;
    wish.everything = true;
    for (std::size_t i = 0; i < machines.size() && i < kMostMachines; ++i) {
      const BoardPlan plan = Rehearse(files_, names_, machines[i], machine_, wish);
      CheckPlan(plan);
      lookUps_.insert(plan.lookUps.begin(), plan.lookUps.end());
    }
    if (machines.size() > kMostMachines) {
      findings_.Add("too-many-machines", files_.front().path, 1, 1,
                    "only the first " + std::to_string(kMostMachines) + " of " + std::to_string(machines.size()) +
                        " machines were tried");
    }
    CheckChains();
    CheckKeys();
    return std::move(knowledge_);
  }

 private:
  void Add(std::string_view rule, const IniOutline* file, const IniEntry* entry, const std::string& text) {
    if (file != nullptr && entry != nullptr) {
      findings_.Add(rule, file->path, entry->line, entry->valueColumn, text);
    }
  }

  // The entry that decided a key for a machine, in the order of the look-ups.
  std::pair<const IniOutline*, const IniEntry*> Deciding(const std::string& section, const std::string& key) const {
    for (const std::string& path : {names_.testPath, names_.detectPath}) {
      const IniOutline* const file = FileOf(files_, path);
      for (const std::string& place : {section, std::string("common")}) {
        const IniEntry* const entry = file == nullptr ? nullptr : file->Find(place, key);
        if (entry != nullptr && !entry->value.empty()) {
          return {file, entry};
        }
      }
    }
    return {nullptr, nullptr};
  }

  // Where something about a machine as a whole is told.
  void AddOfMachine(std::string_view rule, const std::string& machine, const std::string& text) {
    for (const char* const key : {"platform", "chips", "MotherboardClass"}) {
      if (const auto [file, entry] = Deciding(machine, key); entry != nullptr) {
        Add(rule, file, entry, text);
        return;
      }
    }
  }

  void CheckPlan(const BoardPlan& plan) {
    bool isExplained = false;
    for (const std::string& notice : plan.notices) {
      const Told told = Located(notice, files_);
      if (told.entry != nullptr) {
        isExplained = true;
        Add(RuleFor(told.text), told.file, told.entry, WithNearestChip(told.text));
      } else if (notice.find("cannot be lit") == std::string::npos &&
                 notice.find("is not known") == std::string::npos) {
        AddOfMachine("unreadable", plan.systemId, "[" + plan.systemId + "] " + notice);
      }
    }
    if (!plan.failure.empty() && !isExplained) {
      AddOfMachine("board-fails", plan.systemId, "[" + plan.systemId + "] cannot be built: " + plan.failure);
    }
    for (const LedPlan& led : plan.leds) {
      CheckLed(plan, led);
    }
    CheckSameBits(plan);
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

  static std::string WithNearest(std::string text, const std::string& name, const std::vector<std::string>& known) {
    const std::string nearest = Nearest(name, known);
    if (nearest.empty()) {
      return text;
    }
    if (text.ends_with('.')) {
      text.pop_back();
    }
    return text + "; is \"" + nearest + "\" meant?";
  }

  static std::vector<std::string> ChipNames() {
    std::vector<std::string> names;
    for (const ChipRow& row : ChipRows()) {
      names.emplace_back(row.name);
    }
    return names;
  }

  void CheckLed(const BoardPlan& plan, const LedPlan& led) {
    const auto [file, entry] = Deciding(plan.systemId, std::string(led.led->chipKey));
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
      Add("on-without-off", file, entry, title + " can be lit and not darkened: the chip has no keys for it");
    }
    if (const PlannedStep* const save = led.Find("save");
        !led.leftChanged.empty() && led.blinksByItself && save != nullptr && save->answer &&
        ChipOf(plan, *led.led).starts_with("g_")) {  // whose save list stands in a file
      std::string registers;
      for (const ImaginedHardware::Cell& cell : led.leftChanged) {
        registers += (registers.empty() ? "" : ", ") + Hex(cell.address);
      }
      Add("not-saved", file, entry, title + ": the blink changes " + registers + ", which no save list has");
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
      Add("led-not-lit", file, &entry,
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
    const auto [file, entry] = Deciding(plan.systemId, std::string(led.chipKey));
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
          const auto [file, entry] = Deciding(plan.systemId, std::string(second->led->chipKey));
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

  // Chains of base sections, and the sections that chips are bound to.
  void CheckChains() {
    const IniOutline* const chip = FileOf(files_, names_.chipPath);
    if (chip == nullptr) {
      return;
    }
    for (const IniSection& section : chip->sections) {
      std::set<std::string> visited{LoweredName(section.name)};
      const IniEntry* base = chip->Find(section.name, "base");
      while (base != nullptr && !base->value.empty()) {
        if (!chip->HasSection(base->value)) {
          Add("unknown-base", chip, base,
              WithNearest("there is no section [" + base->value + "]", base->value, SectionNames(*chip)));
          break;
        }
        if (!visited.insert(LoweredName(base->value)).second) {
          if (LoweredName(base->section) == LoweredName(section.name) || base->value == section.name) {
            Add("base-cycle", chip, base, "the chain of base sections comes back to [" + base->value + "]");
          }
          break;
        }
        base = chip->Find(base->value, "base");
      }
    }
    for (const IniOutline& file : files_) {
      for (const IniEntry& entry : file.entries) {
        const std::string key = LoweredName(entry.key);
        if (&file != chip && key.starts_with("chip.") && key.ends_with(".data") && !entry.value.empty() &&
            !chip->HasSection(CDMUtil::Trim(entry.value.substr(0, entry.value.find(';'))))) {
          Add("unknown-section", &file, &entry,
              WithNearest(chip->path + " has no section [" + entry.value + "]", entry.value, SectionNames(*chip)));
        }
      }
    }
  }

  static std::vector<std::string> SectionNames(const IniOutline& file) {
    std::vector<std::string> names;
    for (const IniSection& section : file.sections) {
      names.push_back(section.name);
    }
    return names;
  }

  // Gathered for the first key that the machines of the files did not look up.
  const KnownKeys& Known() { return known_ ? *known_ : known_.emplace(names_, machine_); }

  // Keys that nothing reads.
  void CheckKeys() {
    std::set<std::string> readKeys;      // in a chip file, whatever the section
    std::set<std::string> readSections;  // of the chip file
    for (const LookUp& lookUp : lookUps_) {
      if (lookUp.path == names_.chipPath) {
        readKeys.insert(lookUp.key);
        readSections.insert(lookUp.section);
      }
    }
    for (const IniOutline& file : files_) {
      const bool isChipFile = file.path == names_.chipPath;
      std::set<std::string> toldSections;
      for (const IniEntry& entry : file.entries) {
        const std::string key = LoweredName(entry.key);
        const std::string section = LoweredName(entry.section);
        if (!entry.isFirst || entry.key.starts_with('#') || entry.key.starts_with("//")) {
          continue;
        }
        if (isChipFile ? readKeys.contains(key) && readSections.contains(section)
                       : lookUps_.contains({file.path, section, key}) || KnownKeys::IsReadElsewhere(key)) {
          continue;
        }
        if (Known().IsKnown(key, isChipFile)) {
          if (isChipFile && readSections.contains(section)) {
            continue;  // of another class that may use this section
          }
          if (isChipFile) {
            if (toldSections.insert(section).second) {
              findings_.Add("unused-section", file.path, entry.line, 1,
                            "no board of the files uses section [" + entry.section + "]");
            }
          } else if (section != "common") {
            findings_.Add("unused-key", file.path, entry.line, entry.column,
                          "the board of [" + entry.section + "] does not read \"" + entry.key + "\"");
          }
          continue;
        }
        findings_.Add("unknown-key", file.path, entry.line, entry.column,
                      WithNearest("nothing reads a key \"" + entry.key + "\"", key, Known().All(isChipFile)));
      }
    }
  }

  const Files& files_;
  const BoardFiles& names_;
  platform::Host& machine_;
  Findings& findings_;
  std::set<LookUp> lookUps_;
  std::optional<KnownKeys> known_;
  BoardKnowledge knowledge_;
};

}  // namespace

BoardKnowledge CheckBoards(const std::vector<IniOutline>& files, const BoardFiles& names, platform::Host& machine,
                           Findings& findings) {
  return BoardCheck(files, names, machine, findings).Run();
}

}  // namespace panelglow::boardtool
