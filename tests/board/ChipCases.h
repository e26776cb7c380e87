// What a chip class answers for an operation, and what it does on the hardware for it, row by row.
#pragma once

#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <vector>

#include "board/BoardBench.h"

namespace panelglow {

struct ChipCase {
  std::function<int(Chip&)> ask;
  int answer;
  std::string traffic;  // in order, as BoardBench::Traffic has it
};

/// The rows in their order, on one chip.
inline void ExpectCases(BoardBench& bench, Chip& chip, const std::vector<ChipCase>& cases) {
  for (std::size_t i = 0; i < cases.size(); ++i) {
    SCOPED_TRACE(chip.GetName() + " " + std::to_string(i));
    EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(cases[i].ask(chip), cases[i].answer); }), cases[i].traffic);
  }
}

}  // namespace panelglow
