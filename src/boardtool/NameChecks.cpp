#include "boardtool/NameChecks.h"

#include <algorithm>
#include <iterator>

#include "boardtool/KnownKeys.h"
#include "harness/base/CDMUtil.h"

namespace panelglow::boardtool {

namespace {

class NameCheck {
 public:
  NameCheck(const std::vector<IniOutline>& files, const BoardFiles& names, platform::Host& machine,
            const Reached& reached, Findings& findings)
      : files_(files), names_(names), machine_(machine), reached_(reached), findings_(findings) {}

  void Run() {
    CheckUnselected();
    CheckChains();
    CheckKeys();
  }

 private:
  void Add(std::string_view rule, const IniOutline& file, const IniEntry& entry, const std::string& text) {
    findings_.Add(rule, file.path, entry.line, entry.valueColumn, text);
  }

  [[nodiscard]] const IniOutline* FileOf(const std::string& path) const {
    const auto found =
        std::find_if(files_.begin(), files_.end(), [&](const IniOutline& file) { return file.path == path; });
    return found == files_.end() ? nullptr : &*found;
  }

  // Sections of machines for which no file selects a board: mostly their name is misspelt in one of the files.
  void CheckUnselected() {
    for (const std::string& machine : reached_.unselected) {
      for (const IniOutline& file : files_) {
        const auto header = std::find_if(file.sections.begin(), file.sections.end(), [&](const IniSection& section) {
          return LoweredName(section.name) == LoweredName(machine);
        });
        if (file.path != names_.chipPath && header != file.sections.end()) {
          std::vector<std::string> lonely{"Common"};  // sections that the other file has alone
          for (const IniOutline& other : files_) {
            for (const IniSection& section : other.sections) {
              if (other.path != file.path && other.path != names_.chipPath && !file.HasSection(section.name)) {
                lonely.push_back(section.name);
              }
            }
          }
          const std::string nearest = Nearest(machine, lonely);
          findings_.Add("misspelt-section", file.path, header->line, header->column,
                        "no file selects a board for [" + machine + "] by \"platform\"" +
                            (nearest.empty() ? "" : "; is [" + nearest + "] meant?"));
        }
      }
    }
  }

  // Chains of base sections, and the sections that chips are bound to.
  void CheckChains() {
    const IniOutline* const chip = FileOf(names_.chipPath);
    if (chip == nullptr) {
      return;
    }
    for (const IniSection& section : chip->sections) {
      std::set<std::string> visited{LoweredName(section.name)};
      const IniEntry* base = chip->Find(section.name, "base");
      while (base != nullptr && !base->value.empty()) {
        if (!chip->HasSection(base->value)) {
          Add("unknown-base", *chip, *base,
              WithNearest("there is no section [" + base->value + "]", base->value, SectionNames(*chip)));
          break;
        }
        if (!visited.insert(LoweredName(base->value)).second) {
          if (LoweredName(base->section) == LoweredName(section.name) || base->value == section.name) {
            Add("base-cycle", *chip, *base, "the chain of base sections comes back to [" + base->value + "]");
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
          Add("unknown-section", file, entry,
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
  const KnownKeys& Known() { return KnownKeys::Once(machine_); }

  // Keys that nothing reads.
  void CheckKeys() {
    std::set<std::string> readKeys;      // in a chip file, whatever the section
    std::set<std::string> readSections;  // of the chip file
    for (const LookUp& lookUp : reached_.lookUps) {
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
                       : reached_.lookUps.contains({file.path, section, key}) || KnownKeys::IsReadElsewhere(key)) {
          continue;
        }
        if (Known().IsKnown(key, isChipFile)) {
          if (isChipFile && readSections.contains(section)) {
            continue;  // of another class that may use this section
          }
          if (isChipFile) {
            if (toldSections.insert(section).second) {
              AddUnused(file, entry, readSections);
            }
          } else if (section != "common" && !reached_.unbuilt.contains(section)) {
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

  void AddUnused(const IniOutline& file, const IniEntry& entry, const std::set<std::string>& readSections) {
    std::vector<std::string> wanted;  // and not there
    std::copy_if(readSections.begin(), readSections.end(), std::back_inserter(wanted),
                 [&](const std::string& name) { return !file.HasSection(name); });
    const std::string nearest = Nearest(LoweredName(entry.section), wanted);
    if (nearest.empty()) {
      findings_.Add("unused-section", file.path, entry.line, 1,
                    "no board of the files uses section [" + entry.section + "]");
      return;
    }
    const auto header = std::find_if(file.sections.begin(), file.sections.end(),
                                     [&](const IniSection& section) { return section.name == entry.section; });
    findings_.Add("misspelt-section", file.path, header->line, header->column,
                  "no board of the files uses section [" + entry.section + "]; is [" + nearest + "] meant?");
  }

  const std::vector<IniOutline>& files_;
  const BoardFiles& names_;
  platform::Host& machine_;
  const Reached& reached_;
  Findings& findings_;
};

}  // namespace

std::string WithNearest(std::string text, const std::string& name, const std::vector<std::string>& known) {
  const std::string nearest = Nearest(name, known);
  if (nearest.empty()) {
    return text;
  }
  if (text.ends_with('.')) {
    text.pop_back();
  }
  return text + "; is \"" + nearest + "\" meant?";
}

void CheckNames(const std::vector<IniOutline>& files, const BoardFiles& names, platform::Host& machine,
                const Reached& reached, Findings& findings) {
  NameCheck(files, names, machine, reached, findings).Run();
}

}  // namespace panelglow::boardtool
