// The temperature zones of a board: which there are, how they are read, and whether they are too hot or too cold.
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <utility>
#include <vector>

#include "board/sets/ChipFinder.h"
#include "board/sets/TempZone.h"

namespace panelglow {

class XmlObject;

/// How a test of temperatures goes; the test itself keeps to it.
struct ProbeSettings {
  int rate_s = 10;           // between two readings of a zone
  int consecutiveHigh = 1;   // checks in a row that make a zone too hot
  int consecutiveLow = 1;    // ... or too cold
  int retriesOnInvalid = 1;  // readings that may be none
};

/// The steps of a check, for a board class that does one in a way of its own. An empty one is the set's.
struct ZoneSteps {
  std::function<int(int zone)> read;
  std::function<int(int zone)> prochot;
  std::function<int(int zone)> high;
  std::function<int(int zone)> low;
};

/// Zones are named by their number, from 1 in the order of the list; a number without a zone is false, or a reading
/// or limit that is none, and touches nothing.
class ZoneSet {
 public:
  explicit ZoneSet(ChipFinder finder, ZoneSteps ways = {}) : chipOf(std::move(finder)), steps(std::move(ways)) {}

  /// The chip of zones that name none, in place of the files' own word for it.
  void PresetChip(std::string name) { presetChip = std::move(name); }

  /// Reads zones and probe settings from the files, in place of those before; their groups go. Throws what the chips
  /// throw of whose thresholds limits are made.
  bool Load();

  /// Puts zones there that come from elsewhere; the groups go.
  void Take(std::vector<TempZone> list, const ProbeSettings& settings);

  /// Reads the groups; the zones are loaded first. Throws mblib_exception for one that is empty or names a zone that
  /// there is not, and the groups stay as they were.
  bool LoadGroups();

  [[nodiscard]] const std::vector<TempZone>& List() const { return zones; }
  [[nodiscard]] const std::vector<ZoneGroup>& Groups() const { return groups; }
  [[nodiscard]] int Count() const { return static_cast<int>(zones.size()); }

  /// Null for a number without a zone. Good until the next load.
  [[nodiscard]] const TempZone* Find(int zone) const;

  [[nodiscard]] const ProbeSettings& Probe() const { return probe; }
  void SetProbeRate(int seconds) { probe.rate_s = seconds; }

  /// When the zones were loaded, for logs.
  [[nodiscard]] const std::string& StartTime() const { return startTime; }

  [[nodiscard]] bool IsSkipped(int zone) const;
  bool SetSkipped(int zone, bool skip);

  /// A reading in degrees; kFirstInvalidReading and above is none.
  int Read(int zone);

  /// Reads the zone and judges it; true when at least one limit applied. A reading that is none is false and only
  /// counted as such.
  bool Check(int zone, ZoneCheck& check);

  // The parts of a check: the reading (false when it is none), and what the last reading is by the one limit and by
  // the other (false when there is no such limit). However often a reading is judged, it counts once.
  bool Measure(int zone, int& value);
  bool JudgeHigh(int zone, bool& high);
  bool JudgeLow(int zone, bool& low);

  /// Whether the processor has throttled itself: 1 at the low threshold, 3 at the high one, else 0.
  int ReadProchot(int zone);

  // The limits of a zone; kNoLimit when it has none.
  int GetHigh(int zone);
  int GetLow(int zone) const;

 private:
  [[nodiscard]] TempZone* At(int zone);
  [[nodiscard]] TempZone ReadZone(const std::string& prefix) const;
  [[nodiscard]] std::string ReadZoneChip(const std::string& prefix) const;
  void AddZone(TempZone zone, const std::string& prefix, std::vector<TempZone>& list) const;
  void LimitByChip(TempZone& zone, const std::string& prefix) const;

  ChipFinder chipOf;
  ZoneSteps steps;
  std::string presetChip;  // empty: the files say it
  std::vector<TempZone> zones;
  std::vector<ZoneGroup> groups;
  ProbeSettings probe;
  std::string startTime;
};

}  // namespace panelglow
