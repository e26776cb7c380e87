#include "board/chips/ite/Ite8721Chip.h"

#include "board/base/IniReader.h"
#include "board/parts/LevelPorts.h"

namespace panelglow {

namespace {

// The hood's latch, in a monitor at fixed ports whatever the files say of the fans' one.
constexpr std::uint16_t kHoodMonitor = 0xA15;
constexpr RegisterId kConfiguration{0, 0x00};
constexpr std::uint8_t kClearIntrusion = 0x20;
constexpr RegisterId kInterruptStatus1{0, 0x01};
constexpr std::uint8_t kIntrusion = 0x10;

}  // namespace

Ite8721Chip::Ite8721Chip() : Ite8758Chip("ite_8721"), gpiobar(ReadIniWord("chip.ite_8721.gpiobar", 0xA20)) {
  ReadBases("chip.ite_8721.");
  // Global registers of GPIO set 3: pins that are lines, their polarity, lines that no function drives.
  constexpr RegisterId kGpioSet3{kLedDevice, 0x27};
  constexpr RegisterId kPolarity3{kLedDevice, 0xB2};
  constexpr RegisterId kSimpleIo3{kLedDevice, 0xC2};
  led.saved = {kLed1Map, kLed1Control, kGpioSet3, kPolarity3, kSimpleIo3, kLed2Map, kLed2Control};
  led.blinkGreen = Steps{Put(kGpioSet3, 0x30), Put(kPolarity3, 0), Put(kSimpleIo3, 0), Put(kLed1Map, primary),
                         Put(kLed1Control, kOneHertz)};
  led.blinkRed =
      Steps{Put(kGpioSet3, 0x30),    Put(kPolarity3, 0),       Put(kSimpleIo3, 0),          Put(kLed1Map, primary),
            Put(kLed1Control, 0x03), Put(kLed2Map, secondary), Put(kLed2Control, kOneHertz)};
  Identify();
}

int Ite8721Chip::ReadLine(int line) { return ReadLevelLine(devio, gpiobar, line); }

bool Ite8721Chip::ReadIntrusionLatch(int /*line*/, bool /*clearFirst*/, bool& value) {
  IndexedRegisters hood(IndexedPorts(devio, kHoodMonitor));
  Run(Steps{SetBits(kConfiguration, kClearIntrusion)}, hood);
  value = (hood.Read(kInterruptStatus1) & kIntrusion) != 0;
  return true;
}

}  // namespace panelglow
