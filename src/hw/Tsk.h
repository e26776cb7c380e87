// Which model of machine this is: the 16-bit system id on which every model decision rests, and look-ups in the
// firmware's structure table through the driver.
#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <string_view>

namespace panelglow {

/// The system id: the leading hexadecimal digits of the base board's product text. True when it is not 0; `id` is
/// always written.
bool Tsk_GetSystemID(std::uint16_t& id);

/// The first structure of a type in the firmware's table, to the table's end; empty when there is none. The table is
/// read once per process, at the first call.
std::span<const std::uint8_t> Tsk_FindSmbiosStructure(std::uint8_t type);

/// The string of a 1-based number in such a structure; index 0 gives an empty one.
std::string Tsk_GetSmbiosString(std::span<const std::uint8_t> structure, std::uint8_t index);

/// The number that a product text stands for: leading hexadecimal digits count, anything else stops; 16 bits kept.
std::uint16_t SystemIdOf(std::string_view productText);

}  // namespace panelglow
