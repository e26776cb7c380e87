#include "board/chips/win/WinChip.h"

#include <utility>

#include "board/base/IniReader.h"
#include "board/parts/Bits.h"
#include "board/parts/ConfigMode.h"
#include "board/parts/Lines.h"
#include "board/parts/RowOf.h"
#include "board/parts/RpmOf.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kEnterKey = 0x87;  // twice
constexpr std::uint8_t kExitKey = 0xAA;

// Configuration registers.
constexpr std::uint8_t kActivate = 0x30;  // of each device
constexpr RegisterId kLed{9, 0xF3};
constexpr RegisterId kPanelSwitch{10, 0xE0};
constexpr std::uint8_t kSwitchBlocked = 0x80;  // the button switches nothing
constexpr RegisterId kWakeStatus{10, 0xE3};    // cleared by reading it
constexpr std::uint8_t kSwitchPressed = 0x04;

// Hardware monitor, bank 0.
constexpr std::uint8_t kCounterStopped = 0xFF;
constexpr int kTachClock = 1'350'000;
constexpr int kNoSensor = 0x80;
constexpr int kNoTemperature = 255;

}  // namespace

WinChip::WinChip() : WinChip("win") {}

WinChip::WinChip(std::string chipName)
    : RegisterChip(std::move(chipName)),
      buttonOption{10, 0xE6},
      registers(IndexedPorts(devio, 0), {}, {}),
      config(registers),
      monitor(devio, registers, 0) {
  ReadKeys({"chip.win.", 0x400, 0x295, 0x4E});
  ReadGroups({});
  counters = {{0x28, 0x47, 4, 0x5D, 5}, {0x29, 0x47, 6, 0x5D, 6}, {0x2A, 0x4B, 6, 0x5D, 7}, {0x3F, 0x59, 0, 0x4C, 7}};
  fans = {.duties = RegistersAt(0, {0x01, 0x03, 0x11, 0x61}),
          .fullSpeed = 0xFF,
          .saved = RegistersAt(0, {0x04, 0x04, 0x12, 0x62, 0x01, 0x03, 0x11, 0x61}),
          .manual = {Put({0, 0x04}, 0x40), Put({0, 0x12}, 0x04), Put({0, 0x62}, 0x40)}};
  sensors = {{{0, 0x27}}, {{1, 0x50}, RegisterId{1, 0x51}}, {{2, 0x50}, RegisterId{2, 0x51}}};
  led = {.saved = {kLed}, .green = Steps{Put(kLed, 0x80)}, .off = Steps{Put(kLed, 0)}};
}

void WinChip::ReadKeys(const Keys& keys) {
  const std::string prefix = keys.prefix;
  pmbar = ReadIniWord(prefix + "pmbar", keys.pmbar);
  const std::uint16_t hwmbar = ReadIniWord(prefix + "hwmbar", keys.hwmbar);
  const std::uint16_t cfgbar = ReadIniWord(prefix + "cfgbar", keys.cfgbar);
  registers = ConfigRegisters(IndexedPorts(devio, cfgbar), {kEnterKey, kEnterKey}, {kExitKey});
  monitor = WinMonitor(devio, registers, hwmbar);
}

void WinChip::ReadGroups(const GpioGroups& defaults) {
  for (std::size_t i = 0; i < groups.size(); ++i) {
    const std::string prefix = "chip.win.gpiox." + std::to_string(i + 1) + ".";
    const GpioGroup& fallback = defaults[i];
    groups[i] = {.device = ReadIniByte(prefix + "logical_device", fallback.device),
                 .enableBit = ReadIniByte(prefix + "enable_bit", fallback.enableBit),
                 .io = ReadIniByte(prefix + "io_reg", fallback.io),
                 .data = ReadIniByte(prefix + "data_reg", fallback.data),
                 .inversion = ReadIniByte(prefix + "inversion_reg", fallback.inversion),
                 .status = ReadIniByte(prefix + "status_reg", fallback.status)};
  }
}

// ---- fans, temperatures

std::uint32_t WinChip::ReadFanTach(int fan, int /*arg*/) {
  const Counter* counter = RowOf(counters, fan);
  if (counter == nullptr) {
    return kTachStopped;
  }
  const std::uint32_t count = monitor.Read({0, counter->count});
  if (count == kCounterStopped) {
    return kTachStopped;
  }
  const unsigned low = (monitor.Read({0, counter->low}) >> counter->lowShift) & 3U;
  const unsigned high = (monitor.Read({0, counter->high}) >> counter->highBit) & 1U;
  return count << (low + 4 * high);
}

int WinChip::TachToRpm(std::uint32_t raw, int /*multiplier*/) { return RpmOf(kTachClock, raw); }

bool WinChip::ReadTemperature(int zone, int& value) {
  const Sensor* sensor = RowOf(sensors, zone);
  if (sensor == nullptr) {
    return false;
  }
  const int degrees = monitor.Read(sensor->degrees);
  // The fraction's two upper bits count as halves, the lower of which can carry.
  value = sensor->fraction ? (degrees * 2 + (monitor.Read(*sensor->fraction) >> 6)) / 2 : degrees;
  return true;
}

int WinChip::MapTemperature(int raw) { return raw == kNoSensor ? kNoTemperature : raw; }

// ---- lines

int WinChip::ReadGroup(int line, std::uint8_t GpioGroup::*reg) {
  const int bit = line % 10;
  if (line < 10 || line > 99 || bit > 7) {
    return kNoSuchLine;
  }
  const GpioGroup& group = groups[static_cast<std::size_t>(line / 10 - 1)];
  const std::uint8_t enable = LowByte(MaskOfBit(group.enableBit, 8));
  if (group.device == 0 || enable == 0 || group.io == 0 || group.inversion == 0 || group.*reg == 0) {
    return kNoSuchLine;  // nobody has described it, or not as the part can have it
  }
  const ConfigMode mode(registers);
  registers.Write({group.device, kActivate}, enable);
  registers.Write({group.device, group.io}, 0xFF);
  registers.Write({group.device, group.inversion}, 0);
  return LineState((registers.Read({group.device, group.*reg}) & MaskOfBit(bit, 8)) != 0);
}

// ---- power button

bool WinChip::SavePowerButtonState() {
  savedButton.SaveOnce(config, std::array{kPanelSwitch, buttonOption});
  return true;
}

bool WinChip::ArmPowerButton() {
  SavePowerButtonState();
  Run(std::array{SetBits(kPanelSwitch, kSwitchBlocked)}, config);
  config.Read(kWakeStatus);  // an older press does not count
  return true;
}

bool WinChip::IsPowerButtonPressed(bool& pressed) {
  pressed = (config.Read(kWakeStatus) & kSwitchPressed) != 0;
  return true;
}

bool WinChip::RestorePowerButtonState() {
  savedButton.Restore(config, std::array{kPanelSwitch, buttonOption});
  savedButton.Forget();
  return true;
}

}  // namespace panelglow
