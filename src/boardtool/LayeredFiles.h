// The three board files in the order in which the board library looks a key up.
#pragma once

#include <string>
#include <vector>

#include "boardtool/IniOutline.h"
#include "boardtool/Rehearsal.h"

namespace panelglow::boardtool {

/// An entry with the file that it stands in; null where there is none.
struct PlacedEntry {
  const IniOutline* file = nullptr;
  const IniEntry* entry = nullptr;

  explicit operator bool() const { return entry != nullptr; }
  /// What the library makes of the value: without comment and blanks. Empty where there is no entry.
  [[nodiscard]] std::string Value() const;
  [[nodiscard]] bool IsUndefined() const { return LoweredName(Value()) == "undef"; }
};

class LayeredFiles {
 public:
  /// Both stay where they are while this object lives.
  LayeredFiles(const std::vector<IniOutline>& files, const BoardFiles& names) : files_(files), names_(names) {}

  /// Null for a file that could not be read.
  [[nodiscard]] const IniOutline* File(const std::string& path) const;
  [[nodiscard]] const IniOutline* ChipFile() const { return File(names_.chipPath); }

  /// The entry that decides a key for a machine.
  [[nodiscard]] PlacedEntry Board(const std::string& machine, const std::string& key) const;

  /// The entry that decides a key of a section of the chip file: the machine's own, or the first along the bases.
  [[nodiscard]] PlacedEntry Chip(const std::string& machine, const std::string& section,
                                 const std::string& key) const;

  /// The section of the chip file that a machine's chip is bound to.
  [[nodiscard]] std::string SectionOf(const std::string& machine, const std::string& chip) const;

 private:
  const std::vector<IniOutline>& files_;
  const BoardFiles& names_;
};

}  // namespace panelglow::boardtool
