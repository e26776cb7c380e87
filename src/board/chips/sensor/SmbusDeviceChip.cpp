#include "board/chips/sensor/SmbusDeviceChip.h"

#include <algorithm>
#include <optional>
#include <string>

#include "board/base/IniReader.h"
#include "board/parts/Sequence.h"
#include "harness/base/Notices.h"

namespace panelglow {

namespace {

constexpr const char* kBaseKey = "chip.smbus_device.smbus_bar";

}  // namespace

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
      hasBase(ReadIniWord(kBaseKey, 0) != 0),
      host(devio, ReadIniWord(kBaseKey, 0)),
      address(ReadIniByte("chip.smbus_device.smbus_saddr", 0)),
      green(ReadCommands("test.powerled.green.data_blink", "03:0xC4")),
      red(ReadCommands("test.powerled.red.data_blink", "03:0x40,04:0x05")) {
  if (!hasBase) {
    Notices::Tell(std::string("The chip \"smbus_device\" has no SMBus host: give its first port with the key \"") +
                  kBaseKey + "\".");
  }
}

// What is held stays: a save is made once.
bool SmbusDeviceChip::Save(const Commands& commands, Commands& saved) const {
  for (const auto& [command, unused] : commands) {
    if (saved.count(command) != 0) {
      continue;
    }
    const std::optional<std::uint8_t> value = host.ReadByte(address, command);
    if (!value) {
      return false;
    }
    saved[command] = *value;
  }
  return true;
}

bool SmbusDeviceChip::Write(const Commands& commands) const {
  return hasBase && std::all_of(commands.begin(), commands.end(), [this](const auto& pair) {
           return host.WriteByte(address, pair.first, pair.second);
         });
}

bool SmbusDeviceChip::SavePowerLedState() { return hasBase && Save(green, savedGreen) && Save(red, savedRed); }

bool SmbusDeviceChip::RestorePowerLedState() {
  const bool isWhole = savedGreen.size() == green.size() && savedRed.size() == red.size();
  if (!Write(savedGreen) || !Write(savedRed)) {
    return false;
  }
  savedGreen.clear();
  savedRed.clear();
  return isWhole;
}

}  // namespace panelglow
