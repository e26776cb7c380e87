// The dialog's workers, and what becomes of the operator's answers.
#include <algorithm>
#include <utility>

#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "ledtests/BlinkWorkers.h"
#include "ledtests/FrontPanelTest.h"
#include "ledtests/LedKind.h"
#include "ledtests/SuperDialog.h"
#include "platform/Host.h"

namespace panelglow {

namespace message = platform::message;
using platform::WindowHandle;

namespace {

platform::Clock& TheClock() { return platform::TheHost().clock; }

bool IsLockKey(std::int32_t deviceId) {
  return deviceId == kNumLock || deviceId == kCapsLock || deviceId == kScrollLock;
}

}  // namespace

// The drive entries share a start command: the one whose turn it is was chosen just before it was sent.
LEDStruct* SuperDialog::EntryFor(const LedKind& kind) {
  return kind.deviceId == kFirstHdGreen ? &test_.devices[static_cast<std::size_t>(test_.currentIndex)]
                                        : test_.FindDevice(kind.deviceId);
}

void SuperDialog::StartWorker(const LedKind& kind, LEDStruct& entry) {
  constexpr std::uint32_t kAfterLockKey_ms = 100;
  if (test_.workerThread != 0) {
    overrunning_.push_back(test_.workerThread);
  }
  test_.workerThread = platform::TheHost().threads.Start(
      "worker " + std::string(kind.function),
      [&test = test_, worker = kind.worker, owned = &entry] { RunBlinkWorker(worker, test, *owned); });
  if (IsLockKey(kind.deviceId)) {
    TheClock().Sleep(kAfterLockKey_ms);
  }
  if (test_.rules.writesLines) {
    CDMout::LogMessage(LogOptions::Status, kFreeText, std::string(kind.logName) + " Thread Exited.\n");
  }
}

// Every worker has been told to stop by now. One that is still putting its LED back is let do it; one that does not
// come to an end is ended: the device array is about to be filled anew.
void SuperDialog::EndWorkers() {
  constexpr std::uint32_t kLongestWait_ms = 3000;
  platform::Threads& threads = platform::TheHost().threads;
  test_.ResetAllParameters();
  overrunning_.push_back(std::exchange(test_.workerThread, 0));
  for (const platform::ThreadHandle worker : overrunning_) {
    if (!threads.Wait(worker, kLongestWait_ms)) {
      threads.Terminate(worker);
    }
    threads.Close(worker);
  }
  overrunning_.clear();
}

// ---- answers

const ButtonAnswer* SuperDialog::FindAnswer(std::uint32_t button) const {
  const std::vector<ButtonAnswer>& answers = test_.rules.answers;
  const auto found =
      std::find_if(answers.begin(), answers.end(), [&](const ButtonAnswer& row) { return row.button == button; });
  return found == answers.end() ? nullptr : &*found;
}

// Right when one of the button's LEDs is the one that blinks. One button may serve several drive LEDs.
std::intptr_t SuperDialog::Answer(WindowHandle window, const ButtonAnswer& answer) {
  for (const std::int32_t kind : answer.kinds) {
    const std::int32_t count = kind == kFirstHdGreen ? test_.hdCount : 1;
    for (std::int32_t id = kind; id < kind + count; ++id) {
      if (test_.ResetDeviceParameters(id)) {
        test_.WaitForThreadToFinish(id);
        test_.testResult = FrontPanelTest::kRightAnswer;
        PostCommand(window, kNextCommand);
        return 0;
      }
    }
  }
  return WrongAnswer(window);
}

// The code stays that of the LED which was blinking: it names the LED that was not recognised.
std::intptr_t SuperDialog::WrongAnswer(WindowHandle window) {
  test_.testResult = FrontPanelTest::kWrongAnswer;
  test_.ResetAllParameters();
  PostCommand(window, kLeaveCommand);
  return 1;
}

// Every way out comes through here, so that workers are told to stop and LEDs are left as found.
std::intptr_t SuperDialog::Leave(WindowHandle window) {
  if (test_.secondsTimer != 0) {
    desktop_.KillTimer(window, test_.secondsTimer);
  }
  for (int n = 0; n < test_.deviceCount; ++n) {
    LEDStruct& entry = test_.devices[static_cast<std::size_t>(n)];
    entry.running = false;
    if (entry.workerStarted || test_.rules.waitsForUnstarted) {
      AwaitEnd(n, entry);
    }
  }
  test_.exitDialog = true;
  desktop_.Post({window, message::kChar, 0, 1});  // wakes the message loop
  return -1;
}

void SuperDialog::AwaitEnd(int number, const LEDStruct& entry) {
  constexpr std::uint32_t kLongestWait_ms = 2000;
  constexpr std::uint32_t kPoll_ms = 100;
  const std::uint32_t begin = TheClock().TickCount();
  const auto log = [&](const char* text) {
    if (test_.rules.writesLines) {
      CDMout::LogMessage(
          LogOptions::Status, kFreeText,
          text + CDMUtil::ToString(number) + ", Finished: " + CDMUtil::ToString(bool{entry.workerFinished}));
    }
  };
  log("Exit_Window: DeviceID - ");
  while (!entry.workerFinished && TheClock().TickCount() - begin < kLongestWait_ms) {
    TheClock().Sleep(kPoll_ms);
    log("Exit_Window Sleeping: DeviceID - ");
  }
}

}  // namespace panelglow
