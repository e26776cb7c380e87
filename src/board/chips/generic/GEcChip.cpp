#include "board/chips/generic/GEcChip.h"

#include <algorithm>

#include "board/base/IniReader.h"
#include "board/parts/Bits.h"
#include "board/parts/NumberedLists.h"
#include "board/parts/RpmOf.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

// Status port.
constexpr std::uint8_t kOutputBufferFull = 0x01;
constexpr std::uint8_t kInputBufferFull = 0x02;
constexpr int kMostLooks = 4095;

constexpr std::uint8_t kUsualWriteCmd = 0x81;
constexpr std::uint8_t kUsualQueryCmd = 0x84;

constexpr double kTachPeriod_s = 2.7826087e-5;  // of one count of the tachometer
constexpr double kSecondsPerMinute = 60.0;

}  // namespace

void GEcChip::Initialize() {
  LoadConfiguration();
  scPort = ReadChipByte(section, "ec.sc.port", scPort);
  dataPort = ReadChipByte(section, "ec.data.port", dataPort);
  readCmd = ReadChipByte(section, "ec.read.cmd", readCmd);
  // Not sent by this class; read so that the record of look-ups is whole.
  ReadChipByte(section, "ec.write.cmd", kUsualWriteCmd);
  ReadChipByte(section, "ec.query.cmd", kUsualQueryCmd);
  ibfSleep = ReadChipDword(section, "ec.ibf.sleeptime", 0);
  obfSleep = ReadChipDword(section, "ec.obf.sleeptime", 0);
  IniReader::status_t status = IniReader::kNotFound;
  const int command = IniReader::Instance().ReadChipInt(section, "ec.set_pwm.cmd", status, 0, 8);
  if (status != IniReader::kFound) {
    throw mblib_exception("chip.ini missing mandatory entry for EC: ec.set_pwm.cmd");
  }
  setPwmCmd = LowByte(static_cast<std::uint32_t>(command));
  ParseSequence(ReadChipSetting(section, "fan.manual_mode.set.sequence", ""), manualSetSequence);
  ParseSequence(ReadChipSetting(section, "fan.manual_mode.reset.sequence", ""), manualResetSequence);
  LoadLedSequences();
}

void GEcChip::LoadLedSequences() {
  ParseSequence(ReadChipSetting(section, "powerled.red.assert.sequence", ""), powerRedAssert);
  ParseSequence(ReadChipSetting(section, "powerled.green.assert.sequence", ""), powerGreenAssert);
  ParseSequence(ReadChipSetting(section, "powerled.deassert.sequence", ""), powerDeassert);
  ParseSequence(ReadChipSetting(section, "powerled.state.save.sequence", ""), powerSave);
  ParseSequence(ReadChipSetting(section, "powerled.state.restore.sequence", ""), powerRestore);
}

bool GEcChip::ParseSequence(const Setting& setting, Sequence& sequence) {
  return panelglow::ParseSequence(setting, sequence, 8);  // a command is a byte
}

// ---- the part's protocol

void GEcChip::WaitIbfClear() {
  if (ibfSleep != 0) {
    platform::TheHost().clock.Sleep(ibfSleep);
  }
  for (int look = 0; look < kMostLooks && (devio.InportByte(scPort) & kInputBufferFull) != 0; ++look) {
  }
}

void GEcChip::WaitObfSet() {
  if (obfSleep != 0) {
    platform::TheHost().clock.Sleep(obfSleep);
  }
  for (int look = 0; look < kMostLooks && (devio.InportByte(scPort) & kOutputBufferFull) == 0; ++look) {
  }
}

void GEcChip::SendCommand(std::uint8_t command) {
  WaitIbfClear();
  devio.OutportByte(scPort, command);
}

void GEcChip::SendData(std::uint8_t data) {
  WaitIbfClear();
  devio.OutportByte(dataPort, data);
}

std::uint8_t GEcChip::ReadEc(std::uint8_t address) {
  SendCommand(readCmd);
  SendData(address);
  WaitObfSet();
  return devio.InportByte(dataPort);
}

std::uint8_t GEcChip::ReadEc2(std::uint8_t high, std::uint8_t low) {
  SendCommand(readCmd);
  SendData(high);
  SendData(low);
  WaitObfSet();
  return devio.InportByte(dataPort);
}

bool GEcChip::RunSequence(const Sequence& sequence) {
  if (sequence.empty()) {
    return true;
  }
  WaitObfSet();
  for (const SequenceEntry& entry : sequence) {
    SendCommand(LowByte(entry.command));
    for (const std::uint8_t byte : entry.data) {
      SendData(byte);
    }
  }
  return true;
}

void GEcChip::SetEcPwm(std::uint16_t reg, std::uint8_t value) {
  WaitObfSet();
  SendCommand(setPwmCmd);
  if (reg != 0) {
    if (HighByte(reg) != 0) {
      SendData(HighByte(reg));
    }
    SendData(LowByte(reg));
  }
  SendData(value);
}

// ---- fans and temperatures

// An entry below 0x10000 holds two 8-bit addresses, high byte's first; any other two 16-bit ones.
std::uint32_t GEcChip::ReadFanTach(int fan, int /*arg*/) {
  const std::uint32_t entry = FanTachEntry(tachRegs, fan);
  if (entry < 0x10000) {
    const std::uint8_t high = ReadEc(HighByte(entry));
    return WordOf(high, ReadEc(LowByte(entry)));
  }
  const std::uint8_t high = ReadEc2(LowByte(entry >> 24U), LowByte(entry >> 16U));
  return WordOf(high, ReadEc2(HighByte(entry), LowByte(entry)));
}

int GEcChip::TachToRpm(std::uint32_t raw, int /*multiplier*/) {
  return raw == 0 || raw >= kTachStopped ? 0 : static_cast<int>(kSecondsPerMinute / (raw * kTachPeriod_s));
}

bool GEcChip::SetFanPwm(int fan, int value) {
  const std::uint16_t reg = pwmRegs.empty() ? std::uint16_t{0} : FanPwmEntry(pwmRegs, fan);
  SetEcPwm(reg, LowByte(static_cast<std::uint32_t>(std::clamp<int>(value, 0, fullSpeedData))));
  return true;
}

bool GEcChip::ReadTemperature(int zone, int& value) {
  const std::uint16_t entry = TemperatureEntry(tempReadRegs, zone);
  value = entry > 0xFF ? ReadEc2(HighByte(entry), LowByte(entry)) : ReadEc(LowByte(entry));
  return true;
}

bool GEcChip::ReadLowLimitTemperature(int zone, int& value) {
  value = ReadEc(LowByte(LowLimitEntry(tempLimitRegs, zone)));
  return true;
}

bool GEcChip::IsPowerLedRedSupported(bool& supported) {
  supported = true;
  return true;
}

}  // namespace panelglow
