// One temperature zone of a board: where it is read, what is too hot or too cold, and what was read. Degrees Celsius.
#pragma once

#include <string>
#include <vector>

namespace panelglow {

inline constexpr int kNoLimit = -9999;

/// Readings from here on are none; these two say who could not read.
inline constexpr int kFirstInvalidReading = 255;
inline constexpr int kChipReadFailed = 512;
inline constexpr int kFirmwareReadFailed = 513;  // a processor or the firmware

struct TempZone {
  int number = 0;  // of its keys; the cards that stand for one key share it
  std::string name;
  std::string chip;
  int index = 0;                  // the chip's number for it
  int thresholdAdj = 19;          // from the chip's low limit to a threshold
  int thresholdDelta = kNoLimit;  // from the chip's own threshold to the limit
  int thresholdFix = kNoLimit;    // a limit that goes ahead of all others
  std::string type = "cpu";       // or "gpu"
  int thresholdHigh = kNoLimit;
  int thresholdLow = kNoLimit;
  int thresholdLowFix = kNoLimit;
  int tjmaxDelta = kNoLimit;  // thresholdHigh is this far below what the processor allows itself
  bool cpuCore = false;       // the cores are read and judged one by one, too
  int coreHigh = kNoLimit;
  int coreTjmaxDelta = kNoLimit;
  int coreLow = kNoLimit;
  bool prochot = false;  // the chip latches that the processor has throttled itself
  std::string prochotChip;
  int prochotOffset = 0;
  std::string prochotLowBit;
  std::string prochotHighBit;
  bool skipped = false;
  int consecutiveHigh = 0;
  int consecutiveLow = 0;
  bool isHighCounted = false;  // the last reading is in the count
  bool isLowCounted = false;
  int invalidReadings = 0;
  int lastReading = kNoLimit;    // kNoLimit: nothing was read yet
  int lastHighLimit = kNoLimit;  // by which a reading was judged last; before it what the files give in degrees
  int maxReading = kNoLimit;
  int minReading = kNoLimit;
  std::vector<int> coreReadings;  // of the last reading
  int coreMax = kNoLimit;
  int coreMin = kNoLimit;
  std::string readingTime;  // "20260131 235959"
  int tjMax = kNoLimit;     // as the chip told it
  int prochotStatus = 0;    // the last one that was not 0
};

/// Zones that are tested together.
struct ZoneGroup {
  std::string name;
  std::vector<int> zones;  // their numbers in the list, from 1
};

/// What one check of a zone found.
struct ZoneCheck {
  int value = 0;  // the reading
  bool high = false;
  bool low = false;
  int consecutiveHigh = 0;
  int consecutiveLow = 0;
  int invalid = 0;        // readings so far that were none
  int prochotStatus = 0;  // 0: not throttled; 1: below the low threshold; 3: the high one
};

}  // namespace panelglow
