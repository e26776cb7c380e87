#include "board/chips/sensor/SmbusDeviceChip.h"

#include <utility>

#include "board/base/IniReader.h"
#include "board/parts/Sequence.h"

namespace panelglow {

SmbusDeviceChip::Commands SmbusDeviceChip::ReadCommands(const char* key, const char* defaultText) {
  Commands commands;
  for (const auto& [command, value] :
       ParsePairs<std::uint8_t>(IniReader::Instance().ReadIniSetting(key, defaultText))) {
    commands[command] = value;
  }
  return commands;
}

SmbusDeviceChip::SmbusDeviceChip()
    : Chip("smbus_device"),
      host(devio, ReadIniWord("chip.smbus_device.smbus_bar", 0)),
      address(ReadIniByte("chip.smbus_device.smbus_saddr", 0)),
      green(ReadCommands("test.powerled.green.data_blink", "03:0xC4")),
      red(ReadCommands("test.powerled.red.data_blink", "03:0x40,04:0x05")) {}

bool SmbusDeviceChip::Save(const Commands& commands, std::optional<Commands>& saved) const {
  if (saved) {
    return true;
  }
  Commands taken;
  for (const auto& [command, unused] : commands) {
    const std::optional<std::uint8_t> value = host.ReadByte(address, command);
    if (!value) {
      return false;
    }
    taken[command] = *value;
  }
  saved = std::move(taken);
  return true;
}

bool SmbusDeviceChip::Write(const Commands& commands) const {
  for (const auto& [command, value] : commands) {
    if (!host.WriteByte(address, command, value)) {
      return false;
    }
  }
  return true;
}

bool SmbusDeviceChip::SavePowerLedState() { return Save(green, savedGreen) && Save(red, savedRed); }

bool SmbusDeviceChip::RestorePowerLedState() {
  if (!savedGreen || !savedRed || !Write(*savedGreen) || !Write(*savedRed)) {
    return false;
  }
  savedGreen.reset();
  savedRed.reset();
  return true;
}

}  // namespace panelglow
