// What the parts of the Fintek line have in common whose fans follow a curve over the temperature: a duty is set by
// making the curve flat. No part of its own.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "board/chips/fin/FinChip.h"

namespace panelglow {

class FinCurveChip : public FinChip {
 protected:
  /// The rows of `fans.duties` are the first registers of the curves.
  explicit FinCurveChip(std::string chipName);

  /// With `takesAllFans`, 0 and less are all fans, the last one first.
  bool WriteDuty(int fan, int value) override;

  /// The registers of `others`, and `count` registers from each of `curves` on.
  static std::vector<RegisterId> WithCurves(const std::vector<std::uint8_t>& others,
                                            const std::vector<std::uint8_t>& curves, std::size_t count);

  bool takesAllFans = false;

 private:
  void Flatten(RegisterId curve, std::uint8_t duty);
};

}  // namespace panelglow
