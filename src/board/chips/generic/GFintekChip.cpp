#include "board/chips/generic/GFintekChip.h"

#include <algorithm>
#include <array>
#include <optional>

#include "board/base/IniReader.h"
#include "board/parts/Bits.h"
#include "board/parts/ClearedLatch.h"
#include "board/parts/ConfigMode.h"
#include "board/parts/Lines.h"
#include "board/parts/ReadBase.h"
#include "board/parts/RpmOf.h"
#include "board/parts/Sequence.h"

namespace panelglow {

namespace {

constexpr int kTachClock = 1'500'000;
constexpr std::uint32_t kTachOverflow = 4095;  // of the 12-bit counter

constexpr int kIntrusionLine = 237;
constexpr std::uint8_t kIntrusionStatus = 0x03;  // environment register; its bit is cleared by writing it
constexpr std::uint8_t kIntrusion = 0x01;
constexpr std::uint32_t kClearSettle_ms = 10;

// GPIO groups: first line, last line, configuration register with the levels.
constexpr std::array<LineRange, 5> kGpioGroups{
    {{0, 5, 0xF2}, {10, 17, 0xE2}, {20, 27, 0xD2}, {30, 33, 0xC2}, {40, 45, 0xB2}}};

}  // namespace

void GFintekChip::Initialize() {
  GSioChip::Initialize();
  ParsePairList(ReadChipSetting(section, "fan.manual_mode.set.sequence", ""), manualModeSet);
  LoadBlinkLists();
}

void GFintekChip::LoadBlinkLists() {
  ParsePairList(ReadChipSetting(section, "powerled.red.blink.sequence", ""), redBlink);
  ParsePairList(ReadChipSetting(section, "powerled.green.blink.sequence", ""), greenBlink);
}

void GFintekChip::ParsePairList(const Setting& setting, PairList& list) { list = ParsePairs<std::uint8_t>(setting); }

bool GFintekChip::RunPairList(const PairList& list) {
  Run(StepsOf(list), environment);
  return true;
}

bool GFintekChip::EnterManualFanMode() { return RunPairList(manualModeSet); }

bool GFintekChip::ReadFanRpm(int fan, int& rpm, int multiplier) {
  rpm = 0;
  const std::uint32_t raw = ReadFanTach(fan, 0);
  if (raw == 0 || raw == kTachOverflow || raw == kTachStopped) {
    return false;
  }
  rpm = TachToRpm(raw, multiplier);
  return true;
}

int GFintekChip::TachToRpm(std::uint32_t raw, int /*multiplier*/) {
  return raw == kTachOverflow ? 0 : RpmOf(kTachClock, std::min(raw, kTachStopped));
}

bool GFintekChip::ReadIntrusionLatch(int line, bool /*clearFirst*/, bool& value) {
  const int state = ReadLine(line);
  value = state == kAsserted;
  return state != kNoSuchLine;
}

int GFintekChip::ReadLine(int line) {
  if (line == kIntrusionLine && IsBase(hwmBar)) {
    return LineState(ReadClearedLatch(environment, {0, kIntrusionStatus}, kIntrusion, kClearSettle_ms));
  }
  std::uint8_t reg = 0;
  std::uint8_t mask = 0;
  if (!HasConfigPorts() || !MapGpioLine(line, reg, mask)) {
    return kNoSuchLine;
  }
  const ConfigMode mode(*this);
  SelectLogicalDevice(gpioLdn);
  return LineState((ReadConfigRegister(reg) & mask) != 0);
}

bool GFintekChip::MapGpioLine(int line, std::uint8_t& reg, std::uint8_t& mask) {
  const std::optional<LinePlace> found = FindLine(kGpioGroups, line);
  if (found) {
    reg = LowByte(found->place);
    mask = LowByte(found->mask);
  }
  return found.has_value();
}

}  // namespace panelglow
