// The board library at work without hardware: what it does for each LED of a board, in order, and which line of which
// file each request comes from. The library itself runs; nothing of it is written a second time.
#pragma once

#include <memory>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "boardtool/BoardLed.h"
#include "boardtool/HardwareAccess.h"
#include "boardtool/ImaginedHardware.h"
#include "boardtool/IniOutline.h"
#include "boardtool/RecordedProfiles.h"
#include "platform/Host.h"

namespace panelglow::boardtool {

/// The three files of a board, as they are looked up.
struct BoardFiles {
  std::string detectPath;
  std::string testPath;
  std::string chipPath;
};

/// A request of a step, with what its value is made of and where it comes from.
struct PlannedAccess {
  HardwareAccess access;
  std::uint64_t set = 0;   // bits of a written value that are 1 whatever the hardware holds
  std::uint64_t kept = 0;  // bits that are as they were read
  std::vector<const IniEntry*> from;
};

/// An operation of an LED.
struct PlannedStep {
  std::string name;     // "save", "blink", "on", "off", "restore"
  bool answer = false;  // of the board: false where it has no such thing
  std::vector<PlannedAccess> accesses;
};

struct LedPlan {
  const BoardLed* led = nullptr;
  std::string failure;  // why an operation ended by an exception; empty when none did
  bool blinksByItself = false;
  std::vector<PlannedStep> steps;
  std::vector<ImaginedHardware::Cell> leftChanged;  // bytes that are not as before once all was put back

  /// Null when there is no step of that name.
  [[nodiscard]] const PlannedStep* Find(std::string_view name) const;
  /// True when something lights it.
  [[nodiscard]] bool IsLit() const;
};

struct BoardPlan {
  std::string systemId;
  std::string className;  // empty: the files select no board
  std::string failure;    // why it could not be built; empty when it was
  std::vector<std::string> chips;
  std::vector<PlannedAccess> setUp;  // what building it does
  std::vector<LedPlan> leds;
  std::vector<std::string> notices;  // what people are told, a sentence each
  std::set<LookUp> lookUps;          // all that were made
  std::set<const IniEntry*> found;   // what they found
};

/// How much of a rehearsal is wanted.
struct RehearsalWish {
  const BoardLed* led = nullptr;  // only this one; null: all
  bool everything = false;        // all that a board can do, so that every key of its is looked up
  bool withSources = true;        // where each request comes from, which takes a run for each entry that was read
};

/// Runs the library for a board of these files. `files` holds what can be read, by the paths of `names`; `machine`
/// lends the services that are not called. One rehearsal at a time: the library's objects are the process's.
BoardPlan Rehearse(std::span<const IniOutline> files, const BoardFiles& names, const std::string& systemId,
                   platform::Host& machine, const RehearsalWish& wish = {});

}  // namespace panelglow::boardtool
