// Uses the power LED as a signal lamp: blinks it for a given time and ends. There is no operator and no verdict.
#pragma once

#include "harness/CDMDiag.h"

namespace panelglow {

class LEDStatusIndicator : public CDMDiag {
 public:
  LEDStatusIndicator();
  ~LEDStatusIndicator() override = default;

  /// True at any end of the blink. Throws a new CDMException on a machine whose board is not known.
  bool Run() override;
};

}  // namespace panelglow
