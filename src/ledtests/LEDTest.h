// The sibling of CustomLEDTest whose LEDs are chosen by arguments. Its parameters are declared; its run is still to
// be written, and ends with a failure that says so.
#pragma once

#include "harness/CDMDiag.h"

namespace panelglow {

class LEDTest : public CDMDiag {
 public:
  LEDTest();
  ~LEDTest() override = default;

  /// Throws a new CDMException: nothing is tested yet.
  bool Run() override;
};

}  // namespace panelglow
