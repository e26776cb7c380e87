// What a chip's temperature zones are, as registers of its hardware monitor. Zones count from 1.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "board/parts/FanTable.h"

namespace panelglow {

struct ZoneTable {
  std::vector<RegisterId> zones = {};
  std::string badZoneText = {};          // to standard output for a zone without a row; "%d" is its number
  std::optional<int> badZoneValue = {};  // given for such a zone; nothing: the value stays as it was
  std::vector<RegisterPair> lowLimits = {};
  PairOrder limitOrder = PairOrder::kLowFirst;
  std::string badLimitText = {};
};

}  // namespace panelglow
