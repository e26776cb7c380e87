// The lock that keeps the machine's hood shut.
#pragma once

#include <string>
#include <utility>

#include "board/sets/ChipFinder.h"
#include "board/sets/ReadSettings.h"

namespace panelglow {

class HoodLock {
 public:
  /// Of Lock and Unlock: the files do not name both lines.
  static constexpr int kNoLines = -256;

  explicit HoodLock(ChipFinder finder) : chipOf(std::move(finder)) {}

  bool Load();

  /// Whether the machine has the lock, which Lock and Unlock rely on. False, and `present` stays, when no line tells.
  bool Read(bool& present);

  /// 1 when the lock moved, 0 when it did not or was not found by Read, kNoLines.
  int Lock();
  int Unlock();

 private:
  int Move(bool (Chip::*move)(int line, bool check), const LineSetting& line);

  ChipFinder chipOf;
  std::string presenceChip;
  LineSetting presence;
  bool reversed = false;
  std::string chip;  // that moves it
  LineSetting lockLine;
  LineSetting unlockLine;
  bool check = true;       // the line must show that it moved
  bool isPresent = false;  // as Read found it
};

}  // namespace panelglow
