// The worker of the touchpad's lock LED, which hangs on a property of the touchpad's own interface.
#include <cstdint>
#include <memory>

#include "harness/base/CDMout.h"
#include "ledtests/BlinkLoop.h"
#include "ledtests/BlinkWorkers.h"
#include "ledtests/LEDStruct.h"
#include "ledtests/PutBack.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::int32_t kAnyConnection = 0;
constexpr std::int32_t kTypeTouchpad = 2;
constexpr std::uint32_t kTouchpadLedProperty = 0x10000171;

std::unique_ptr<platform::TouchpadDevice> OpenTouchpad(platform::TouchpadApi& api) {
  std::int32_t handle = -1;
  if (!api.FindDevice(kAnyConnection, kTypeTouchpad, handle)) {
    return nullptr;
  }
  return api.OpenDevice(handle);
}

void BlinkTouchpad(LEDStruct& entry) {
  const std::unique_ptr<platform::TouchpadApi> api = platform::TheHost().touchpad.Create();
  if (!api) {
    CDMout::LogMessage(LogOptions::Debug, kFreeText, "Could not obtain a Synaptics API object.\n");
    return;
  }
  const std::unique_ptr<platform::TouchpadDevice> device = OpenTouchpad(*api);
  if (!device) {
    CDMout::LogMessage(LogOptions::Debug, kFreeText, "Unable to find a Synaptics TouchPad.\n");
    return;
  }
  entry.workerStarted = true;
  const auto set = [&](std::int32_t value) { device->SetProperty(kTouchpadLedProperty, value); };
  const PutBack off([&] { set(0); });
  BlinkLoop(
      entry, kPhase_ms, [&] { set(1); }, [&] { set(0); });
}

}  // namespace

void CustomBlinkTouchpadLED(FrontPanelTest& /*test*/, LEDStruct& entry) {
  CDMout::LogMessage(LogOptions::Status, kFreeText, "BTL: Method Start");
  BlinkTouchpad(entry);
  entry.workerFinished = true;
  CDMout::LogMessage(LogOptions::Status, kFreeText, "BTL: Method End");
}

}  // namespace panelglow
