// An operation on each of a list, of which one that fails does not keep the others from theirs.
#pragma once

#include <exception>

#include "board/base/mblib_exception.h"

namespace panelglow {

/// True when the operation was true for all. The first mblib_exception is thrown again behind the last of the list.
template <class List, class Operation>
bool EachOf(List&& list, Operation operation) {
  std::exception_ptr first;
  bool all = true;
  for (auto& entry : list) {
    try {
      all = operation(entry) && all;
    } catch (const mblib_exception&) {
      first = first ? first : std::current_exception();
    }
  }
  if (first) {
    std::rethrow_exception(first);
  }
  return all;
}

}  // namespace panelglow
