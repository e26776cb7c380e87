// Buttons of the machine that a person is asked to press.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "board/sets/ChipFinder.h"

namespace panelglow {

struct TestButton {
  enum class DataType { kState, kStatus };

  std::string name;
  std::string chip;
  std::uint16_t address = 0;  // port of its register
  std::uint16_t offset = 0;   // ... counted from there
  std::uint32_t mask = 0;
  DataType dataType = DataType::kState;  // it is read as it is, or as what a latch remembers
  int gpio = -1;                         // its line; -1: it has none
  int stateGpio = -1;                    // ... in place of it where the state is read
  int statusGpio = -1;                   // ... where the status is
  bool reverseLogic = false;
};

/// Reads are false, and their results stay, without a button that was selected.
class TestButtons {
 public:
  explicit TestButtons(ChipFinder finder) : chipOf(std::move(finder)) {}

  bool Load();
  [[nodiscard]] const std::vector<TestButton>& List() const { return buttons; }

  /// Makes a button the one that is read; false, and the selection stays, for a name that there is not.
  bool Select(const std::string& name);

  /// Selects, and reads what the button's data type says.
  bool GetState(const std::string& name, bool& pressed);

  /// The level of its line, or of its status bit, which is cleared; as it stands.
  bool ReadDirect(bool& value);

  /// The same, turned over for a button of reversed logic.
  bool Read(bool& pressed);

  /// Its latched status bit, which is cleared.
  bool ReadLatch(bool& value);

 private:
  ChipFinder chipOf;
  std::vector<TestButton> buttons;
  std::optional<TestButton> current;
};

}  // namespace panelglow
