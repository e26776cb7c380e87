// The power and drive LEDs of machines whose board the INI files do not know: fixed registers of the Super-I/O and
// the chipset, one read-modify-write per operation. Nothing guards them against other threads.
#pragma once

#include <cstdint>

#include "hw/CDevio.h"

namespace panelglow {

class LegacyPanelPorts {
 public:
  /// The registers of a model that is not known.
  explicit LegacyPanelPorts(CDevio& devio) : devio_(devio) { SelectModel(0); }

  /// The register block stands at 0x800 on three models, at 0x400 on all others.
  void SelectModel(std::uint16_t systemId);

  // In GPIO mode software drives the LED, in native mode the Super-I/O.
  void CustomSetGreenPwrLedGpioMode();
  void CustomSetRedPwrLedGpioMode();
  void CustomSetGreenPwrLedNativeMode();
  void CustomSetRedPwrLedNativeMode();

  // At most one of the two power LEDs is on.
  void CustomAssertRedPwrLed();
  void CustomAssertGreenPwrLed();
  void CustomDeassertPwrLeds();

  // One bit drives both colours of the drive LED.
  void CustomAssertRedHdLed();
  void CustomAssertGreenHdLed();
  void CustomDeassertHdLed();

 private:
  void Change(std::uint16_t port, std::uint8_t keep, std::uint8_t set);

  CDevio& devio_;
  std::uint16_t SMC_GREEN_LED_CFG_REG = 0;
  std::uint16_t SMC_RED_LED_CFG_REG = 0;
  std::uint16_t SMC_GP3_DATA_REG = 0;
};

}  // namespace panelglow
