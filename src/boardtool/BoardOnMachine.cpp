#include "boardtool/BoardOnMachine.h"

#include "board/ChipTable.h"
#include "board/base/BoardDevio.h"
#include "boardtool/Machine.h"
#include "harness/base/CDMException.h"
#include "hw/SMBIOSDiscovery.h"

namespace panelglow::boardtool {

std::string FailureOf(const std::function<void()>& operation) {
  try {
    operation();
  } catch (const std::exception& failure) {
    return failure.what();
  } catch (const CDMException& failure) {
    return "failure " + std::to_string(failure.code);
  } catch (const std::string& failure) {
    return failure;
  }
  return {};
}

std::string MachineId() {
  std::string id;
  FailureOf([&] { id = SMBIOSDiscovery::Instance().GetProductText(); });
  return id;
}

std::vector<std::string> ChipsOf(MotherBoard& board) {
  std::vector<std::string> chips;
  for (const ChipRow& row : ChipRows()) {
    if (row.place != kPlainChipPlace && board.GetChip(std::string(row.name)).GetName() == row.name) {
      chips.emplace_back(row.name);
    }
  }
  return chips;
}

BoardOnMachine::BoardOnMachine(const std::string& folder)
    : names_(BoardFilesIn(folder)), files_(ReadBoardFiles(names_)), systemId_(MachineId()) {
  // Anew: a rehearsal may have had it.
  if (!BoardDevio().LoadDriver()) {
    throw CannotRun(IsSimulated()
                        ? "the simulated machine has no driver: name one with --machine"
                        : "no driver on this machine, so its hardware cannot be reached: \"explain\" and "
                          "\"check\" need none, and panelglow-board-sim --machine FILE has a simulated one");
  }
  const std::string failure = FailureOf([&] {
    board_ = MotherBoard::Instantiate(names_.detectPath, names_.testPath, names_.chipPath, "platform", "");
    if (board_ == nullptr) {
      board_ = MotherBoard::Instance(names_.detectPath);
    }
  });
  if (!failure.empty()) {
    throw CannotRun("the board " + systemId_ + " cannot be built: " + failure + "; \"check\" says more");
  }
  if (board_ == nullptr) {
    throw CannotRun("the files select no board for the system id \"" + systemId_ + "\": give " + names_.detectPath +
                    " a section of this name");
  }
}

std::vector<std::string> BoardOnMachine::Chips() { return ChipsOf(*board_); }

}  // namespace panelglow::boardtool
