// The driver client that the board and all its chips share.
#pragma once

#include "hw/CDevio.h"

namespace panelglow {

/// Made at first use, kept to the end of the process.
CDevio& BoardDevio();

}  // namespace panelglow
