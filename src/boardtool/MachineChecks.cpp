#include "boardtool/MachineChecks.h"

#include <algorithm>
#include <array>
#include <bit>
#include <map>
#include <set>
#include <vector>

#include "boardtool/HardwareAccess.h"
#include "harness/base/CDMUtil.h"

namespace panelglow::boardtool {

namespace {

constexpr unsigned kByte = 0xFF;
constexpr int kByteBits = 8;

// The chips whose lists hold masks for a byte.
constexpr std::array kMaskChips{"g_iospace", "g_memoryspace"};

struct SuperIo {
  std::string_view chip;
  bool hasExitKey;  // it is left by the bytes of a key
};
constexpr std::array<SuperIo, 4> kSuperIos{
    {{"g_fintek", true}, {"g_sio", true}, {"g_ite", false}, {"g_it8702", false}}};

// The first mask of each address in a list; what is malformed is another rule's.
std::map<std::uint32_t, unsigned> MasksOf(const PlacedEntry& list) {
  std::map<std::uint32_t, unsigned> masks;
  std::vector<std::string> entries;
  CDMUtil::Split(list.Value(), entries, ", ");
  for (const std::string& entry : entries) {
    const std::size_t colon = entry.find(':');
    const std::string mask = colon == std::string::npos ? std::string() : entry.substr(colon + 1);
    if (CDMUtil::IsInteger(entry.substr(0, colon)) && CDMUtil::IsInteger(mask)) {
      masks.try_emplace(CDMUtil::ToUnsignedLong(entry.substr(0, colon)), CDMUtil::ToUnsignedLong(mask) & kByte);
    }
  }
  return masks;
}

class MachineCheck {
 public:
  MachineCheck(const BoardPlan& plan, const LayeredFiles& files, const BoardFiles& names, Findings& findings)
      : plan_(plan), files_(files), names_(names), findings_(findings) {}

  void Run() {
    CheckMasks();
    CheckConfigKeys();
    for (const std::string& path : {names_.testPath, names_.detectPath}) {
      const IniOutline* const file = files_.File(path);
      for (const IniEntry& entry : file == nullptr ? std::vector<IniEntry>{} : file->entries) {
        if (entry.isFirst && LoweredName(entry.section) == LoweredName(plan_.systemId)) {
          CheckLimits(*file, entry);
          CheckChipOf(*file, entry);
        }
      }
    }
  }

 private:
  void Add(std::string_view rule, const IniOutline& file, const IniEntry& entry, const std::string& text) {
    findings_.Add(rule, file.path, entry.line, entry.valueColumn, text);
  }

  [[nodiscard]] bool HasChip(std::string_view chip) const {
    return std::find(plan_.chips.begin(), plan_.chips.end(), chip) != plan_.chips.end();
  }

  // A list that darkens keeps the bits of its masks, so that the LED's own bit is 0 in them.
  void CheckMasks() {
    for (const char* const chip : kMaskChips) {
      if (!HasChip(chip)) {
        continue;
      }
      for (const BoardLed& led : BoardLeds()) {
        const std::string prefix = std::string(led.chipPrefix);
        if (prefix.empty() || prefix == "wirelessled") {  // whose masks turn bits over
          continue;
        }
        const PlacedEntry on = files_.Chip(plan_.systemId, chip, prefix + ".assert.sequence");
        const PlacedEntry off = files_.Chip(plan_.systemId, chip, prefix + ".deassert.sequence");
        const std::map<std::uint32_t, unsigned> lit = MasksOf(on);
        for (const auto& [address, mask] : lit) {
          if (std::popcount(mask) == kByteBits - 1) {
            AddMask(on, mask, "an assert mask sets its bits, and this one sets all but the one bit");
          }
        }
        for (const auto& [address, mask] : MasksOf(off)) {
          const auto same = lit.find(address);
          if (std::popcount(mask) == 1 || (same != lit.end() && same->second == mask && mask != 0)) {
            AddMask(off, mask, "a deassert mask keeps its bits and clears all others, and this one keeps the LED's");
          }
        }
      }
    }
  }

  void AddMask(const PlacedEntry& list, unsigned mask, const std::string& why) {
    Add("inverted-mask", *list.file, *list.entry,
        why + "; is " + Hex(~mask & kByte) + " meant for " + Hex(mask) + "?");
  }

