// The workers of LEDs at fixed registers: the lines are in software's hands for the loop, and given back behind it.
#include <cstdint>
#include <functional>

#include "ledtests/BlinkLoop.h"
#include "ledtests/BlinkWorkers.h"
#include "ledtests/FrontPanelTest.h"
#include "ledtests/PutBack.h"

namespace panelglow {

namespace {

constexpr std::uint32_t kLegacyHdPhase_ms = 1500;

using PortStep = void (LegacyPanelPorts::*)();

struct LegacyLed {
  std::uint32_t phase_ms;
  PortStep switchOn;
  PortStep switchOff;
};
constexpr LegacyLed kRedPower{kPhase_ms, &LegacyPanelPorts::CustomAssertRedPwrLed,
                              &LegacyPanelPorts::CustomDeassertPwrLeds};
constexpr LegacyLed kGreenPower{kPhase_ms, &LegacyPanelPorts::CustomAssertGreenPwrLed,
                                &LegacyPanelPorts::CustomDeassertPwrLeds};
constexpr LegacyLed kRedHd{kLegacyHdPhase_ms, &LegacyPanelPorts::CustomAssertRedHdLed,
                           &LegacyPanelPorts::CustomDeassertHdLed};

// `begin`: what comes between the change of mode and the loop.
void BlinkLegacyLed(FrontPanelTest& test, LEDStruct& entry, const LegacyLed& led,
                    const std::function<void(LegacyPanelPorts&)>& begin) {
  LegacyPanelPorts& ports = test.legacyPorts;
  {
    bool touched = false;
    const PutBack restore([&] {
      if (touched) {
        ports.CustomSetGreenPwrLedNativeMode();
        ports.CustomSetRedPwrLedNativeMode();
      }
    });
    touched = true;
    ports.CustomSetGreenPwrLedGpioMode();
    ports.CustomSetRedPwrLedGpioMode();
    begin(ports);
    entry.workerStarted = true;
    BlinkLoop(
        entry, led.phase_ms, [&] { (ports.*led.switchOn)(); }, [&] { (ports.*led.switchOff)(); });
  }
  entry.workerFinished = true;
}

}  // namespace

void CustomBlinkRedPowerLED_Legacy(FrontPanelTest& test, LEDStruct& entry) {
  BlinkLegacyLed(test, entry, kRedPower, [](LegacyPanelPorts&) {});
}

void CustomBlinkGreenPowerLED_Legacy(FrontPanelTest& test, LEDStruct& entry) {
  BlinkLegacyLed(test, entry, kGreenPower, [](LegacyPanelPorts&) {});
}

void CustomBlinkRedHDLED_Legacy(FrontPanelTest& test, LEDStruct& entry) {
  BlinkLegacyLed(test, entry, kRedHd, [](LegacyPanelPorts& ports) {
    ports.CustomDeassertHdLed();
    ports.CustomAssertRedPwrLed();
  });
}

}  // namespace panelglow
