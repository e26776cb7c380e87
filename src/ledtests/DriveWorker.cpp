// The workers of drive LEDs, which have no switch of their own: they light when a disk is busy. So a disk is made
// busy and left alone in turn, by a thread that reads one block and writes back the very bytes it has read.
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <utility>

#include "hw/SetupDI.h"
#include "ledtests/BlinkWorkers.h"
#include "ledtests/DriveSelection.h"
#include "ledtests/FrontPanelTest.h"
#include "ledtests/PutBack.h"
#include "platform/Host.h"
#include "storage/MSUtils.h"

namespace panelglow {

namespace {

constexpr int kMostCycles = 50;
constexpr std::size_t kBlock_bytes = 0x8000;
constexpr std::uint64_t kBlockPosition = 0x100000;  // from the start of the drive

// States of the activity thread.
constexpr std::uint32_t kStop = 0;
constexpr std::uint32_t kRun = 1;
constexpr std::uint32_t kGaveUp = 2;

void KeepBusy(FrontPanelTest& test, platform::RawDisk& disk, std::span<std::byte> block) {
  while (test.GetThreadState() == kRun) {
    if (!disk.Seek(kBlockPosition)) {
      test.SetThreadState(kGaveUp);
      return;
    }
    // Nothing is written but what has just been read, whole.
    if (disk.Read(block) == block.size() && disk.Seek(kBlockPosition)) {
      disk.Write(block);
    }
  }
}

// An activity thread that runs on its own; it ends by the thread state.
class Activity {
 public:
  Activity(FrontPanelTest& test, const std::string& drive)
      : thread_(platform::TheHost().threads.Start(
            "drive activity", [&test, drive] { ActAndLog([&] { CustomLightUpFpHddLed(test, drive); }); })) {}
  ~Activity() { platform::TheHost().threads.Close(thread_); }
  Activity(const Activity&) = delete;
  Activity& operator=(const Activity&) = delete;
  [[nodiscard]] bool HasStarted() const { return thread_ != 0; }

 private:
  platform::ThreadHandle thread_;
};

// False when an activity thread could not be started: the worker then ends without having finished.
bool BlinkActivity(FrontPanelTest& test, const LEDStruct& entry, const std::string& drive) {
  platform::Clock& clock = platform::TheHost().clock;
  // However the worker ends, no activity of its own goes on behind it.
  bool isBusy = false;
  const PutBack stopped([&] {
    if (isBusy) {
      test.SetThreadState(kStop);
    }
  });
  for (int cycle = 0; cycle < kMostCycles && entry.running; ++cycle) {
    isBusy = true;
    test.SetThreadState(kRun);
    const Activity activity(test, drive);
    if (!activity.HasStarted()) {
      return false;
    }
    clock.Sleep(static_cast<std::uint32_t>(test.hdOnTime));
    test.SetThreadState(kStop);
    isBusy = false;
    clock.Sleep(static_cast<std::uint32_t>(test.hdOffTime));
  }
  return true;
}

std::optional<std::string> KnownPath(std::string path) {
  return path.empty() ? std::nullopt : std::optional(std::move(path));
}

// Without a drive, the one of the worker before is made busy. A drive whose path is not known is none of those that
// are: its LED stays dark.
void CustomBlinkHDLED(FrontPanelTest& test, LEDStruct& entry, const std::optional<std::string>& found) {
  const std::string drive = test.ChangeDriveHandle(found);
  entry.workerStarted = true;
  if (BlinkActivity(test, entry, drive)) {
    entry.workerFinished = true;
  }
}

}  // namespace

void CustomLightUpFpHddLed(FrontPanelTest& test, const std::string& drive) {
  platform::RawDisks& disks = platform::TheHost().rawDisks;
  const std::unique_ptr<platform::RawDisk> disk = disks.Open(drive);
  const std::unique_ptr<platform::DiskBlock> block = disk ? disks.Allocate(kBlock_bytes) : nullptr;
  if (!block) {
    test.SetThreadState(kGaveUp);
    return;
  }
  KeepBusy(test, *disk, block->Bytes());
}

void CustomBlinkCtrlHDLED(FrontPanelTest& test, LEDStruct& entry) {
  const std::string disk = FindDiskOf(entry.controllerId);
  CustomBlinkHDLED(test, entry,
                   disk.empty() ? std::nullopt : std::optional(MSUtils::GetDriveHandleStrUsingDevInstId(disk)));
}

void CustomBlinkIdeHDLED(FrontPanelTest& test, LEDStruct& entry) {
  CustomBlinkHDLED(test, entry, KnownPath(FindDrivePath("ide")));
}

void CustomBlinkScsiHDLED(FrontPanelTest& test, LEDStruct& entry) {
  CustomBlinkHDLED(test, entry, KnownPath(FindDrivePath("scsi")));
}

}  // namespace panelglow
