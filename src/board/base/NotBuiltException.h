// A board class or a chip that the board's files name by its right name and that this version of the program does not
// have. Nothing else may be tried in its place: the hardware is another one.
#pragma once

#include "board/base/mblib_exception.h"

namespace panelglow {

class NotBuiltException : public mblib_exception {
 public:
  using mblib_exception::mblib_exception;
};

}  // namespace panelglow
