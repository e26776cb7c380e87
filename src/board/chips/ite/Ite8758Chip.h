// A Super-I/O of the ITE line with three fans whose control and duty have a register each, at a configuration port of
// the files. Serves the chip name "ite_8758".
#pragma once

#include <string>

#include "board/chips/ite/IteChip.h"

namespace panelglow {

class Ite8758Chip : public IteChip {
 public:
  /// Reads the part's id.
  Ite8758Chip();

 protected:
  /// For a derived class, which then reads its own keys, sets its tables, and has the part identified: at its own
  /// port, not at the one of this class.
  explicit Ite8758Chip(std::string chipName);

  [[nodiscard]] std::uint8_t DutyOf(int value) const override;

  /// "hwmbar" and "cfgbar" with the beginning of the class's keys.
  void ReadBases(const std::string& prefix);

  /// Reads the part's id; of one that obeys its duty registers as it is, manual mode is left as it is.
  void Identify();
};

}  // namespace panelglow
