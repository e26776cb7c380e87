// What a chip class answers for an operation, and what it does on the hardware for it, row by row.
#pragma once

#include <gtest/gtest.h>

#include <functional>
#include <sstream>
#include <string>
#include <vector>

#include "board/BoardBench.h"

namespace panelglow {

struct ChipCase {
  std::function<int(Chip&)> ask;
  int answer;
  std::string traffic;  // in order, as BoardBench::Traffic has it
};

/// Registers behind two ports, as "0A05" and "0A06": "96->05 A6<-00" is a read and a write.
inline std::string Accesses(const std::string& index, const std::string& data, const std::string& accesses) {
  std::istringstream words(accesses);
  std::string traffic;
  for (std::string access; words >> access;) {
    traffic.append(index).append("<-").append(access, 0, 2).append(" ");
    traffic.append(data).append(access, 2).append(" ");
  }
  return traffic;
}

/// The rows in their order, on one chip.
inline void ExpectCases(BoardBench& bench, Chip& chip, const std::vector<ChipCase>& cases) {
  for (std::size_t i = 0; i < cases.size(); ++i) {
    SCOPED_TRACE(chip.GetName() + " " + std::to_string(i));
    EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(cases[i].ask(chip), cases[i].answer); }), cases[i].traffic);
  }
}

/// The power LED's operations in the order save, green, red, off, blink green, blink red, restore: the accesses of
/// each, which `traffic` makes requests of; "" for none, "-" where the answer is false.
inline void ExpectLed(BoardBench& bench, Chip& chip, const std::function<std::string(const std::string&)>& traffic,
                      const std::vector<std::string>& accesses) {
  constexpr bool (Chip::*kOperations[])() = {
      &Chip::SavePowerLedState,  &Chip::AssertPowerLedGreen, &Chip::AssertPowerLedRed,   &Chip::DeassertPowerLed,
      &Chip::BlinkPowerLedGreen, &Chip::BlinkPowerLedRed,    &Chip::RestorePowerLedState};
  std::vector<ChipCase> cases;
  for (std::size_t i = 0; i < accesses.size(); ++i) {
    const bool touches = !accesses[i].empty() && accesses[i] != "-";
    cases.push_back({kOperations[i], accesses[i] != "-", touches ? traffic(accesses[i]) : ""});
  }
  ExpectCases(bench, chip, cases);
}

}  // namespace panelglow
