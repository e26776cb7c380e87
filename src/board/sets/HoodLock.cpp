#include "board/sets/HoodLock.h"

namespace panelglow {

bool HoodLock::Load() {
  presence = ReadLineNumber("detect.hoodlock.gpio");
  presenceChip = ReadChipName("detect.hoodlock.chip", "ich", chipOf, presence.isSet);
  reversed = ReadYesNo("detect.hoodlock.reversedlogic", false);
  lockLine = ReadLineNumber("test.hoodlock.gpio.lock");
  unlockLine = ReadLineNumber("test.hoodlock.gpio.unlock");
  chip = ReadChipName("test.hoodlock.chip", presenceChip, chipOf, lockLine.isSet && unlockLine.isSet);
  check = !SaysNo("test.hoodlock.check");
  isPresent = false;
  return true;
}

bool HoodLock::Read(bool& present) {
  if (!presence.isSet) {
    return false;
  }
  const int state = chipOf(presenceChip).ReadLine(presence.line);
  if (state == Chip::kNoSuchLine) {
    return false;
  }
  present = isPresent = (state == Chip::kAsserted) != reversed;
  return true;
}

// Nothing is locked that could not be unlocked again.
int HoodLock::Move(bool (Chip::*move)(int, bool), const LineSetting& line) {
  if (!isPresent) {
    return 0;
  }
  if (!lockLine.isSet || !unlockLine.isSet) {
    return kNoLines;
  }
  return (chipOf(chip).*move)(line.line, check) ? 1 : 0;
}

int HoodLock::Lock() { return Move(&Chip::LockHood, lockLine); }
int HoodLock::Unlock() { return Move(&Chip::UnlockHood, unlockLine); }

}  // namespace panelglow
