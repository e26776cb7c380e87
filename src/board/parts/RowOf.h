// Tables whose rows are asked by a number that comes from a file.
#pragma once

#include <cstddef>
#include <iterator>

namespace panelglow {

/// The row of a number; null for one that the table does not have. `first` is the number of the first row.
template <class Table>
constexpr auto RowOf(const Table& table, int number, int first = 1) -> decltype(std::data(table)) {
  return number < first || static_cast<std::size_t>(number) - static_cast<std::size_t>(first) >= std::size(table)
             ? nullptr
             : std::data(table) + (number - first);
}

}  // namespace panelglow
