#include "boardtool/LayeredFiles.h"

#include <algorithm>
#include <set>

#include "harness/base/CDMUtil.h"

namespace panelglow::boardtool {

std::string PlacedEntry::Value() const {
  return entry == nullptr ? std::string() : CDMUtil::Trim(entry->value.substr(0, entry->value.find(';')));
}

const IniOutline* LayeredFiles::File(const std::string& path) const {
  const auto found =
      std::find_if(files_.begin(), files_.end(), [&](const IniOutline& file) { return file.path == path; });
  return found == files_.end() ? nullptr : &*found;
}

PlacedEntry LayeredFiles::Board(const std::string& machine, const std::string& key) const {
  for (const std::string& path : {names_.testPath, names_.detectPath}) {
    const IniOutline* const file = File(path);
    for (const std::string& place : {machine, std::string("common")}) {
      const IniEntry* const entry = file == nullptr ? nullptr : file->Find(place, key);
      if (entry != nullptr && !entry->value.empty()) {
        return {file, entry};
      }
    }
  }
  return {};
}

PlacedEntry LayeredFiles::Chip(const std::string& machine, const std::string& section, const std::string& key) const {
  if (const PlacedEntry own = Board(machine, "chip." + section + "." + key)) {
    return own;
  }
  const IniOutline* const file = ChipFile();
  std::set<std::string> visited;
  for (std::string place = section; file != nullptr && visited.insert(LoweredName(place)).second;) {
    if (const IniEntry* const entry = file->Find(place, key); entry != nullptr && !entry->value.empty()) {
      return {file, entry};
    }
    const IniEntry* const base = file->Find(place, "base");
    if (base == nullptr || base->value.empty()) {
      break;
    }
    place = PlacedEntry{file, base}.Value();
  }
  return {};
}

std::string LayeredFiles::SectionOf(const std::string& machine, const std::string& chip) const {
  const std::string named = Board(machine, "chip." + chip + ".data").Value();
  return named.empty() ? chip : named;
}

}  // namespace panelglow::boardtool
