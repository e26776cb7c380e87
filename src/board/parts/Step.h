// What a procedure of a data sheet does to a register, as a row: "register = (nothing, itself or its saved value, and
// keep) or set".
#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "board/parts/RegisterFile.h"
#include "board/parts/SavedRegisters.h"

namespace panelglow {

enum class From : std::uint8_t { kNothing, kRegister, kSaved };

struct Step {
  RegisterId id;
  From from = From::kNothing;
  std::uint8_t keep = 0;  // bits of the old value that stay
  std::uint8_t set = 0;   // bits that are set
};
using Steps = std::vector<Step>;

// The rows in words.

/// The register becomes `value`; it is not read.
constexpr Step Put(RegisterId id, std::uint8_t value) { return {id, From::kNothing, 0, value}; }

/// The register is read and changed.
constexpr Step Change(RegisterId id, std::uint8_t keep, std::uint8_t set) { return {id, From::kRegister, keep, set}; }
constexpr Step SetBits(RegisterId id, std::uint8_t bits) { return Change(id, 0xFF, bits); }
constexpr Step ClearBits(RegisterId id, std::uint8_t bits) { return Change(id, static_cast<std::uint8_t>(~bits), 0); }

/// The register becomes its saved value, changed; it is not read.
constexpr Step FromSaved(RegisterId id, std::uint8_t keep, std::uint8_t set) { return {id, From::kSaved, keep, set}; }

/// The steps in order.
void Run(std::span<const Step> steps, RegisterFile& file, const SavedRegisters& saved);

/// Steps that need no saved values.
void Run(std::span<const Step> steps, RegisterFile& file);

}  // namespace panelglow
