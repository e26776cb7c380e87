// Which chip classes a board can have: the places of a board's chip list, in their fixed order, with the names that
// select them and how each class is built.
#pragma once

#include <cstddef>
#include <memory>
#include <span>
#include <string_view>

#include "board/chips/Chip.h"

namespace panelglow {

inline constexpr std::size_t kChipPlaces = 46;

/// Builds one chip class.
using ChipFactory = std::unique_ptr<Chip> (*)();

struct ChipRow {
  std::size_t place;  // 1 to 46
  std::string_view name;
  ChipFactory make;
};

/// All rows in the order in which names are compared. The two generic families have several rows for one place: the
/// first of them that a board lists is built.
std::span<const ChipRow> ChipRows();

/// The place of a chip name: 1, the plain chip, for an empty or unknown name.
std::size_t ChipPlaceOf(std::string_view name);

inline constexpr std::size_t kPlainChipPlace = 1;
inline constexpr std::size_t kGenericSuperIoPlace = 39;
inline constexpr std::size_t kGenericEcPlace = 40;

}  // namespace panelglow
