// The board library's face: one object stands for the system board, and the tests ask it for LEDs, fans, temperatures
// and detected devices without knowing what is behind them. This is also the class "generic": the INI files name the
// chips to build, and the chips do the work.
//
// A board holds the machine-wide mutex of the board library for all of its life, so boards are one at a time across
// all threads and processes of the suite (one thread may nest them): building one blocks while another is alive.
#pragma once

#include <array>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "board/ChipTable.h"
#include "board/chips/Chip.h"
#include "board/sets/DeviceDetection.h"
#include "board/sets/FanSet.h"
#include "board/sets/HoodLock.h"
#include "board/sets/HoodSwitch.h"
#include "board/sets/LegacySettings.h"
#include "board/sets/TestButtons.h"
#include "board/sets/ZoneSet.h"
#include "platform/NamedMutexes.h"

namespace panelglow {

class XmlObject;

class MotherBoard {
 public:
  using DEVICE_INFO = panelglow::DEVICE_INFO;

  /// A board by the INI data of this system (or of `systemIdOverride`); null when the data selects no class of this
  /// path, which is no error. `classKey` names the key that holds the class, as "platform". Throws CDMException
  /// 990431 when the chip file is missing, and mblib_exception for chip data that cannot be used.
  static std::unique_ptr<MotherBoard> Instantiate(const std::string& detectIniPath, const std::string& testIniPath,
                                                  const std::string& chipIniPath, const std::string& classKey,
                                                  const std::string& systemIdOverride);

  /// A board of the oldest kind by the key "MotherboardClass" in this system's section, whose name is the id in
  /// upper-case hexadecimal, with or without leading zeroes; null when there is none of that name.
  static std::unique_ptr<MotherBoard> Instance(const std::string& detectIniPath);

  /// The generic class. `systemIdText` is the system id as hexadecimal text.
  explicit MotherBoard(const std::string& systemIdText);
  virtual ~MotherBoard() = default;
  MotherBoard(const MotherBoard&) = delete;
  MotherBoard& operator=(const MotherBoard&) = delete;

  /// The chip of a name in the class table; the plain chip for an empty or unknown name. Owned by the board.
  [[nodiscard]] Chip& GetChip(const std::string& chipName) { return ChipAt(ChipPlaceOf(chipName)); }

  [[nodiscard]] std::uint16_t GetSystemId() const { return systemId; }
  [[nodiscard]] const std::string& GetClassName() const { return className; }

  // ---- devices that the files name, each class looked for by its own operation (see DeviceDetection)
  virtual bool DetectJumpers();
  virtual bool DetectFrontPanel();
  virtual bool DetectSecurityDevices();
  virtual bool DetectPowerSupply();
  virtual bool DetectHeatsink();
  virtual bool DetectDashCable();
  virtual bool DetectRiser();
  virtual bool DetectCables();
  virtual bool DetectPoweredDevices();
  virtual bool DetectInternalSpeaker();
  virtual bool DetectTouchScreen();

  /// The operation of a kind, for callers that go through all of them.
  bool Detect(DeviceKind kind);

  /// What was found; empty before the kind's operation. TitleOf(kind) is what people call it.
  [[nodiscard]] const std::vector<DEVICE_INFO>& GetDevices(DeviceKind kind) const { return devices.List(kind); }

  // ---- fans (see FanSet). They are loaded first; a fan is named by its number in the keys.
  virtual bool LoadFanGroups();
  virtual bool LoadFans();
  virtual void TakeFanControl();
  virtual void ReleaseFanControl();
  virtual bool SetActiveReadingSet(std::uint32_t index);
  virtual void SetFanTests(bool full, bool pwm, bool nominal);
  virtual bool SetManualFanMode(bool on);
  virtual bool SaveFanStates();
  virtual bool RestoreFanStates();
  virtual bool ReadAllFans();

  /// The oldest boards' own way to a fan; false elsewhere.
  virtual bool ReadFan(int index, int& rpm);
  virtual bool ReadOneFan(int index);
  virtual bool SetAllFansFull();
  virtual bool SetAllFansPwm();
  virtual bool SetFanPwm(int index);
  virtual void WaitForFans();

  /// `group`: which fans were tested, for the reader.
  virtual void WriteFanLog(const LineSink& write, const std::string& group);
  virtual void WriteFanResults(XmlObject& parent);

  /// Looks which fans are plugged in; the answer is each fan's detectionStatus.
  virtual bool DetectFans();
  [[nodiscard]] const std::vector<FanGroup>& GetFanGroups() const { return fans.Groups(); }

