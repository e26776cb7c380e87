#include "board/chips/firmware/CaslChip.h"

#include <algorithm>

#include "board/base/IniReader.h"
#include "board/parts/Sequence.h"
#include "harness/base/CDMUtil.h"
#include "hw/BiosCall.h"

namespace panelglow {

namespace {

// Sizes of the firmware's answers.
constexpr std::size_t kNoAnswer = 0;
constexpr std::size_t kRecordAnswer = 2;
constexpr std::size_t kRecord_bytes = 128;

// Fans and temperatures.
constexpr std::uint32_t kThermalType = 0x28;
constexpr std::uint32_t kThermalRead = 1;
constexpr std::uint32_t kThermalWrite = 2;
constexpr std::uint8_t kFanSpeeds = 3;
constexpr std::uint8_t kFanDuties = 0x23;
constexpr std::uint8_t kTemperatures = 1;
constexpr std::uint8_t kOtherTemperatures = 0;
constexpr int kLowestDuty = 1;
constexpr int kHighestDuty = 254;
constexpr int kFullScale = 255;

constexpr std::uint8_t kOn = 0x01;  // of a device's byte in the wireless record

// A record whose first byte counts the items that follow it.
std::vector<std::uint8_t> ReadThermalRecord(std::uint8_t what) {
  return CallBios(kThermalRead, kThermalType, {what, 0, 0, 0}, kRecordAnswer);
}

// The byte of item `n`; 0 for one that is not in the record.
std::uint8_t ItemOf(const std::vector<std::uint8_t>& record, int n) {
  const auto index = static_cast<std::size_t>(n) + 1;
  return n >= 0 && index < record.size() ? record[index] : std::uint8_t{0};
}

bool IsOn(const std::vector<std::uint8_t>& record, std::uint32_t device) {
  return device < record.size() && (record[device] & kOn) != 0;
}

}  // namespace

void CaslChip::Initialize() {
  const std::string section = ReadIniValue("chip.casl.data", name);
  writeCommand = ReadChipByte(section, "config.write.command", writeCommand);
  readCommand = ReadChipByte(section, "config.read.command", readCommand);
  methodType = ReadChipByte(section, "wireless.methodtype", methodType);
  powerControl = ReadChipByte(section, "wireless.powercontrol", powerControl);
  assertValue = ReadChipByte(section, "wireless.assert.command", assertValue);
  deassertValue = ReadChipByte(section, "wireless.deassert.command", deassertValue);
  const Setting list = ReadChipSetting(section, "wireless.devices.buffer", "");
  devices.clear();
  for (const std::string& token : SplitList(list)) {
    const auto device = static_cast<std::uint32_t>(CDMUtil::ToInt(token));
    CheckNumber(token, 32, device, list);
    devices.push_back(device);
  }
  ReadWirelessHeader();
  isSetUp = true;
}

void CaslChip::SetUpOnce() {
  if (!isSetUp) {
    Initialize();
  }
}

// ---- wireless

std::vector<std::uint8_t> CaslChip::ReadWirelessRecord() const {
  return CallBios(readCommand, methodType, {}, kRecordAnswer);
}

void CaslChip::ReadWirelessHeader() {
  const std::vector<std::uint8_t> record = ReadWirelessRecord();
  firstByte = record[0];
  secondByte = record[1];
}

bool CaslChip::SetWirelessPower(bool on) {
  SetUpOnce();
  CallBios(writeCommand, methodType, {firstByte, secondByte, powerControl, on ? assertValue : deassertValue},
           kNoAnswer);
  return true;
}

bool CaslChip::SaveWirelessLedState() {
  SetUpOnce();
  const std::vector<std::uint8_t> record = ReadWirelessRecord();
  wirelessOn =
      std::any_of(devices.begin(), devices.end(), [&](std::uint32_t wireless) { return IsOn(record, wireless); });
  return true;
}

bool CaslChip::ReadLatchedPort(std::uint16_t /*port*/, std::uint32_t mask, bool& value) {
  SetUpOnce();
  const std::vector<std::uint8_t> record = ReadWirelessRecord();
  value = devices.empty() || std::uint32_t{IsOn(record, devices.front())} != mask;
  if (value) {
    SetWirelessPower(mask == 1);
  }
  return true;
}

// ---- fans and temperatures

bool CaslChip::ReadFanRpm(int fan, int& rpm, int multiplier) {
  const std::vector<std::uint8_t> record = ReadThermalRecord(kFanSpeeds);
  const std::uint8_t speed = ItemOf(record, fan);
  if (fan >= record.front() || speed == 0) {
    return false;
  }
  rpm = speed * multiplier;
  return true;
}

bool CaslChip::ReadVirtualTemperature(int zone, bool flag, int& value) {
  const std::vector<std::uint8_t> record = ReadThermalRecord(flag ? kOtherTemperatures : kTemperatures);
  if (zone < 0 || zone > record.front()) {
    return false;
  }
  value = ItemOf(record, zone);
  return true;
}

bool CaslChip::SetFanPwm(int fan, int value) {
  const std::vector<std::uint8_t> duties = ReadThermalRecord(kFanDuties);
  std::vector<std::uint8_t> record(kRecord_bytes);
  record[0] = kFanDuties;
  std::copy(duties.begin(), duties.end() - 1, record.begin() + 1);
  // Behind the first byte the record is the answer's: the count, then a byte for each fan.
  if (const auto place = static_cast<std::size_t>(fan) + 2; fan >= 0 && place < record.size()) {
    record[place] = static_cast<std::uint8_t>(std::clamp(value, kLowestDuty, kHighestDuty));
  }
  CallBios(kThermalWrite, kThermalType, record, kNoAnswer);
  return true;
}

bool CaslChip::SetFanFullSpeed(int fan) { return SetFanPwm(fan, kHighestDuty); }

bool CaslChip::SetFanPwmPercent(int fan, int percent) {
  return SetFanPwm(fan, static_cast<int>(std::clamp(percent, 0, 100) * 0.01 * kFullScale));
}

}  // namespace panelglow
