// The device array of the operator tests: how it is filled for an attempt, and the look-ups that dialog and workers
// use.
#include <cstdlib>
#include <utility>

#include "board/MotherBoard.h"
#include "harness/base/CDMUtil.h"
#include "ledtests/FrontPanelTest.h"
#include "ledtests/LedKind.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

bool IsSupported(MotherBoard* board, bool (MotherBoard::*question)(bool&)) {
  if (question == nullptr) {
    return true;
  }
  bool supported = false;
  return board != nullptr && (board->*question)(supported) && supported;
}

}  // namespace

void FrontPanelTest::BeginArray() {
  devices.fill(LEDStruct{});
  deviceCount = 0;
  hdCount = 0;
}

void FrontPanelTest::AddDevice(std::int32_t deviceId, std::uint8_t address, const std::string& controllerId) {
  const LedKind* const kind = FindLedKindByDevice(deviceId);
  if (kind == nullptr || deviceCount == static_cast<std::int32_t>(kDeviceSlots)) {
    return;  // the array is full: what does not fit is left out
  }
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
  entry.errorCode = CodeOf(kind->function);
}

void FrontPanelTest::AddDevice(const ArrayRow& row, MotherBoard* board) {
  const LedKind* const kind = FindLedKindByFunction(row.function);
  if (kind != nullptr && IsSupported(board, row.question)) {
    const bool isDrive = kind->deviceId == kHdRed || kind->deviceId == kIdeDrive || kind->deviceId == kScsiDrive;
    AddDevice(kind->deviceId, isDrive ? std::uint8_t{0} : static_cast<std::uint8_t>(kind->deviceId), "");
  }
}

void FrontPanelTest::AddDrives(const std::vector<std::string>& controllers) {
  for (const std::string& controller : controllers) {
    AddDevice(kFirstHdGreen + hdCount++, 0, controller);
  }
}

void FrontPanelTest::FinishArray() {
  ShuffleDevices();
  if (operatorCheating && deviceCount > 1) {
    devices[static_cast<std::size_t>(deviceCount) - 1].cheatCheck = true;
  }
}

// Every entry changes places with any entry, by the clock's seed: a new order at each attempt.
void FrontPanelTest::ShuffleDevices() {
  std::srand(static_cast<unsigned int>(platform::TheHost().clock.WallTime()));
  for (std::int32_t i = 0; i < deviceCount; ++i) {
    const std::int32_t j = std::rand() % deviceCount;
    if (j != i) {
      std::swap(devices[static_cast<std::size_t>(i)], devices[static_cast<std::size_t>(j)]);
    }
  }
}

int FrontPanelTest::GetCustomIndex(std::int32_t deviceId) const {
  for (std::int32_t i = 0; i < deviceCount; ++i) {
    if (devices[static_cast<std::size_t>(i)].deviceId == deviceId) {
      return i;
    }
  }
  return -1;
}

LEDStruct* FrontPanelTest::FindDevice(std::int32_t deviceId) {
  const int index = GetCustomIndex(deviceId);
  return index < 0 ? nullptr : &devices[static_cast<std::size_t>(index)];
}

bool FrontPanelTest::ResetDeviceParameters(std::int32_t deviceId) {
  LEDStruct* entry = FindDevice(deviceId);
  if (entry == nullptr || !entry->running) {
    return false;
  }
  entry->tested = true;
  entry->running = false;
  return true;
}

void FrontPanelTest::ResetAllParameters() {
  for (LEDStruct& entry : devices) {
    entry.running = false;
  }
}

std::string FrontPanelTest::ChangeDriveHandle(const std::optional<std::string>& found) {
  const std::lock_guard<std::mutex> lock(driveGuard);
  driveHandle = found.value_or(driveHandle);
  return driveHandle;
}

void FrontPanelTest::WaitForThreadToFinish(std::int32_t deviceId) {
  constexpr std::uint32_t kLongestWait_ms = 3000;
  constexpr std::uint32_t kPoll_ms = 500;
  constexpr std::uint32_t kAfterwards_ms = 300;
  platform::Clock& clock = platform::TheHost().clock;
  const int index = GetCustomIndex(deviceId);
  const std::uint32_t begin = clock.TickCount();
  if (index < 0) {
    return;
  }
  const LEDStruct& entry = devices[static_cast<std::size_t>(index)];
  if (!entry.workerStarted && !rules.waitsForUnstarted) {
    return;
  }
  const auto log = [&](const char* text) {
    if (rules.writesLines) {
      LogMessage(LogOptions::Status, kFreeText,
                 text + CDMUtil::ToString(index) + ", Finished: " + CDMUtil::ToString(bool{entry.workerFinished}));
    }
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
