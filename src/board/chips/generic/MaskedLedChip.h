// What "g_iospace" and "g_memoryspace" share: LEDs that are bits of plain registers. A sequence entry's command is
// the register's address, its first data byte a mask. How a register is read, changed and waited for is the derived
// class's.
#pragma once

#include <array>
#include <cstdint>
#include <string>

#include "board/chips/generic/GChip.h"
#include "board/parts/Sequence.h"

namespace panelglow {

class MaskedLedChip : public GChip {
 public:
  bool AssertPowerLedGreen() override { return Set(list(kPowerGreenAssert)); }
  bool AssertPowerLedRed() override { return Set(list(kPowerRedAssert)); }
  bool DeassertPowerLed() override;

  /// The class cannot save the power LED: it lights it green, as a machine that runs shows it.
  bool RestorePowerLedState() override { return AssertPowerLedGreen(); }

  bool AssertChargeLedWhite() override { return Set(list(kChargeWhiteAssert)); }
  bool DeassertChargeLedWhite() override { return Keep(list(kChargeWhiteDeassert)); }
  bool AssertChargeLedRed() override { return Set(list(kChargeRedAssert)); }
  bool DeassertChargeLedRed() override { return Keep(list(kChargeRedDeassert)); }

  bool SaveHdLedState() override { return Save(list(kHdRedAssert), list(kHdRedDeassert), savedHdLed); }
  bool RestoreHdLedState() override { return Restore(list(kHdRedAssert), savedHdLed); }
  bool AssertHdLedRed() override { return Set(list(kHdRedAssert)); }
  bool DeassertHdLedRed() override { return Keep(list(kHdRedDeassert)); }

  bool SaveWirelessLedState() override {
    return Save(list(kWirelessAssert), list(kWirelessDeassert), savedWirelessLed);
  }
  bool RestoreWirelessLedState() override { return Restore(list(kWirelessAssert), savedWirelessLed); }
  bool AssertWirelessLed() override { return Flip(list(kWirelessAssert)); }
  bool DeassertWirelessLed() override { return Flip(list(kWirelessDeassert)); }

 protected:
  /// `addressBits`: how wide the addresses of the registers are.
  MaskedLedChip(const std::string& chipName, unsigned addressBits);

  // One entry of a sequence, on the hardware.
  virtual void SetEntry(std::uint32_t address, std::uint8_t mask) = 0;
  virtual void KeepEntry(std::uint32_t address, std::uint8_t mask) = 0;
  virtual void FlipEntry(std::uint32_t address, std::uint8_t mask) = 0;
  virtual std::uint8_t ReadRegisterByte(std::uint32_t address) = 0;
  virtual void WriteRegisterByte(std::uint32_t address, std::uint8_t value) = 0;

 private:
  enum List : std::size_t {
    kPowerGreenAssert,
    kPowerGreenDeassert,
    kPowerRedAssert,
    kPowerRedDeassert,
    kChargeWhiteAssert,
    kChargeWhiteDeassert,
    kChargeRedAssert,
    kChargeRedDeassert,
    kHdRedAssert,
    kHdRedDeassert,
    kWirelessAssert,
    kWirelessDeassert,
    kListCount
  };

  [[nodiscard]] const Sequence& list(List which) const { return lists[which]; }
  bool Set(const Sequence& sequence);
  bool Keep(const Sequence& sequence);
  bool Flip(const Sequence& sequence);
  bool Save(const Sequence& support, const Sequence& addresses, Sequence& saved);
  bool Restore(const Sequence& support, const Sequence& saved);

  std::array<Sequence, kListCount> lists;
  Sequence savedHdLed;  // address and value; a second save appends
  Sequence savedWirelessLed;
};

}  // namespace panelglow
