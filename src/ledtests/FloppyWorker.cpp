// The worker of a floppy drive's LED, which is lit while the motor of drive A runs.
#include <cstdint>

#include "ledtests/BlinkLoop.h"
#include "ledtests/BlinkWorkers.h"
#include "ledtests/FrontPanelTest.h"
#include "ledtests/PutBack.h"

namespace panelglow {

namespace {

constexpr std::uint16_t kDigitalOutput = 1010;  // 0x3F2, the controller's digital output register (DOR)
constexpr std::uint8_t kMotorA = 28;            // 0x1C: motor A, controller on, DMA on
constexpr std::uint8_t kNothing = 0;

}  // namespace

void CustomBlinkFloppyLED(FrontPanelTest& test, LEDStruct& entry) {
  entry.workerStarted = true;
  {
    const PutBack off([&] { test.driver.OutportByte(kDigitalOutput, kNothing); });
    BlinkLoop(
        entry, kPhase_ms, [&] { test.driver.OutportByte(kDigitalOutput, kMotorA); },
        [&] { test.driver.OutportByte(kDigitalOutput, kNothing); });
  }
  entry.workerFinished = true;
}

}  // namespace panelglow
