// The board of the machine that the program runs on, built as the tests build it.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "board/MotherBoard.h"
#include "boardtool/Installation.h"

namespace panelglow::boardtool {

class BoardOnMachine {
 public:
  /// Throws CannotRun, in a sentence that says what to do, without a driver, without files, for a machine that the
  /// files do not know, and for a board that cannot be built. Waits for a test that has the board.
  explicit BoardOnMachine(const std::string& folder);

  [[nodiscard]] MotherBoard& Board() { return *board_; }
  [[nodiscard]] const std::string& SystemId() const { return systemId_; }
  [[nodiscard]] const BoardFiles& Names() const { return names_; }
  [[nodiscard]] const std::vector<IniOutline>& Files() const { return files_; }

  /// The names of the chips that were built.
  [[nodiscard]] std::vector<std::string> Chips();

 private:
  BoardFiles names_;
  std::vector<IniOutline> files_;
  std::string systemId_;
  std::unique_ptr<MotherBoard> board_;
};

/// The system id of this machine's firmware; empty when it tells none.
std::string MachineId();

/// Names of the chips that a board has.
std::vector<std::string> ChipsOf(MotherBoard& board);

/// Why an operation failed; empty when it did not.
std::string FailureOf(const std::function<void()>& operation);

}  // namespace panelglow::boardtool
