#include "board/chips/ite/IteChip.h"

#include <algorithm>
#include <utility>

#include "board/base/IniReader.h"
#include "board/parts/LedLineMap.h"
#include "board/parts/RpmOf.h"

namespace panelglow {

namespace {

constexpr std::uint16_t kConfigPort = 0x2E;
constexpr std::uint16_t kMonitorBase = 0x290;
constexpr std::uint16_t kMonitorIndex = 5;  // offset of the index port; the data port is the next one

constexpr int kTachClock = 1'350'000 / 2;  // a count is two of the clock's
constexpr int kHottest = 126;              // a raw temperature from here on is no temperature
constexpr int kNoTemperature = 255;

// Hardware monitor.
constexpr RegisterId kConfiguration{0, 0x00};
constexpr RegisterId kControllerMode{0, 0x0B};
constexpr RegisterId kTachEnable{0, 0x0C};
constexpr RegisterId kMainControl{0, 0x13};
constexpr RegisterId kFanControl{0, 0x14};
constexpr RegisterId kDuty1{0, 0x15};
constexpr RegisterId kDuty2{0, 0x16};
constexpr RegisterId kDuty3{0, 0x17};

// Of the lines of GPIO set 2, where the LED's colours are by default; beside the ones of IteChip.
constexpr std::uint8_t kPolarity2 = 0xB1;

}  // namespace

IteChip::IteChip(std::string chipName)
    : RegisterChip(std::move(chipName)), monitor(IndexedPorts(devio, 0)), config(devio, kConfigPort) {
  ReadMonitorBase("chip.ite.");
  primary = LedLineMap(ReadIniInt("chip.ite.powerled.color.primary.gpio", 22));
  secondary = LedLineMap(ReadIniInt("chip.ite.powerled.color.secondary.gpio", 23));
  fans = {
      .tachs = {{{0, 0x0D}, {0, 0x18}},  // low byte, high byte
                {{0, 0x0E}, {0, 0x19}},
                {{0, 0x0F}, {0, 0x1A}},
                {{0, 0x80}, {0, 0x81}},
                {{0, 0x82}, {0, 0x83}}},
      .badTachText = "\n***** ITE error: invalid fan index %d\n",
      .duties = {kDuty1, kDuty2, kDuty3},
      .saved = {kConfiguration, kMainControl, kFanControl, kControllerMode, kTachEnable, kDuty1, kDuty2, kDuty3},
      .restored = {kControllerMode, kTachEnable, kDuty1, kDuty2, kDuty3, kFanControl, kMainControl, kConfiguration},
      .manual = {FromSaved(kMainControl, 0xFF, 0x70), FromSaved(kFanControl, 0xF7, 0),
                 FromSaved(kControllerMode, 0x3F, 0), FromSaved(kConfiguration, 0xFE, 0)},
      .restoreWait_ms = 2000};
  zones = {.zones = RegistersAt(0, {0x29, 0x2A, 0x2B}),
           .badZoneText = "\n***** Ite::ReadTemperature CALLED WITH INVALID ZONE NUMBER = %d (must be 1,2, or 3)\n",
           .badZoneValue = kNoTemperature,
           .lowLimits = {{{0, 0x41}, {0, 0x40}}, {{0, 0x43}, {0, 0x42}}, {{0, 0x45}, {0, 0x44}}},  // low, high byte
           .badLimitText = "\n***** ITE error: invalid temp zone %d\n"};
  led = {.saved = {kLed1Map, kLed1Control, kGpioSet2, RegisterId{kLedDevice, kPolarity2}},
         .green = Steps{Put(kLed1Map, primary), Put(kLed1Control, kOneHertz)},
         .red = Steps{Put(kGpioSet2, kLedPins), Put({kLedDevice, kPolarity2}, 0x04), Put(kLed1Map, secondary),
                      Put(kLed1Control, kOneHertz)},
         .off = Steps{}};
}

void IteChip::ReadMonitorBase(const std::string& prefix) {
  const std::uint16_t hwmbar = ReadIniWord(prefix + "hwmbar", kMonitorBase);
  monitor = IndexedRegisters(IndexedPorts(devio, static_cast<std::uint16_t>(hwmbar + kMonitorIndex)));
}

int IteChip::TachToRpm(std::uint32_t raw, int /*multiplier*/) { return RpmOf(kTachClock, raw); }

int IteChip::MapTemperature(int raw) { return raw < kHottest ? raw : kNoTemperature; }

std::uint8_t IteChip::DutyOf(int value) const { return static_cast<std::uint8_t>(std::clamp(value, 0, 255) >> 1); }

}  // namespace panelglow
