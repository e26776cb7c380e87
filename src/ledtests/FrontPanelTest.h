// What the operator tests of front-panel LEDs share: the device array, the attempts, each with a dialog of its own,
// the failures and the log. A test says what is to be tested and how its dialog goes.
#pragma once

#include <array>
#include <atomic>
#include <cstdint>
#include <fstream>
#include <initializer_list>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "harness/CDMDiag.h"
#include "harness/DataCollectionLog.h"
#include "ledtests/DialogRules.h"
#include "ledtests/LEDStruct.h"
#include "ledtests/LegacyPanelPorts.h"
#include "platform/Threads.h"

namespace panelglow {

class MotherBoard;

class FrontPanelTest : public CDMDiag {
 public:
  static constexpr std::size_t kDeviceSlots = 30;

  // Values of testResult.
  static constexpr std::int32_t kRightAnswer = 1;
  static constexpr std::int32_t kWrongAnswer = 0;
  static constexpr std::int32_t kCancelled = -1;
  static constexpr std::int32_t kTimedOut = 770118;

  /// Code of an attempt that could not show its dialog, or lost it: no LED is to blame.
  static constexpr std::int32_t kNoDialog = 990640;

  ~FrontPanelTest() override;

  // ---- the device array; shared with dialog and workers

  /// Index of the entry with this device id among the real ones, or -1.
  [[nodiscard]] int GetCustomIndex(std::int32_t deviceId) const;

  /// The entry of a device id, or null.
  [[nodiscard]] LEDStruct* FindDevice(std::int32_t deviceId);

  /// The test of the operator's answer: when this LED is the one that blinks, marks it tested, stops it and returns
  /// true. Otherwise changes nothing.
  bool ResetDeviceParameters(std::int32_t deviceId);

  /// Tells every worker to stop.
  void ResetAllParameters();

  /// Waits up to about 3.8 s for a worker to finish, and closes its handle; one that overruns keeps it, for the end
  /// of the dialog to end it.
  void WaitForThreadToFinish(std::int32_t deviceId);

  /// Makes a drive the one that is made busy, when there is one; the path of that drive. An empty path is a drive
  /// that nobody knows: it does not open. Workers may overlap.
  std::string ChangeDriveHandle(const std::optional<std::string>& found);

  void SetThreadState(std::uint32_t state) { threadState = state; }
  [[nodiscard]] std::uint32_t GetThreadState() const { return threadState; }

  /// The board by its section of the INI files, or null. The caller holds the board library's lock with it.
  [[nodiscard]] std::unique_ptr<MotherBoard> MakeBoard() const;

  /// The same, or else the board class of this very model.
  [[nodiscard]] std::unique_ptr<MotherBoard> MakeAnyBoard() const;

  /// One attempt: shows the dialog and waits for its end. True when the last answer was right.
  bool RunSuperLEDTest();

  std::array<LEDStruct, kDeviceSlots> devices;
  std::int32_t deviceCount = 0;
  std::int32_t ledTimeout = 30;  // s
  std::int32_t cheatLevel = 1;   // of the repeat check; 1 to 3, kept across attempts
  std::int32_t testResult = 0;
  std::int32_t secondsElapsed = 0;
  std::int32_t retries = 0;
  std::int32_t currentIndex = 0;  // entry that blinks now
  std::int32_t hdCount = 0;
  std::int32_t hdOnTime = 500;   // ms
  std::int32_t hdOffTime = 500;  // ms
  std::uint16_t systemId = 0;
  bool operatorCheating = false;
  bool exitDialog = false;
  bool timerCounting = false;
  bool testStarted = false;
  bool dialogLost = false;  // the last attempt's dialog could not be shown, or went away by itself
  std::uint32_t secondsTimer = 0;
  std::uint32_t foregroundTimer = 0;
  std::atomic<std::uint32_t> threadState{0};
  std::string failureCode;    // of the LED now blinking, or of the cancel
  std::string hdControllers;  // "all", or a comma list of names; empty: no drive LEDs
  platform::ThreadHandle workerThread = 0;
  DialogRules rules;

  std::ofstream webcamLog;  // attached to no file: what the camera's worker notes is seen by no one

  std::string iniFile;
  std::string testIni;
  std::string chipIni;
  std::string massStorageIniFile;

  CDevio& driver;
  LegacyPanelPorts legacyPorts;

 protected:
  /// A failure on the way: how it is recorded, and what is thrown.
  struct Failure {
    int attemptNumber = 0;
    std::string recordedCode = {};
    std::string status = "0";
    bool setsErrorCode = false;  // details.errorcode takes the recorded code
    int exceptionCode = 0;
    LogOptions option = LogOptions::DeviceErrors;
    int messageId = 0;
    std::string text = {};
  };

  /// A LED that a test may have in its array.
  using SupportQuestion = bool (MotherBoard::*)(bool&);
  struct ArrayRow {
    std::string_view function;
    SupportQuestion question;  // only some boards have it: the board is asked; null: the selection is the claim
  };

  /// `driverClient` is the client that legacy registers are reached by; it outlives the test.
  explicit FrontPanelTest(CDevio& driverClient);

  /// The run's record is begun, a driver is there and the model is known; otherwise throws a new CDMException. Not
  /// before this is the machine looked at: an informational request builds the tests, too.
  void BeginRun(const std::string& testName);

  /// Throws a new CDMException when an icon of the dialog is missing.
  void RequireIcons();

  /// The attempts and the verdict: true when all LEDs passed in some attempt; false, or a new CDMException thrown,
  /// when the last attempt failed.
  bool RunAttempts();

  /// Fills the device array with AddDevice between BeginArray and FinishArray, and `rules` with the dialog's buttons.
  virtual void PrepareAttempt() = 0;

  // What stands ahead of an attempt, and between its preparation and its dialog.
  virtual void BeforeAttempt() {}
  virtual void BeforeDialog() {}

  /// What follows a failed run whose report and log are written: false, or a new CDMException thrown.
  virtual bool AfterFailure() { return false; }

  /// The code that a LED's button gives; thrown at the end of a failed run.
  [[nodiscard]] virtual std::string CodeOf(std::string_view function) const;

  void BeginArray();
  void AddDevice(std::int32_t deviceId, std::uint8_t address, const std::string& controllerId);
  /// The entry of a row, when the board has such a LED.
  void AddDevice(const ArrayRow& row, MotherBoard* board);
  /// One entry for each controller.
  void AddDrives(const std::vector<std::string>& controllers);
  /// Shuffles, and marks the last entry for the repeat check.
  void FinishArray();

  [[noreturn]] void Fail(const Failure& failure);
  void WriteLog();
  static std::string CheckForResourceFiles(std::initializer_list<const char*> names);

  std::uint16_t attemptNumber = 0;
  CDMUtil::SubtestDetails details;

 private:
  std::mutex driveGuard;
  std::string driveHandle;  // by driveGuard

  void RunAttempt(bool& passed);
  bool FinishPassed();
  bool FinishFailed();
  void PrepareRecorded();
  void RecordEnd(int code);
  void PopulateAttemptInformation(int retriesAttempted, const std::string& errorCode);
  void ShuffleDevices();

  CDMUtil::SubtestAttempt attempt;
  bool xmlCorrupted = false;
  std::uint32_t attemptStartTick = 0;
  std::uint32_t startTick;  // when the object was constructed
};

}  // namespace panelglow
