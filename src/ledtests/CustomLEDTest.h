// The subtest that lets an operator test all front-panel LEDs of a machine in one dialog: each LED blinks in turn,
// and the operator presses its button. What there is to test comes from two XML files.
#pragma once

#include <array>
#include <atomic>
#include <cstdint>
#include <initializer_list>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include "config/XmlObject.h"
#include "harness/CDMDiag.h"
#include "harness/DataCollectionLog.h"
#include "ledtests/ButtonDefStruct.h"
#include "ledtests/LEDStruct.h"
#include "ledtests/LegacyPanelPorts.h"
#include "platform/Threads.h"
#include "platform/XmlDocuments.h"

namespace panelglow {

class CustomLEDTest : public CDMDiag {
 public:
  static constexpr std::size_t kDeviceSlots = 30;

  // Values of testResult.
  static constexpr std::int32_t kRightAnswer = 1;
  static constexpr std::int32_t kWrongAnswer = 0;
  static constexpr std::int32_t kCancelled = -1;
  static constexpr std::int32_t kTimedOut = 770118;

  CustomLEDTest();
  ~CustomLEDTest() override;

  /// True when all LEDs passed in some attempt; false when the last attempt failed and the LED has no code of its
  /// own. Throws a new CDMException in all other cases.
  bool Run() override;

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

  /// Waits up to about 3.8 s for a started worker to finish, and closes its handle.
  void WaitForThreadToFinish(std::int32_t deviceId);

  void SetThreadState(std::uint32_t state) { threadState = state; }
  [[nodiscard]] std::uint32_t GetThreadState() const { return threadState; }

  // ---- button files

  /// Checks both files against their schemas, reads them and merges them into `buttons`.
  void LoadXmlConfigs();
  void ParseXMLConfigurationFiles();

  /// Sets the function flags of active buttons and the drive settings.
  void MapButtonFunctionsToTests();
  void InitializeButtonArray();

  /// The code of the first button with this function key; "770146" when there is none.
  [[nodiscard]] std::string GetErrorCodeFromButtonFunctions(const std::string& key) const;

  // ---- attempts

  /// Fills the device array from the function flags, in random order. Always true.
  bool PrepareDeviceArray();

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
  bool autoStart = false;
  std::uint32_t secondsTimer = 0;
  std::uint32_t foregroundTimer = 0;
  std::atomic<std::uint32_t> threadState{0};
  std::string failureCode;    // of the LED now blinking, or of the cancel
  std::string hdControllers;  // lower case: "all", or a comma list; empty: no drive LEDs
  std::string driveHandle;
  platform::ThreadHandle workerThread = 0;
  std::vector<ButtonDefStruct> buttons;
  std::set<std::string, std::less<>> functions;  // keys of the active buttons

  std::string iniFile;
  std::string testIni;
  std::string chipIni;

  /// Captions of the buttons, in list order.
  static std::array<wstring, kMostButtons> _sButtonArr;

  LegacyPanelPorts legacyPorts;

 private:
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

  void DeclareArguments();
  void ReadArguments();
  void CheckPrerequisites();
  void RunAttempt(bool& passed);
  bool FinishPassed();
  bool FinishFailed();
  [[noreturn]] void Fail(const Failure& failure);
  void PopulateAttemptInformation(int retriesAttempted, const std::string& errorCode);
  void WriteLog();
  static std::string CheckForResourceFiles(std::initializer_list<const char*> names);

  std::unique_ptr<platform::XmlDocument> LoadXMLForValidation(const std::string& inputXml);
  bool ValidateXMLFile(const std::string& inputXml, const std::string& inputXsd);
  void LoadTree(XmlObject& tree, const std::string& path);
  void RequireSchemaFile(const std::string& path, const std::string& textBehindPath);

  void AddDevice(std::int32_t deviceId, std::uint8_t address, const std::string& controllerId);
  void ShuffleDevices();

  std::string uiFile;
  std::string uiValidationFile;
  std::string buttonDefinitionFile;
  std::string buttonDefinitionValidationFile;
  std::string massStorageIniFile;
  std::string sectionId;
  wstring beginPromptText;
  wstring beginPromptMedia;
  wstring retryPromptText;
  wstring retryPromptMedia;
  CDMUtil::SubtestDetails details;
  CDMUtil::SubtestAttempt attempt;
  bool xmlCorrupted = false;
  std::uint16_t attemptNumber = 0;
  std::uint32_t attemptStartTick = 0;
  std::uint32_t startTick;  // when the object was constructed
  XmlObject uiXml;
  XmlObject buttonXml;
};

/// The running test, for dialog and workers; set at the start of Run.
extern CustomLEDTest* g_pSuperPtrCustom;

/// The driver client of the legacy port code; built before main runs, so that the driver is there for every subtest.
extern CDevio g_objDriverObjectCustom;

}  // namespace panelglow
