// The fans of a board: which there are, and how all of them are read and driven. A test of fans runs as: load, save
// and take over, choose a column, set speeds, wait, read, give back, write.
#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "board/sets/ChipFinder.h"
#include "board/sets/Fan.h"

namespace panelglow {

class XmlObject;

/// Fans are named by their number in the keys; a number without a fan is false and touches nothing. What reads,
/// drives, takes over or gives back all fans works on those that are present and under test, and is true when no chip
/// refused; it goes on with the next one when one throws, and throws that mblib_exception in the end.
class FanSet {
 public:
  explicit FanSet(ChipFinder finder) : chipOf(std::move(finder)) {}

  /// Reads the fans from the files, in place of those before; their groups go.
  bool Load();

  /// Puts fans there that come from elsewhere; the groups go.
  void Take(std::vector<Fan> list, std::uint32_t wait_ms);

  /// Reads the groups. Numbers without a fan are told to people and left out: the fans are loaded first.
  bool LoadGroups();

  /// Looks which fans are plugged in, and writes "true", "false" or "ERROR: device detection failed" into
  /// detectionStatus: by the fan's line where it has one, else by its tachometer. Fans that need a duty to turn get
  /// it for the stabilization wait, and are given back unless software had them before: then they keep it.
  bool Detect();

  [[nodiscard]] const std::vector<Fan>& List() const { return fans; }
  [[nodiscard]] const std::vector<FanGroup>& Groups() const { return groups; }

  /// Null for a number without a fan. Good until the next load.
  [[nodiscard]] const Fan* Find(int index) const;

  /// The column that the next readings go into; false, and nothing changes, for one that there is not.
  bool SetActiveReadingSet(std::uint32_t index);
  [[nodiscard]] std::uint32_t GetActiveReadingSet() const { return readingSet; }

  /// Overwrites the fans' own choice of tests where the files force one for the whole board.
  void SetTests(bool full, bool pwm, bool nominal);

  // Fans that their chip drives by a speed instead of a duty; 750 ms for each.
  void TakeControl();
  void ReleaseControl();

  // Once for each chip that has a fan under test; of the mode those that drive one.
  bool SetManualMode(bool on);
  bool SaveStates();
  bool RestoreStates();

  /// Reads every fan into the active column: 0 for one that stands or that its chip does not give, kNotRead when the
  /// chip throws.
  bool ReadAll();
  bool ReadOne(int index);

  bool SetAllFull();
  bool SetAllPwm();
  bool SetPwm(int index);

  /// Until speeds have settled: 5 s, or what the files say.
  void Wait() const;
  [[nodiscard]] std::uint32_t GetStabilizationWait() const { return stabilizationWait_ms; }

 private:
  /// What the files say of one test for the whole board.
  struct BoardTest {
    bool enabled = true;
    bool forced = false;
  };

  [[nodiscard]] static BoardTest ReadBoardTest(const char* key);
  [[nodiscard]] Fan ReadFan(int index) const;
  bool ReadInto(Fan& fan);
  [[nodiscard]] std::vector<Chip*> ChipsUnderTest(bool (*serves)(const Fan& fan));
  void DetectByTach(const std::vector<Fan*>& list);

  ChipFinder chipOf;
  std::vector<Fan> fans;
  std::vector<FanGroup> groups;
  std::uint32_t readingSet = 0;
  std::uint32_t stabilizationWait_ms = 5000;
  BoardTest nominalTest;
  BoardTest fullTest;
  BoardTest pwmTest;
};

}  // namespace panelglow
