#include "board/chips/ec/SmscMec1322Chip.h"

#include <algorithm>

#include "board/base/IniReader.h"
#include "board/parts/Bits.h"
#include "board/parts/ProbeConfigPort.h"
#include "board/parts/Sequence.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/Notices.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

// Keys of the lists, in the order of SmscMec1322Chip::List.
constexpr std::array<const char*, 12> kListKeys{
    "powerled.green.assert.sequence",    "powerled.green.deassert.sequence",   "powerled.green.savemux.sequence",
    "powerled.green.enablemux.sequence", "chargeled.green.assert.sequence",    "chargeled.green.deassert.sequence",
    "chargeled.green.savemux.sequence",  "chargeled.green.enablemux.sequence", "chargeled.red.assert.sequence",
    "chargeled.red.deassert.sequence",   "chargeled.red.savemux.sequence",     "chargeled.red.enablemux.sequence"};

constexpr std::uint8_t kEnterKey = 0x55;  // of the configuration mode

// Mailbox.
constexpr std::uint16_t kMailboxIndex = 0x200;
constexpr std::uint16_t kMailboxData = 0x201;
constexpr std::uint8_t kCommandReg = 0x82;
constexpr std::uint8_t kAddressLowReg = 0x84;
constexpr std::uint8_t kAddressHighReg = 0x85;
constexpr std::uint8_t kDataReg = 0x86;
constexpr std::uint8_t kRead = 1;
constexpr std::uint8_t kWrite = 2;
constexpr std::uint8_t kSelectPage = 0x1D;
constexpr std::uint32_t kMailboxSettle_ms = 50;

// Fan block: page, and addresses in it.
constexpr std::uint8_t kFanPage = 0x40;
constexpr std::uint8_t kFanBlock = 0xA0;
constexpr std::uint8_t kFanDuty = 0x00;
constexpr std::uint8_t kFanConfiguration = 0x02;
constexpr std::uint8_t kFanTach = 0x0F;
constexpr std::uint8_t kAutomatic = 0x80;  // of the fan configuration
constexpr std::uint8_t kBusy = 0x48;
constexpr int kMostReads = 11;  // a read, and ten repeats while the controller is busy

constexpr int kTachClock = 0x3C0000;
constexpr int kDefaultWait_ms = 30;
constexpr int kLongestWait_ms = 10'000;

}  // namespace

SmscMec1322Chip::SmscMec1322Chip() : EcChip("smsc_mec1322") {
  static_assert(kListKeys.size() == kListCount);
  devio.OutportByte(ProbeConfigPort(devio, {kEnterKey}, {}), kEnterKey);
  const std::string section = ReadIniValue("chip.smsc_mec1322.data", name);
  for (std::size_t i = 0; i < kListKeys.size(); ++i) {
    lists[i] = ParsePairs<std::uint16_t>(ReadChipSetting(section, kListKeys[i], ""));
  }
  const int wanted_ms = ReadIniInt("test.panelglow.waittime", kDefaultWait_ms);
  waitTime = static_cast<std::uint32_t>(std::clamp(wanted_ms, 0, kLongestWait_ms));
  if (waitTime != static_cast<std::uint32_t>(wanted_ms)) {
    Notices::Tell("\"test.panelglow.waittime\" is " + CDMUtil::ToString(wanted_ms) + " and counts as " +
                  CDMUtil::ToString(waitTime) + ": it is the wait of each step in ms, 0 to " +
                  CDMUtil::ToString(kLongestWait_ms) + ".");
  }
}

bool SmscMec1322Chip::RunList(List which) {
  for (const auto& [port, value] : lists[which]) {
    devio.OutportByte(port, value);
    platform::TheHost().clock.Sleep(waitTime);
  }
  return !lists[which].empty();
}

// ---- the mailbox

void SmscMec1322Chip::WriteMailbox(std::uint8_t reg, std::uint8_t value) {
  devio.OutportByte(kMailboxIndex, reg);
  devio.OutportByte(kMailboxData, value);
  platform::TheHost().clock.Sleep(kMailboxSettle_ms);
}

void SmscMec1322Chip::SelectPage(std::uint8_t high, std::uint8_t low) {
  SetAddress(high, low);
  WriteMailbox(kCommandReg, kSelectPage);
}

