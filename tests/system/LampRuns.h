// Whole runs on a machine whose power lamp can be lit: what must hold of every such machine.
#pragma once

#include <string>
#include <vector>

#include "system/SystemRun.h"

namespace panelglow::systemtest {

/// Every occurrence of a text in a file of the installation, or in the machine's, which is "machine.toml".
struct Edit {
  std::string file;
  std::string right;
  std::string wrong;
};

struct Board {
  std::string machine;
  std::string section = "TwoColorPower";  // "Default": the lamp has one colour
  std::vector<Edit> edits = {};
  unsigned furtherSeed = 2;
  bool hasSignal = true;  // the status indicator can light and darken the lamp

  /// Which it is, for a failure's text: its machine, and what is edited in few words.
  [[nodiscard]] std::string Name() const;
};

/// Writes the board's files with `events` behind the machine's; the path of the latter.
std::string Prepare(const Installation& installation, const Board& board, const std::string& events = {});

/// Each lamp blinks at its turn and is put back.
void ExpectLampsBlink(const Board& board);

/// A run that is stopped while a lamp blinks puts it back: stopped from outside, at moments that fall into lit and
/// dark phases, and by the operator.
void ExpectStoppedRunsPutBack(const Board& board);

/// The status indicator blinks the green lamp and puts it back, or says that it cannot light it.
void ExpectSignal(const Board& board);

}  // namespace panelglow::systemtest
