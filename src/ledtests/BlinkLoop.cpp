#include "ledtests/BlinkLoop.h"

#include "ledtests/LEDStruct.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr int kMostCycles = 50;

}  // namespace

void BlinkLoop(const LEDStruct& entry, std::uint32_t phase_ms, const std::function<void()>& switchOn,
               const std::function<void()>& switchOff) {
  BlinkLoop(entry, phase_ms, phase_ms, switchOn, switchOff);
}

void BlinkLoop(const LEDStruct& entry, std::uint32_t on_ms, std::uint32_t off_ms,
               const std::function<void()>& switchOn, const std::function<void()>& switchOff) {
  platform::Clock& clock = platform::TheHost().clock;
  for (int cycle = 0; cycle < kMostCycles && entry.running; ++cycle) {
    try {
      switchOn();
      clock.Sleep(on_ms);
      switchOff();
    } catch (const platform::ThreadTerminated&) {
      switchOff();  // undisturbed now
      throw;
    }
    clock.Sleep(off_ms);
  }
}

}  // namespace panelglow
