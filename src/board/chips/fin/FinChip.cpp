#include "board/chips/fin/FinChip.h"

#include <array>
#include <optional>
#include <utility>

#include "board/base/IniReader.h"
#include "board/parts/Bits.h"
#include "board/parts/ClearedLatch.h"
#include "board/parts/ConfigMode.h"
#include "board/parts/Lines.h"
#include "board/parts/RpmOf.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kEnterKey = 0x87;  // twice
constexpr std::uint8_t kExitKey = 0xAA;

// Configuration registers.
constexpr RegisterId kMultiFunctionSelect2{ConfigRegisters::kGlobal, 0x2A};
constexpr RegisterId kMultiFunctionSelect3{ConfigRegisters::kGlobal, 0x2B};
constexpr std::uint8_t kGpioDevice = 6;

// GPIO groups: first line, last line, register with the levels.
constexpr std::array<LineRange, 5> kGpioGroups{
    {{0, 3, 0xF2}, {10, 17, 0xE2}, {20, 27, 0xD2}, {30, 33, 0xC2}, {40, 45, 0xB2}}};

// Hardware monitor.
constexpr RegisterId kCaseStatus{0, 0x03};
constexpr std::uint8_t kCaseOpen = 0x01;  // cleared by writing it
constexpr RegisterId kFanMode{0, 0x96};
constexpr std::uint8_t kAllManual = 0xFF;
constexpr std::uint32_t kTachOverflow = 4095;  // of the 12-bit counter
constexpr int kTachClock = 1'500'000;
constexpr int kNoSensor = 0x80;
constexpr int kNoTemperature = 255;
constexpr std::uint32_t kCaseSettle_ms = 10;

// The case switch as the chipset latches it.
constexpr int kMonitorLine = 237;
constexpr int kChipsetLine = 238;
constexpr std::uint16_t kLatchControl = 0x4449;
constexpr std::uint16_t kLatchStatus = 0x4444;
constexpr std::uint8_t kLatched = 0x04;  // of the status
constexpr std::uint32_t kLatchSettle_ms = 100;

}  // namespace

FinChip::FinChip() : FinChip("fin") {
  ReadSelectKeys();
  SetSelectLed();
}

FinChip::FinChip(std::string chipName)
    : RegisterChip(std::move(chipName)),
      monitor(IndexedPorts(devio, 0)),
      config(IndexedPorts(devio, 0), {}, {}),
      ledRegisters(config),
      button(devio, 0, PowerEventButton::Check::kReadBack) {
  ReadKeys({"chip.fin.", 0x800, 0xA05, 0x4E, 0xC0, 0x30, 0x60});
  fans = {.tachs = RegisterPairs(0, 0xA0, 3, 0x10),
          .tachOrder = PairOrder::kHighFirst,
          .tachOverflow = kTachOverflow,
          .duties = RegistersAt(0, {0xA3, 0xB3, 0xC3}),
          .fullSpeed = 0xFF,
          .saved = {kFanMode},
          .manual = {Put(kFanMode, kAllManual)}};
  zones = {.zones = RegistersAt(0, {0x72, 0x74, 0x76})};
  SetSelectLed();
}

void FinChip::SetSelectLed() {
  led = {.saved = {kMultiFunctionSelect3, kMultiFunctionSelect2},
         .prepared = {Put(kMultiFunctionSelect3, gpios15And16)},
         .restored = {kMultiFunctionSelect2, kMultiFunctionSelect3},
         .green = Steps{Put(kMultiFunctionSelect2, green)},
         .red = Steps{Put(kMultiFunctionSelect2, red)},
         .off = Steps{Put(kMultiFunctionSelect2, 0)},
         .isRedSupported = true};
}

void FinChip::ReadKeys(const Keys& keys) {
  const std::string prefix = keys.prefix;
  const std::string select2 = prefix + "multifunction_select2_register.";
  pmbar = ReadIniWord(prefix + "pmbar", keys.pmbar);
  const std::uint16_t hwmbar = ReadIniWord(prefix + "hwmbar", keys.hwmbar);
  const std::uint16_t cfgbar = ReadIniWord(prefix + "cfgbar", keys.cfgbar);
  green = ReadIniByte(select2 + "green", keys.green);
  red = ReadIniByte(select2 + "red", keys.red);
  if (keys.gpios15And16) {
    gpios15And16 = ReadIniByte(prefix + "multifunction_select3_register.gpios15_16", *keys.gpios15And16);
  }
  monitor = IndexedRegisters(IndexedPorts(devio, hwmbar));
  config = ConfigRegisters(IndexedPorts(devio, cfgbar), {kEnterKey, kEnterKey}, {kExitKey});
  button = PowerEventButton(devio, pmbar, PowerEventButton::Check::kReadBack);
}

void FinChip::ReadSelectKeys() {
  green = ReadIniByte("chip.fin.reg2Agreen", green);
  red = ReadIniByte("chip.fin.reg2Ared", red);
  gpios15And16 = ReadIniByte("chip.fin.reg2B", gpios15And16);
}

// ---- fans, temperatures

int FinChip::TachToRpm(std::uint32_t raw, int /*multiplier*/) { return RpmOf(kTachClock, raw); }

int FinChip::MapTemperature(int raw) { return raw == kNoSensor ? kNoTemperature : raw; }

// ---- lines

bool FinChip::ReadIntrusionLatch(int line, bool /*clearFirst*/, bool& value) {
  value = (devio.InportWord(static_cast<std::uint16_t>(pmbar + static_cast<unsigned>(line))) & 1U) != 0;
  return true;
}

int FinChip::ReadLine(int line) {
  if (line == kMonitorLine) {
    return LineState(ReadClearedLatch(monitor, kCaseStatus, kCaseOpen, kCaseSettle_ms));
  }
  if (line == kChipsetLine) {
    devio.OutportByte(kLatchControl, static_cast<std::uint8_t>((devio.InportByte(kLatchControl) & ~2U) | 1U));
    platform::TheHost().clock.Sleep(kLatchSettle_ms);
    return LineState((devio.InportByte(kLatchStatus) & kLatched) != 0);
  }
  const std::optional<LinePlace> found = FindLine(kGpioGroups, line);
  if (!found) {
    return kNoSuchLine;
  }
  const ConfigMode mode(config);
  return LineState((config.Read({kGpioDevice, LowByte(found->place)}) & found->mask) != 0);
}

// ---- power button

bool FinChip::SavePowerButtonState() {
  button.Save();
  return true;
}

bool FinChip::ArmPowerButton() { return button.Arm(); }

bool FinChip::IsPowerButtonPressed(bool& pressed) {
  pressed = button.IsPressed();
  return true;
}

bool FinChip::RestorePowerButtonState() { return button.Restore(); }

}  // namespace panelglow
