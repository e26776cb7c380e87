// The sibling of CustomLEDTest whose LEDs are chosen by parameters, and whose 24 buttons are fixed. The operator
// starts it by the dialog's start button.
#pragma once

#include <array>
#include <set>
#include <string>
#include <string_view>

#include "ledtests/FrontPanelTest.h"

namespace panelglow {

class LEDTest : public FrontPanelTest {
 public:
  static constexpr std::size_t kButtons = 24;

  LEDTest();
  ~LEDTest() override;

  /// True when all LEDs passed in some attempt, false when the last one failed. Throws a new CDMException in all
  /// other cases.
  bool Run() override;

  /// Captions of the buttons, in grid order.
  static std::array<wstring, kButtons> _sButtonArr;

 private:
  void PrepareAttempt() override;
  void BeforeAttempt() override;

  void ReadArguments();
  void CheckSelection() const;
  void PrepareDeviceArray(MotherBoard* board);
  void InitializeButtonArray(bool hasBoard);
  void MakeDialogRules();

  std::set<std::string, std::less<>> selected;  // functions of the LEDs to be tested
  bool acknowledgeRetry = false;
  int retryPrompt = 0;
};

/// The driver client of this test's legacy port code; built before main runs.
extern CDevio g_objDriverObject;

}  // namespace panelglow
