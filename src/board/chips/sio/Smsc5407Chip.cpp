#include "board/chips/sio/Smsc5407Chip.h"

#include "board/base/BoardDevio.h"
#include "board/parts/ProbeConfigPort.h"
#include "board/parts/ReadBase.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kEnterKey = 0x55;
constexpr std::uint8_t kExitKey = 0xAA;
constexpr std::uint8_t kRuntimeDevice = 10;

// Runtime registers, from their base on.
constexpr std::uint16_t kMonitorIndex = 0x70;  // and the data port behind it
constexpr RegisterId kLedLine{0, 0x47};
constexpr RegisterId kLed{0, 0x5D};

std::uint16_t AskForBase(CDevio& devio) {
  const std::uint16_t port = ProbeConfigPort(devio, {kEnterKey}, {kExitKey});
  ConfigRegisters config(IndexedPorts(devio, port), {kEnterKey}, {kExitKey});
  return ReadBase(config, kRuntimeDevice);
}

}  // namespace

Smsc5407Chip::Smsc5407Chip() : Smsc5407Chip(AskForBase(BoardDevio())) {}

Smsc5407Chip::Smsc5407Chip(std::uint16_t base)
    : RegisterChip("smsc5407"),
      runtime(devio, base),
      monitor(IndexedPorts(devio, static_cast<std::uint16_t>(base + kMonitorIndex))) {
  if (!IsBase(base)) {
    return;
  }
  zones = {.zones = RegistersAt(0, {0x26, 0x25, 0x27})};
  led = {.saved = {kLedLine, kLed},
         .restored = {kLed, kLedLine},
         .green = Steps{FromSaved(kLedLine, 0xF7, 0x04), FromSaved(kLed, 0xFC, 0)}};
}

bool Smsc5407Chip::DeassertPowerLed() {
  savedLed.Restore(runtime, led.restored);
  return !led.saved.empty();
}

}  // namespace panelglow
