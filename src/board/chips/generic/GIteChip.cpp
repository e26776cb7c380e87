#include "board/chips/generic/GIteChip.h"

#include "board/base/IniReader.h"
#include "board/base/mblib_exception.h"
#include "board/parts/Bits.h"
#include "board/parts/ConfigMode.h"
#include "board/parts/LedLineMap.h"
#include "board/parts/ReadBase.h"
#include "board/parts/Step.h"
#include "harness/base/CDMUtil.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

// Global configuration registers.
constexpr std::uint8_t kConfigureControl = 0x02;
constexpr std::uint8_t kReturnToWaitForKey = 0x02;  // bit of it
constexpr std::uint8_t kChipId1 = 0x20;
constexpr std::uint8_t kChipId2 = 0x21;
constexpr std::uint8_t kChipVersion = 0x22;

// A part whose fans answer to the duty registers without further ado.
constexpr std::uint32_t kManualByNature = 0x872005;

constexpr std::uint8_t kAutomaticMode = 0xC0;  // of a PWM control register

// Environment controller.
constexpr std::uint8_t kConfiguration = 0x00;
constexpr std::uint8_t kClearIntrusion = 0x20;
constexpr std::uint8_t kInterruptStatus1 = 0x01;
constexpr std::uint8_t kIntrusion = 0x10;
constexpr int kIntrusionLine = 237;
constexpr std::uint32_t kClearSettle_ms = 10;
constexpr std::uint32_t kStatusSettle_ms = 100;

[[noreturn]] void Refuse(const std::string& failure, const Setting& setting) {
  TellOf(setting, failure);
  throw mblib_exception(failure);
}

}  // namespace

void GIteChip::Initialize() {
  GSioChip::Initialize();
  for (std::size_t i = 0; i < pwmControlRegs.size(); ++i) {
    const std::string key = "fan." + std::to_string(i + 1) + ".pwm_ctl.reg";
    pwmControlRegs[i] = ReadChipByte(section, key, 0);
  }
  LoadBlinkLists();
}

void GIteChip::ExitConfigMode() { ConfigPorts().SetBits(kConfigureControl, kReturnToWaitForKey); }

std::uint32_t GIteChip::ReadChipId() {
  if (!HasConfigPorts()) {
    return 0;
  }
  const ConfigMode mode(*this);
  const std::uint32_t id1 = ReadConfigRegister(kChipId1);
  const std::uint32_t id2 = ReadConfigRegister(kChipId2);
  return id1 << 16U | id2 << 8U | ReadConfigRegister(kChipVersion);
}

bool GIteChip::EnterManualFanMode() {
  if (ReadChipId() == kManualByNature) {
    return true;
  }
  for (const std::uint8_t reg : pwmControlRegs) {
    const std::uint8_t control = ReadEnvRegister(reg);
    if ((control & kAutomaticMode) != 0) {
      WriteEnvRegister(reg, control & static_cast<std::uint8_t>(~kAutomaticMode));
    }
  }
  return true;
}

int GIteChip::ReadLine(int line) {
  if (line != kIntrusionLine || !IsBase(hwmBar)) {
    return kNoSuchLine;
  }
  platform::Clock& clock = platform::TheHost().clock;
  // The first reads give what was latched before; what counts is the state behind them.
  Run(Steps{SetBits({0, kConfiguration}, kClearIntrusion)}, environment);
  ReadEnvRegister(kInterruptStatus1);
  clock.Sleep(kClearSettle_ms);
  ReadEnvRegister(kInterruptStatus1);
  clock.Sleep(kStatusSettle_ms);
  return LineState((ReadEnvRegister(kInterruptStatus1) & kIntrusion) != 0);
}

// ---- blink lists

void GIteChip::LoadBlinkLists() {
  primaryLine = ReadChipInt(section, "powerled.color.primary.gpio", primaryLine);
  secondaryLine = ReadChipInt(section, "powerled.color.secondary.gpio", secondaryLine);
  redBlink = ParseBlinkList("powerled.red.blink.sequence");
  greenBlink = ParseBlinkList("powerled.green.blink.sequence");
}

// Pairs of configuration register and value in one flat list; a last register without a value is dropped.
GIteChip::PairList GIteChip::ParseBlinkList(const std::string& key) {
  const Setting setting = ReadChipSetting(section, key, "");
  std::vector<std::string> tokens;
  CDMUtil::Split(setting.text, tokens, ",: ");
  PairList list;
  for (std::size_t i = 0; i + 1 < tokens.size(); i += 2) {
    list.emplace_back(LowByte(NumberIn(tokens[i], 8, setting)), BlinkValue(tokens[i + 1], key, setting));
  }
  return list;
}

std::uint8_t GIteChip::BlinkValue(const std::string& token, const std::string& key, const Setting& setting) {
  for (const auto& [color, line] : {std::pair{"primary", primaryLine}, std::pair{"secondary", secondaryLine}}) {
    if (token == std::string(color) + "_led") {
      const std::uint8_t map = MapGpioLine(line);
      if (map == kNoLedLineMap) {
        Refuse(std::string("invalid ") + color + " led map. Check powerled.color." + color + ".gpio entry.", setting);
      }
      return map;
    }
  }
  if (!CDMUtil::IsInteger(token)) {
    Refuse("invalid " + key + " entry", setting);
  }
  return LowByte(NumberIn(token, 8, setting));
}

std::uint8_t GIteChip::MapGpioLine(int line) { return LedLineMap(line); }

}  // namespace panelglow
