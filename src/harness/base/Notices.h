// What is told to people and not to the controller: standard error, one sentence a line, that says what was found,
// where, and what to do about it. Standard output stays the protocol.
#pragma once

#include <string_view>

namespace panelglow {

class Notices {
 public:
  virtual ~Notices() = default;

  /// Writes "panelglow-diags: <sentence>" as one line; line ends and other control characters in the sentence become
  /// blanks. A sentence that was told before is not told again: a board is built anew for every LED, and its INI file
  /// does not get better. May be called from any thread; never throws for what it is given.
  static void Tell(std::string_view sentence);

  /// Lets every sentence be told again; for a process that runs one machine after the other, as tests do.
  static void Forget();
};

}  // namespace panelglow
