// How fans, zones and detected devices come to the chips that serve them: by the names that the files give.
#pragma once

#include <functional>
#include <string>

#include "board/chips/Chip.h"

namespace panelglow {

/// The chip of a name; the plain chip, which can do nothing, for an empty or unknown one. The chip is the board's.
using ChipFinder = std::function<Chip&(const std::string& chipName)>;

/// Takes one line of a log, without its line end.
using LineSink = std::function<void(const std::string& line)>;

}  // namespace panelglow
