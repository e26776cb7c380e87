#include "ledtests/LegacyPanelPorts.h"

namespace panelglow {

namespace {

constexpr std::uint16_t ICH_GPIO_DATA_REG = 0xFA0E;
constexpr std::uint8_t HD_ASSERT_MASK = 0x80;
constexpr std::uint8_t HD_DEASSERT_MASK = 0x7F;

constexpr std::uint8_t kNativeMode = 0x04;  // of both LED configuration registers
constexpr std::uint8_t kRedPower = 0x01;    // of the GP3 data register
constexpr std::uint8_t kGreenPower = 0x02;
constexpr std::uint8_t kNotPower = 0xFC;
constexpr std::uint8_t kKeepAll = 0xFF;

std::uint16_t BaseOf(std::uint16_t systemId) {
  return systemId == 0x0AC8 || systemId == 0x3029 || systemId == 0x3047 ? 0x800 : 0x400;
}

std::uint16_t PortAt(std::uint16_t systemId, std::uint16_t offset) {
  return static_cast<std::uint16_t>(BaseOf(systemId) + offset);
}

}  // namespace

void LegacyPanelPorts::SelectModel(std::uint16_t systemId) {
  SMC_GREEN_LED_CFG_REG = PortAt(systemId, 0x33);
  SMC_RED_LED_CFG_REG = PortAt(systemId, 0x34);
  SMC_GP3_DATA_REG = PortAt(systemId, 0x4D);
}

void LegacyPanelPorts::Change(std::uint16_t port, std::uint8_t keep, std::uint8_t set) {
  devio_.OutportByte(port, static_cast<std::uint8_t>((devio_.InportByte(port) & keep) | set));
}

void LegacyPanelPorts::CustomSetGreenPwrLedGpioMode() {
  Change(SMC_GREEN_LED_CFG_REG, static_cast<std::uint8_t>(~kNativeMode), 0);
}
void LegacyPanelPorts::CustomSetRedPwrLedGpioMode() {
  Change(SMC_RED_LED_CFG_REG, static_cast<std::uint8_t>(~kNativeMode), 0);
}
void LegacyPanelPorts::CustomSetGreenPwrLedNativeMode() { Change(SMC_GREEN_LED_CFG_REG, kKeepAll, kNativeMode); }
void LegacyPanelPorts::CustomSetRedPwrLedNativeMode() { Change(SMC_RED_LED_CFG_REG, kKeepAll, kNativeMode); }

void LegacyPanelPorts::CustomAssertRedPwrLed() { Change(SMC_GP3_DATA_REG, kNotPower, kRedPower); }
void LegacyPanelPorts::CustomAssertGreenPwrLed() { Change(SMC_GP3_DATA_REG, kNotPower, kGreenPower); }
void LegacyPanelPorts::CustomDeassertPwrLeds() { Change(SMC_GP3_DATA_REG, kNotPower, 0); }

void LegacyPanelPorts::CustomAssertRedHdLed() { Change(ICH_GPIO_DATA_REG, kKeepAll, HD_ASSERT_MASK); }
void LegacyPanelPorts::CustomAssertGreenHdLed() { Change(ICH_GPIO_DATA_REG, kKeepAll, HD_ASSERT_MASK); }
void LegacyPanelPorts::CustomDeassertHdLed() { Change(ICH_GPIO_DATA_REG, HD_DEASSERT_MASK, 0); }

}  // namespace panelglow
