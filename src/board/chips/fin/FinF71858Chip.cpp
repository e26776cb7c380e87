#include "board/chips/fin/FinF71858Chip.h"

#include <utility>

#include "harness/base/CDMout.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr RegisterId kLedMode{1, 0xF9};

// Hardware monitor.
constexpr RegisterId kFanMode{0, 0x96};
constexpr RegisterId kProcessorInterface{0, 0x0A};
constexpr std::uint8_t kProcessorReads = 0x01;  // bit of it: zone 2 is what the processor says
constexpr RegisterId kProcessorOffset{0, 0x0C};
constexpr int kProcessorZone = 2;
constexpr int kHottestProcessor = 105;  // where the processor's reading is its offset
constexpr std::uint32_t kBetweenReads_ms = 100;

}  // namespace

FinF71858Chip::FinF71858Chip() : FinF71858Chip("fin_f71858") {}

FinF71858Chip::FinF71858Chip(std::string chipName) : FinCurveChip(std::move(chipName)) {
  ReadKeys({"chip.fin_f71858.", 0x800, 0xA05, 0x4E, 0xC0, 0x02});
  // The third fan's curve is set with the others and not among the saved registers.
  fans.saved = WithCurves({kFanMode.reg}, {0xA6, 0xB6}, 11);
  fans.manual = {Put(kFanMode, 0x15)};
  takesAllFans = true;
  zones.zones = RegistersAt(0, {0x70, 0x72, 0x74, 0x7A, 0x7B, 0x7C, 0x7D, 0x7E});
  led = {.saved = {kLedMode},
         .green = Steps{Put(kLedMode, green)},
         .red = Steps{Put(kLedMode, red)},
         .off = Steps{Put(kLedMode, 0)},
         .isRedSupported = true};
}

// The processor counts down from its offset; a reading above it is taken for a bad one, once.
bool FinF71858Chip::ReadTemperature(int zone, int& value) {
  if (zone != kProcessorZone || (monitor.Read(kProcessorInterface) & kProcessorReads) == 0) {
    return FinCurveChip::ReadTemperature(zone, value);
  }
  const int offset = monitor.Read(kProcessorOffset);
  FinCurveChip::ReadTemperature(zone, value);
  if (value > offset) {
    CDMout::LogMessage(LogOptions::Debug, kNote, "Invalid Temp Read, Retrying..");
    platform::TheHost().clock.Sleep(kBetweenReads_ms);
    FinCurveChip::ReadTemperature(zone, value);
  }
  value += kHottestProcessor - offset;
  return true;
}

}  // namespace panelglow