  // ---- temperature zones (see ZoneSet). They are loaded first; a zone is named by its number from 1. What gives the
  // list or a setting is always true.
  virtual bool GetZones(std::vector<TempZone>& list);
  virtual bool LoadZones();
  virtual bool LoadZoneGroups();
  virtual bool GetZoneCount(int& count);
  virtual bool GetProbeRate(int& seconds);
  virtual bool SetProbeRate(int seconds);
  virtual bool GetConsecutiveHigh(int& count);
  virtual bool GetConsecutiveLow(int& count);
  virtual bool GetRetriesOnInvalid(int& count);
  virtual bool IsZoneSkipped(int zone);
  virtual bool SetZoneSkipped(int zone, bool skip);
  virtual bool CheckZone(int zone, ZoneCheck& check);
  virtual bool GetZoneName(int zone, std::string& zoneName);
  virtual void WriteZoneLog(const LineSink& write);
  virtual void WriteZoneResults(XmlObject& parent);
  virtual int ReadProchot(int zone);
  virtual int GetZoneHigh(int zone);
  virtual int GetZoneLow(int zone);
  virtual int ReadZone(int zone);
  [[nodiscard]] const std::vector<ZoneGroup>& GetZoneGroups() const { return zones.Groups(); }

  // ---- LED operations. False: the board has no such LED; that an LED cannot be lit or darkened is told to people. A
  // blink that returns true has set the chip to blink the LED by itself; otherwise the caller toggles. Save and
  // restore must come on the same board.

  /// True when the tests are to use their own legacy port code instead of this board.
  virtual bool IsPanelLedLegacy();

  virtual bool IsPowerLedRedSupported(bool& supported);
  virtual bool SavePowerLedState();
  virtual bool AssertPowerLedGreen();
  virtual bool AssertPowerLedRed();
  virtual bool DeassertPowerLed();
  virtual bool RestorePowerLedState();
  virtual bool BlinkPowerLedGreen();
  virtual bool BlinkPowerLedRed();

  virtual bool IsChargeLedRedSupported(bool& supported);
  virtual bool AssertChargeLedWhite();
  virtual bool DeassertChargeLedWhite();
  virtual bool AssertChargeLedRed();
  virtual bool DeassertChargeLedRed();
  virtual bool BlinkChargeLedWhite();
  virtual bool BlinkChargeLedRed();
  virtual bool SaveChargeLedState();
  virtual bool RestoreChargeLedState();

  virtual bool IsHdLedRedSupported(bool& supported);
  virtual bool SaveHdLedState();
  virtual bool RestoreHdLedState();
  virtual bool AssertHdLedRed();
  virtual bool DeassertHdLedRed();
  virtual bool BlinkHdLedRed();

  virtual bool IsWirelessLedSupported(bool& supported);
  virtual bool SaveWirelessLedState();
  virtual bool RestoreWirelessLedState();
  virtual bool AssertWirelessLed();
  virtual bool DeassertWirelessLed();
  virtual bool BlinkWirelessLed();

  virtual bool SaveSpeakerLedState();
  virtual bool RestoreSpeakerLedState();
  virtual bool BlinkSpeakerLed();
  virtual bool BlinkMicrophoneLed();
  virtual bool AssertSpeakerLed();
  virtual bool DeassertSpeakerLed();
  virtual bool AssertMicrophoneLed();
  virtual bool DeassertMicrophoneLed();

  // ---- power button
  virtual bool SavePowerButton();
  virtual bool RestorePowerButton();
  virtual bool ArmPowerButton();
  virtual bool IsPowerButtonPressed(bool& pressed);

  // ---- hood and buttons (see HoodSwitch, HoodLock, TestButtons); each is loaded first
  virtual bool LoadHoodSwitch();
  virtual bool ReadHoodSwitch(bool& value);
  virtual bool ReadHoodLatch(bool clearFirst, bool& value);
  virtual bool LoadHoodLock();
  virtual bool ReadHoodLock(bool& present);
  virtual int LockHood();
  virtual int UnlockHood();
  virtual bool LoadButtons();
  virtual bool SelectButton(const std::string& buttonName);
  virtual bool GetButtonState(const std::string& buttonName, bool& pressed);
  virtual bool ReadButtonDirect(bool& value);
  virtual bool ReadButton(bool& pressed);
  virtual bool ReadButtonLatch(bool& value);
  [[nodiscard]] const std::vector<TestButton>& GetButtons() const { return buttons.List(); }

  // ---- what only the oldest boards have; false, and nothing is touched, on all others

  /// Reads the flat keys of the detection file, and with them the fans and zones.
  virtual bool LoadLegacySettings();

  /// Whether the machine has a device of the flat keys. False, and `present` stays, when its key has no line or the
  /// line cannot be read.
  virtual bool DetectLegacyDevice(LegacyDevice device, bool& present);

  /// Whether a fan turns.
  virtual bool DetectLegacyFan(int index, bool& present);
  virtual bool SaveLegacyFanState();
  virtual bool RestoreLegacyFanState();

