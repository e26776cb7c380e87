#include "board/chips/sio/Vt1211Chip.h"

#include "board/parts/ProbeConfigPort.h"
#include "board/parts/ReadBase.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kEnterKey = 0x87;  // twice
constexpr std::uint8_t kExitKey = 0xAA;

// Logical devices with a base.
constexpr std::uint8_t kGpioDevice = 8;
constexpr std::uint8_t kPowerDevice = 10;
constexpr std::uint8_t kMonitorDevice = 11;

constexpr RegisterId kPowerActivate{kPowerDevice, 0x30};
constexpr std::uint8_t kActive = 0x01;
constexpr std::uint8_t kLedControl = 0x1C;  // from the base of the power management

}  // namespace

Vt1211Chip::Vt1211Chip()
    : RegisterChip("vt1211"),
      ledRegisters(ConfigRegisters(IndexedPorts(devio, ProbeConfigPort(devio, {kEnterKey, kEnterKey}, {kExitKey})),
                                   {kEnterKey, kEnterKey}, {kExitKey})),
      power(devio, 0),
      monitor(devio, 0) {
  // The GPIO lines have a base, too, which is asked for although nothing here reads them.
  ReadBase(ledRegisters, kGpioDevice);
  const std::uint16_t powerBase = ReadBase(ledRegisters, kPowerDevice);
  const std::uint16_t monitorBase = ReadBase(ledRegisters, kMonitorDevice);
  if (IsBase(monitorBase)) {
    monitor = PortRegisters(devio, monitorBase);
    zones = {.zones = RegistersAt(0, {0x1F, 0x21, 0x20})};
  }
  if (!IsBase(powerBase)) {
    return;
  }
  power = PortRegisters(devio, powerBase);
  ledRegisters.ports = &power;
  // The ports are there while their device is active: the first to be changed is the last to be put back.
  constexpr RegisterId kLed{LedFile::kPorts, kLedControl};
  led = {.saved = {kPowerActivate, kLed},
         .prepared = {FromSaved(kPowerActivate, 0xFF, kActive), FromSaved(kLed, 0xFA, 0x02)},
         .restored = {kLed, kPowerActivate},
         .green = Steps{},
         .off = Steps{}};
}

std::uint8_t Vt1211Chip::LedFile::Read(RegisterId id) {
  return id.place == kPorts ? ports->Read(id) : ConfigRegisters::Read(id);
}

void Vt1211Chip::LedFile::Write(RegisterId id, std::uint8_t value) {
  if (id.place == kPorts) {
    ports->Write(id, value);
  } else {
    ConfigRegisters::Write(id, value);
  }
}

}  // namespace panelglow