void SmscMec1322Chip::SetAddress(std::uint8_t high, std::uint8_t low) {
  WriteMailbox(kAddressHighReg, high);
  WriteMailbox(kAddressLowReg, low);
}

std::uint8_t SmscMec1322Chip::ReadByte() {
  WriteMailbox(kCommandReg, kRead);
  devio.OutportByte(kMailboxIndex, kDataReg);
  const std::uint8_t value = devio.InportByte(kMailboxData);
  platform::TheHost().clock.Sleep(kMailboxSettle_ms);
  return value;
}

void SmscMec1322Chip::WriteByte(std::uint8_t value) {
  WriteMailbox(kDataReg, value);
  WriteMailbox(kCommandReg, kWrite);
}

std::uint8_t SmscMec1322Chip::ReadFanPage(std::uint8_t low) {
  SelectPage(kFanPage, 0);
  SetAddress(kFanBlock, low);
  return ReadByte();
}

// ---- fans

std::uint32_t SmscMec1322Chip::ReadFanTach(int /*fan*/, int /*arg*/) {
  std::uint8_t value = kBusy;
  for (int read = 0; read < kMostReads && value == kBusy; ++read) {
    value = ReadFanPage(kFanTach);
  }
  return value;
}

int SmscMec1322Chip::TachToRpm(std::uint32_t raw, int /*multiplier*/) {
  return raw == 0 ? 0 : kTachClock / (static_cast<int>(raw) * 32);
}

bool SmscMec1322Chip::SetManualFanMode(bool on) {
  if (on != manualFanMode) {
    const std::uint8_t value = ReadFanPage(kFanConfiguration);
    SelectPage(kFanPage, 0);
    SetAddress(kFanBlock, kFanConfiguration);
    WriteByte(on ? value & static_cast<std::uint8_t>(~kAutomatic) : value | kAutomatic);
    manualFanMode = on;
  }
  return true;
}

bool SmscMec1322Chip::SetFanPwm(int fan, int value) {
  SetManualFanMode(true);
  if (fan != 1) {
    return false;
  }
  SelectPage(kFanPage, 0);
  SetAddress(kFanBlock, kFanDuty);
  WriteByte(LowByte(static_cast<std::uint32_t>(value)));
  return true;
}

// ---- LEDs; their pins are shared, so the multiplexer is saved, given to the LED, and put back

bool SmscMec1322Chip::SaveMux(List which) {
  if (!RunList(which)) {
    return false;
  }
  savedMux = ReadByte();
  return true;
}

void SmscMec1322Chip::RestoreMux(List which) {
  RunList(which);
  WriteByte(savedMux);
}

// Each multiplexer counts as saved before the LED gets it: a save that is interrupted behind it can be put back. One
// without a list is at an address that nobody knows, and is left alone.
bool SmscMec1322Chip::SavePowerLedState() {
  isPowerLedTaken = true;
  isPowerMuxSaved = SaveMux(kPowerGreenSaveMux);
  RunList(kPowerGreenEnableMux);
  return true;
}

bool SmscMec1322Chip::RestorePowerLedState() {
  if (!isPowerLedTaken) {
    return true;
  }
  if (isPowerMuxSaved) {
    RestoreMux(kPowerGreenSaveMux);
  }
  return AssertPowerLedGreen();
}

bool SmscMec1322Chip::SaveChargeLedState() {
  isChargeRedMuxSaved = SaveMux(kChargeRedSaveMux);
  savedMuxRed = savedMux;
  RunList(kChargeRedEnableMux);
  isChargeGreenMuxSaved = SaveMux(kChargeGreenSaveMux);
  savedMuxGreen = savedMux;
  RunList(kChargeGreenEnableMux);
  return true;
}

bool SmscMec1322Chip::RestoreChargeLedState() {
  if (isChargeGreenMuxSaved) {
    savedMux = savedMuxGreen;
    RestoreMux(kChargeGreenSaveMux);
  }
  if (isChargeRedMuxSaved) {
    savedMux = savedMuxRed;
    RestoreMux(kChargeRedSaveMux);
  }
  return true;
}

}  // namespace panelglow
