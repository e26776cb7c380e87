// The device array of CustomLEDTest: how it is filled for an attempt, and the look-ups that dialog and workers use.
#include <algorithm>
#include <cstdlib>
#include <utility>

#include "board/MotherBoard.h"
#include "harness/base/CDMUtil.h"
#include "ledtests/CustomLEDTest.h"
#include "ledtests/LedKind.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

// A LED that only some boards have: the board is asked.
using SupportQuestion = bool (MotherBoard::*)(bool&);

struct ArrayRow {
  std::string_view function;
  std::int32_t deviceId;
  SupportQuestion question;  // null: an active button is the claim that the LED exists
};

// The order before the shuffle. The drive LEDs stand between the first row and the second.
constexpr ArrayRow kArrayRows[] = {
    {"hdred", kHdRed, nullptr},
    {"scrolllock", kScrollLock, nullptr},
    {"capslock", kCapsLock, nullptr},
    {"numlock", kNumLock, nullptr},
    {"noled", kNoLed, nullptr},
    {"powerred", kPowerRed, &MotherBoard::IsPowerLedRedSupported},
    {"powergreen", kPowerGreen, nullptr},
    {"network", kNetwork, nullptr},
    {"touchpadlock", kTouchpad, nullptr},
    {"speakermute", kSpeakerMute, nullptr},
    {"microphone", kMicrophone, nullptr},
    {"webcam", kWebcam, nullptr},
    {"chargered", kChargeRed, &MotherBoard::IsChargeLedRedSupported},
    {"chargegreen", kChargeGreen, nullptr},
};

// The drive controllers of a selection. Drives are not found yet: no controller is known.
std::vector<std::string> ControllersFor(const std::string& selection) {
  if (!selection.empty()) {
    CDMout::LogMessage(LogOptions::Warnings, kFreeText,
                       "Drive LEDs (function hdgreen) are not tested by this version: they are left out of the run.");
  }
  return {};
}

bool IsSupported(MotherBoard* board, SupportQuestion question) {
  if (question == nullptr) {
    return true;
  }
  bool supported = false;
  return board != nullptr && (board->*question)(supported) && supported;
}

}  // namespace

void CustomLEDTest::AddDevice(std::int32_t deviceId, std::uint8_t address, const std::string& controllerId) {
  if (deviceCount == static_cast<std::int32_t>(kDeviceSlots)) {
    return;  // the array is full: what does not fit is left out
  }
  const bool isDrive = deviceId >= kFirstHdGreen;
  const auto kind = std::find_if(LedKinds().begin(), LedKinds().end(), [&](const LedKind& row) {
    return row.deviceId == (isDrive ? kFirstHdGreen : deviceId);
  });
  LEDStruct& entry = devices[static_cast<std::size_t>(deviceCount++)];
  entry.deviceId = deviceId;
  entry.startCommand = kind->startCommand;
  entry.defaultErrorCode = kind->errorCode;
  entry.adapter = address;
  entry.target = address;
  entry.lun = address;
  entry.tested = false;
  entry.running = false;
  entry.cheatCheck = false;
  entry.workerStarted = false;
  entry.workerFinished = false;
  entry.controllerId = controllerId;
  entry.errorCode = GetErrorCodeFromButtonFunctions(std::string(kind->function));
}

bool CustomLEDTest::PrepareDeviceArray() {
  std::unique_ptr<MotherBoard> board = MotherBoard::Instantiate(iniFile, testIni, chipIni, "platform", "");
  if (!board) {
    board = MotherBoard::Instance(iniFile);
  }
  devices.fill(LEDStruct{});
  deviceCount = 0;
  hdCount = 0;
  for (const ArrayRow& row : kArrayRows) {
    if (functions.count(row.function) != 0 && IsSupported(board.get(), row.question)) {
      const bool isDrive = row.deviceId == kHdRed;
      AddDevice(row.deviceId, isDrive ? std::uint8_t{0} : static_cast<std::uint8_t>(row.deviceId), "");
    }
    if (row.deviceId == kHdRed) {
      for (const std::string& controller : ControllersFor(hdControllers)) {
        AddDevice(kFirstHdGreen + hdCount++, 0, controller);
      }
    }
  }
  ShuffleDevices();
  if (operatorCheating && deviceCount > 1) {
    devices[static_cast<std::size_t>(deviceCount) - 1].cheatCheck = true;
  }
  return true;
}

// Every entry changes places with any entry, by the clock's seed: a new order at each attempt.
void CustomLEDTest::ShuffleDevices() {
  std::srand(static_cast<unsigned int>(platform::TheHost().clock.WallTime()));
  for (std::int32_t i = 0; i < deviceCount; ++i) {
    const std::int32_t j = std::rand() % deviceCount;
    if (j != i) {
      std::swap(devices[static_cast<std::size_t>(i)], devices[static_cast<std::size_t>(j)]);
    }
  }
}

int CustomLEDTest::GetCustomIndex(std::int32_t deviceId) const {
  for (std::int32_t i = 0; i < deviceCount; ++i) {
    if (devices[static_cast<std::size_t>(i)].deviceId == deviceId) {
      return i;
    }
  }
  return -1;
}

LEDStruct* CustomLEDTest::FindDevice(std::int32_t deviceId) {
  const int index = GetCustomIndex(deviceId);
  return index < 0 ? nullptr : &devices[static_cast<std::size_t>(index)];
}

bool CustomLEDTest::ResetDeviceParameters(std::int32_t deviceId) {
  LEDStruct* entry = FindDevice(deviceId);
  if (entry == nullptr || !entry->running) {
    return false;
  }
  entry->tested = true;
  entry->running = false;
  return true;
}

void CustomLEDTest::ResetAllParameters() {
  for (LEDStruct& entry : devices) {
    entry.running = false;
  }
}

void CustomLEDTest::WaitForThreadToFinish(std::int32_t deviceId) {
  constexpr std::uint32_t kLongestWait_ms = 3000;
  constexpr std::uint32_t kPoll_ms = 500;
  constexpr std::uint32_t kAfterwards_ms = 300;
  platform::Clock& clock = platform::TheHost().clock;
  const int index = GetCustomIndex(deviceId);
  const std::uint32_t begin = clock.TickCount();
  if (index < 0 || !devices[static_cast<std::size_t>(index)].workerStarted) {
    return;
  }
  const LEDStruct& entry = devices[static_cast<std::size_t>(index)];
  const auto log = [&](const char* text) {
    LogMessage(LogOptions::Status, kFreeText,
               text + CDMUtil::ToString(index) + ", Finished: " + CDMUtil::ToString(bool{entry.workerFinished}));
  };
  log("WFTTF: DeviceID - ");
  while (!entry.workerFinished && clock.TickCount() - begin < kLongestWait_ms) {
    clock.Sleep(kPoll_ms);
    log("WFTTF Sleeping: DeviceID - ");
  }
  clock.Sleep(kAfterwards_ms);
  // A worker that overruns its wait keeps its handle, so that the end of the dialog can end it. The thread is asked
  // and not the flag: a repeated entry's flag is set from its first turn on.
  platform::Threads& threads = platform::TheHost().threads;
  if (threads.Wait(workerThread, 0)) {
    threads.Close(workerThread);
    workerThread = 0;
  }
}

}  // namespace panelglow
