// Values of registers, taken before they are changed, put back in a chosen order.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <utility>
#include <vector>

#include "board/parts/RegisterFile.h"

namespace panelglow {

class SavedRegisters {
 public:
  /// Reads the registers in order, unless some are held. All or nothing: a save that is interrupted is none. A
  /// register that is listed twice is read twice; its first value counts.
  void SaveOnce(RegisterFile& file, std::span<const RegisterId> ids);

  /// Reads one register, unless it is held: for a save that changes registers on its way and must be able to put back
  /// what it has changed so far.
  void Keep(RegisterFile& file, RegisterId id);

  /// Writes the registers of `order` that are held, in that order.
  void Restore(RegisterFile& file, std::span<const RegisterId> order) const;

  [[nodiscard]] bool Holds() const { return !values.empty(); }
  [[nodiscard]] std::size_t Count() const { return values.size(); }

  /// The value of a register; 0 when it is not held.
  [[nodiscard]] std::uint8_t At(RegisterId id) const;

  /// Replaces the value of a register that is held.
  void Set(RegisterId id, std::uint8_t value);

  void Forget() { values.clear(); }

 private:
  [[nodiscard]] const std::uint8_t* Find(RegisterId id) const;

  std::vector<std::pair<RegisterId, std::uint8_t>> values;
};

}  // namespace panelglow
