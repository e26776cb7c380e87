#include "ledtests/BlinkWorkers.h"

#include "harness/base/CDMout.h"
#include "ledtests/BlinkLoop.h"
#include "ledtests/FrontPanelTest.h"
#include "ledtests/PutBack.h"

namespace panelglow {

void RunBlinkWorker(BlinkWorker worker, FrontPanelTest& test, LEDStruct& entry) {
  ActAndLog([&] { worker(test, entry); });
}

// The LED that does not exist: time passes, and nothing blinks.
void CustomBlinkNoLED(FrontPanelTest& test, LEDStruct& entry) {
  const auto nothing = [] {};
  entry.workerStarted = true;
  BlinkLoop(entry, kPhase_ms, nothing, nothing);
  if (test.rules.writesLines) {
    CDMout::LogMessage(LogOptions::Status, kFreeText, "NoB Thread Exited");
  }
  entry.workerFinished = true;
}

}  // namespace panelglow
