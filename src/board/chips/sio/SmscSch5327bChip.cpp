#include "board/chips/sio/SmscSch5327bChip.h"

#include "board/base/IniReader.h"
#include "board/parts/ReadBase.h"

namespace panelglow {

namespace {

constexpr const char* kPrefix = "chip.smsc_sch5327b.";

constexpr std::uint8_t kEnterKey = 0x55;
constexpr std::uint8_t kExitKey = 0xAA;
constexpr std::uint8_t kRuntimeDevice = 10;

// Runtime registers.
constexpr RegisterId kLed{0, 0x5B};
constexpr RegisterId kLedBlink{0, 0x77};

// Hardware monitor.
constexpr RegisterId kFan1Mode{0, 0xA4};
constexpr RegisterId kFan2Mode{0, 0xA5};
constexpr RegisterId kFan3Mode{0, 0xA6};
constexpr RegisterId kFan1Duty{0, 0xA0};
constexpr RegisterId kFan2Duty{0, 0xA1};
constexpr RegisterId kFan3Duty{0, 0xA2};
constexpr std::uint8_t kAutomatic = 0x08;  // of a mode
constexpr std::uint32_t kFansSettle_ms = 2000;

}  // namespace

SmscSch5327bChip::SmscSch5327bChip()
    : SioChip("smsc_sch5327b"),
      config(IndexedPorts(devio, ReadIniWord(std::string(kPrefix) + "cfgbar", 0x2E)), {kEnterKey}, {kExitKey}),
      ledRegisters(devio, 0, config) {
  const std::uint16_t runtimeBase = ReadBase(config, kRuntimeDevice);
  ReadKeys(kPrefix, 0xF800, 0x880);
  const std::string select2 = std::string(kPrefix) + "multifunction_select2_register.";
  const std::uint8_t green = ReadIniByte(select2 + "green", 0x0E);
  const std::uint8_t red = ReadIniByte(select2 + "red", 0x0F);
  fans.duties = {kFan1Duty, kFan2Duty, kFan3Duty};
  fans.saved = {kFan1Mode, kFan1Duty, kFan2Mode, kFan2Duty, kFan3Mode, kFan3Duty};
  fans.manual = {ClearBits(kFan1Mode, kAutomatic), ClearBits(kFan2Mode, kAutomatic),
                 ClearBits(kFan3Mode, kAutomatic)};
  fans.restoreWait_ms = kFansSettle_ms;
  led = {.isRedSupported = true};
  if (!IsBase(runtimeBase)) {
    return;
  }
  ledRegisters = LedFile(devio, runtimeBase, config);
  led = {.saved = {kLed, kLedBlink},
         .green = Steps{FromSaved(kLed, 0xFF, green), Put(kLedBlink, 0)},
         .red = Steps{FromSaved(kLed, 0xFF, red), Put(kLedBlink, 0)},
         .off = Steps{Put(kLed, 0), Put(kLedBlink, 0)},
         .isRedSupported = true};
}

}  // namespace panelglow
