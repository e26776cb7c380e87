// A hardware monitor behind the SMBus: four fans and three zones. Serves the chip name "adt".
#pragma once

#include <cstdint>
#include <string>

#include "board/chips/RegisterChip.h"
#include "board/parts/RegistersOf.h"
#include "board/parts/SmbusHost.h"

namespace panelglow {

class AdtChip : public RegisterChip {
 public:
  AdtChip();

  // False, and a count of 0xFFFF, where the device does not answer. Nothing is then saved, what was taken over is put
  // back, and the first write that fails is the last of its operation. After a restore that fails both can be done
  // again, it and the take-over.
  std::uint32_t ReadFanTach(int fan, int arg) override;
  bool SaveFanState() override;
  bool RestoreFanState() override;
  bool SetManualFanMode(bool on) override;
  bool ReadTemperature(int zone, int& value) override;

  /// A fan without a duty register is logged.
  bool SetFanPwm(int fan, int value) override;

 protected:
  /// For a derived class, which then reads its own keys and extends the tables. The keys of this class are read
  /// first.
  explicit AdtChip(std::string chipName);

  /// The host's base and the device's address, with their defaults.
  void ReadKeys(const std::string& prefix, std::uint16_t hostBase, std::uint8_t deviceAddress);

  RegisterFile& Monitor() override { return monitor; }
  RegisterFile& LedRegisters() override { return monitor; }

  std::uint8_t ReadMonitor(std::uint8_t reg);
  void WriteMonitor(std::uint8_t reg, std::uint8_t value);

  bool hasFailed = false;  // a transaction, since this was last cleared

 private:
  bool isHalfBack = false;  // the fans, by a restore that failed
  SmbusHost host;
  std::uint8_t address = 0;
  RegistersOf<AdtChip> monitor;
};

}  // namespace panelglow