  // What a Super-I/O needs before it answers anything.
  void CheckConfigKeys() {
    for (const SuperIo& part : kSuperIos) {
      if (!HasChip(part.chip)) {
        continue;
      }
      const std::string section = files_.SectionOf(plan_.systemId, std::string(part.chip));
      std::string missing;
      for (const char* const key :
           {"config.index.port", "config.data.port", "config.mode.enter.sequence", "config.mode.exit.sequence"}) {
        const bool isNeeded = part.hasExitKey || std::string_view(key) != "config.mode.exit.sequence";
        if (isNeeded && !files_.Chip(plan_.systemId, section, key)) {
          missing += (missing.empty() ? "" : ", ") + std::string(key);
        }
      }
      if (!missing.empty()) {
        AddOfSection(section, missing);
      }
    }
  }

  void AddOfSection(const std::string& section, const std::string& missing) {
    const IniOutline* const file = files_.ChipFile();
    if (file == nullptr || !file->HasSection(section)) {
      return;
    }
    const auto found = std::find_if(file->sections.begin(), file->sections.end(), [&](const IniSection& one) {
      return LoweredName(one.name) == LoweredName(section);
    });
    findings_.Add(
        "config-keys", file->path, found->line, found->column,
        "[" + section + "] and its bases lack " + missing +
            ": the part is not opened, or left open, so that its LED stays dark and others of its ports fail");
  }

  // A low limit above the high limit of the same thing.
  void CheckLimits(const IniOutline& file, const IniEntry& entry) {
    constexpr std::array<std::pair<std::string_view, std::string_view>, 4> kPairs{
        {{"min", "max"},
         {"low", "high"},
         {"thresholdlow.fix", "threshold.fix"},
         {"lower_threshold", "upper_threshold"}}};
    const std::string key = LoweredName(entry.key);
    for (const auto& [low, high] : kPairs) {
      if (!key.ends_with(low)) {
        continue;
      }
      const std::string lowest = PlacedEntry{&file, &entry}.Value();
      const std::string highest =
          files_.Board(plan_.systemId, key.substr(0, key.size() - low.size()) + std::string(high)).Value();
      if (CDMUtil::IsInteger(lowest) && CDMUtil::IsInteger(highest) &&
          CDMUtil::ToInt64(lowest) > CDMUtil::ToInt64(highest)) {
        Add("crossed-limits", file, entry,
            lowest + " is above the highest value that is allowed, " + highest + ": nothing passes");
      }
    }
  }

  // A key of an LED that no key gives a chip, and that nothing lights.
  void CheckChipOf(const IniOutline& file, const IniEntry& entry) {
    const std::string key = LoweredName(entry.key);
    const std::string value = LoweredName(PlacedEntry{&file, &entry}.Value());
    if (plan_.className.empty() || value == "no" || value == "undef" || key.ends_with(".msgid")) {
      return;
    }
    for (const LedPlan& led : plan_.leds) {
      const std::string chipKey(led.led->chipKey);
      const std::string begin = chipKey.substr(0, chipKey.rfind('.') + 1);  // "test.powerled."
      const std::string name = begin.substr(begin.find('.'));               // ".powerled."
      const bool isOfLed =
          (key.starts_with(begin) && key != chipKey) ||
          (key.starts_with("chip.") && key.ends_with(".sequence") && key.find(name) != std::string::npos);
      const bool isLit = std::any_of(plan_.leds.begin(), plan_.leds.end(), [&](const LedPlan& other) {
        return other.led->chipKey == led.led->chipKey && other.IsLit();
      });
      if (isOfLed && !isLit && !files_.Board(plan_.systemId, chipKey)) {
        Add("led-without-chip", file, entry,
            "[" + plan_.systemId + "] has no key \"" + chipKey + "\", so that nothing drives this LED");
        return;
      }
    }
  }

  const BoardPlan& plan_;
  const LayeredFiles& files_;
  const BoardFiles& names_;
  Findings& findings_;
};

}  // namespace

void CheckMachine(const BoardPlan& plan, const LayeredFiles& files, const BoardFiles& names, Findings& findings) {
  MachineCheck(plan, files, names, findings).Run();
}

}  // namespace panelglow::boardtool