  // ---- records of fans; false, and nothing is written, for a number without a fan
  virtual bool GetFanCount(int& count);
  virtual bool GetFans(std::vector<Fan>& list);
  virtual bool GetFanName(int index, std::string& fanName);
  virtual bool GetFanFullLimits(int index, FanLimits& limits);

  /// The oldest boards' own way to full speed, and below to a fan's duty; false elsewhere.
  virtual bool SetLegacyFanFull(int index);
  virtual bool GetFanNominalLimits(int index, FanLimits& limits);
  virtual bool GetFanPwmLimits(int index, FanLimits& limits);
  virtual bool GetFanPwmDuty(int index, int& percent);
  virtual bool SetLegacyFanPwm(int index);
  virtual bool GetFanReading(int index, FanReading column, int& rpm);
  virtual bool GetFanRecord(int index, Fan& record);

  /// As WriteFanLog, with other words in the heading and the full-speed verdict.
  virtual void WriteFanLogEx(const LineSink& write, const std::string& group);

  // ---- latched status bits, by number, of the chip in the first place
  virtual bool ReadLatchedBit(std::uint16_t port, int bit);
  virtual bool ClearLatchedBit(std::uint16_t port, int bit);

 protected:
  /// For the classes with a list of chips of their own: the chip "none" in every place.
  MotherBoard(std::string boardClass, std::uint16_t boardId);

  /// Builds the class of a name of the chip table in its place.
  void Place(std::string_view chipName);

  /// The chip that serves a fan, zone or device; GetChip, unless a board class has one of its own.
  virtual Chip& ChipFor(const std::string& chipName) { return GetChip(chipName); }

  // Places count from 1.
  void Put(std::size_t place, std::unique_ptr<Chip> chip) { chips[place - 1] = std::move(chip); }
  [[nodiscard]] Chip& ChipAt(std::size_t place) { return *chips[place - 1]; }

  /// The chip that serves one LED (or the button): found at first use by the name in the INI files, unless a board
  /// class has preset that name.
  struct ChipChoice {
    const char* key;
    const char* what;      // as people call it
    const char* settings;  // beginning of its keys in a chip's section
    std::string name = {};
    Chip* chip = nullptr;
    bool isPreset = false;        // the name is the board class's own
    bool wasLit = false;          // by this board
    std::string whyNothing = {};  // the end of what people are told; empty until it is
  };
  Chip& ChipOf(ChipChoice& choice);

  /// The answer of an INI key "yes" or "no"; for anything else the chip's.
  bool IsSupported(const char* key, ChipChoice& choice, bool (Chip::*ask)(bool&), bool& supported);

  /// The chip's operation. People are told when the LED cannot be lit, or be darkened once it was lit.
  bool SwitchOn(ChipChoice& choice, bool (Chip::*operation)());
  bool SwitchOff(ChipChoice& choice, bool (Chip::*operation)());

  ChipChoice powerLed{"test.powerled.chip", "power LED", "powerled."};
  ChipChoice chargeLed{"test.chargeled.chip", "charge LED", "chargeled."};
  ChipChoice hdLed{"test.hdled.chip", "drive LED", "hdled."};
  ChipChoice wirelessLed{"test.wirelessled.chip", "wireless LED", "wirelessled."};
  ChipChoice speakerLed{"test.speakerled.chip", "speaker LED", "codecgpio."};
  ChipChoice microphoneLed{"test.microphoneled.chip", "microphone LED", "codecgpio."};
  ChipChoice powerButton{"test.powerbutton.chip", "power button", ""};

  FanSet fans{Finder()};
  ZoneSet zones{Finder(),
                {.read = [this](int zone) { return ReadZone(zone); },
                 .prochot = [this](int zone) { return ReadProchot(zone); },
                 .high = [this](int zone) { return GetZoneHigh(zone); },
                 .low = [this](int zone) { return GetZoneLow(zone); }}};
  DeviceDetection devices{Finder()};

 private:
  ChipFinder Finder() {
    return [this](const std::string& chipName) -> Chip& { return ChipFor(chipName); };
  }
  void BuildListedChips();
  void BuildAllChips();
  void InitializeGeneric(std::size_t place);
  [[nodiscard]] const std::string& WhyNothing(ChipChoice& choice) const;
  [[nodiscard]] std::string FindWhyNothing(const ChipChoice& choice) const;

  platform::NamedMutexLock lock;  // in front of the chips: given up behind them, also when the construction fails
  std::array<std::unique_ptr<Chip>, kChipPlaces> chips;  // never null
  std::vector<std::string> listed;                       // the value of "chips", in names
  bool hasList = false;                                  // there is such a value; without: every class
  std::uint16_t systemId;
  std::string className;
  HoodSwitch hoodSwitch{Finder()};
  HoodLock hoodLock{Finder()};
  TestButtons buttons{Finder()};
};

}  // namespace panelglow
