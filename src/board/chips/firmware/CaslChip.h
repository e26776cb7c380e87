// The firmware's call interface as a chip: the wireless LED, fans and temperatures. Serves the chip name "casl".
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "board/chips/Chip.h"

namespace panelglow {

/// Every operation calls into the firmware; what a call throws passes through (InvalidTmbWMIException,
/// InvalidTmbWMICallException).
class CaslChip : public Chip {
 public:
  CaslChip() : Chip("casl") {}

  /// Reads the chip's keys and the head of the wireless record. Done by itself before the first wireless operation,
  /// so that a board can be built without a call into the firmware.
  void Initialize() override;

  bool ReadFanRpm(int fan, int& rpm, int multiplier) override;
  bool SetFanFullSpeed(int fan) override;
  bool SetFanPwmPercent(int fan, int percent) override;
  bool SetFanPwm(int fan, int value) override;
  bool ReadVirtualTemperature(int zone, bool flag, int& value) override;

  bool SaveWirelessLedState() override;
  /// Does nothing until there is a save.
  bool RestoreWirelessLedState() override { return !wirelessOn || SetWirelessPower(*wirelessOn); }
  bool AssertWirelessLed() override { return SetWirelessPower(true); }
  bool DeassertWirelessLed() override { return SetWirelessPower(false); }

  /// Here: switches the radio when it is not as wanted (`mask` 1: on, 0: off); `value` says whether that was needed.
  bool ReadLatchedPort(std::uint16_t port, std::uint32_t mask, bool& value) override;

  virtual bool SetWirelessPower(bool on);
  virtual void ReadWirelessHeader();

 private:
  void SetUpOnce();
  [[nodiscard]] std::vector<std::uint8_t> ReadWirelessRecord() const;

  std::vector<std::uint32_t> devices;  // indexes into the wireless state record
  bool isSetUp = false;
  std::optional<bool> wirelessOn;  // as saved
  std::uint8_t writeCommand = 2;
  std::uint8_t readCommand = 1;
  std::uint8_t methodType = 27;
  std::uint8_t assertValue = 1;
  std::uint8_t deassertValue = 0;
  std::uint8_t powerControl = 255;
  std::uint8_t firstByte = 0;  // of the wireless record, sent back with each change
  std::uint8_t secondByte = 0;
};

}  // namespace panelglow
