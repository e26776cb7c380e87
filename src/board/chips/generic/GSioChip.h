// A Super-I/O whose ports, registers and sequences all stand in the chip file: fans, temperatures and GPIO lines
// behind an index and a data port. Serves the chip name "g_sio"; the base of the other generic Super-I/O classes.
#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "board/chips/generic/GChip.h"
#include "board/parts/IndexedPorts.h"
#include "board/parts/RegistersOf.h"
#include "board/parts/Step.h"

namespace panelglow {

class GSioChip : public GChip {
 public:
  GSioChip() : GSioChip("g_sio") {}

  /// Reads the chip's keys, and the base addresses from the chip where the file does not give them. Throws
  /// mblib_exception when they cannot be had.
  void Initialize() override;

  bool SaveFanState() override;
  bool RestoreFanState() override;
  std::uint32_t ReadFanTach(int fan, int arg) override;
  int TachToRpm(std::uint32_t raw, int multiplier) override;
  bool SetFanPwm(int fan, int value) override;
  bool ReadTemperature(int zone, int& value) override;
  bool ReadLowLimitTemperature(int zone, int& value) override;
  int MapTemperature(int raw) override;
  int ReadLine(int line) override;

  bool IsPowerLedRedSupported(bool& supported) override;
  bool SavePowerLedState() override;
  bool RestorePowerLedState() override;

  // ---- the part's protocol
  virtual void EnterConfigMode();
  virtual void ExitConfigMode();
  virtual void SelectLogicalDevice(std::uint8_t ldn);
  virtual std::uint8_t ReadConfigRegister(std::uint8_t reg);
  virtual void WriteConfigRegister(std::uint8_t reg, std::uint8_t value);

  /// Registers of the hardware monitor ("environment controller").
  virtual std::uint8_t ReadEnvRegister(std::uint8_t reg);
  virtual void WriteEnvRegister(std::uint8_t reg, std::uint8_t value);

 protected:
  explicit GSioChip(std::string chipName)
      : GChip(std::move(chipName)),
        config(*this, &GSioChip::ReadConfigRegister, &GSioChip::WriteConfigRegister),
        environment(*this, &GSioChip::ReadEnvRegister, &GSioChip::WriteEnvRegister) {}

  /// Register and value, in the order of the writes.
  using PairList = std::vector<std::pair<std::uint8_t, std::uint8_t>>;

  /// Writes configuration registers of the power LED's logical device in order; false for an empty list.
  bool RunBlinkList(const PairList& list);

  /// The writes of a list as steps on registers of one place.
  static Steps StepsOf(const PairList& list);

  /// The save is over: the fans get their time to follow.
  void EndFanRestore();

  /// The start of the text for saved fan registers that do not fit their list.
  [[nodiscard]] virtual std::string FanIntegrityText() const;
  void CheckFanIntegrity() const;

  /// Without them in the files nothing is to be touched: port 0 is another part's.
  [[nodiscard]] bool HasConfigPorts() const { return indexPort != 0 && dataPort != 0; }
  [[nodiscard]] IndexedPorts ConfigPorts() const { return {devio, indexPort, dataPort}; }

  RegistersOf<GSioChip> config;       // of the selected logical device
  RegistersOf<GSioChip> environment;  // the hardware monitor

  std::uint8_t indexPort = 0;
  std::uint8_t dataPort = 0;
  std::vector<std::uint8_t> enterSequence;
  std::vector<std::uint8_t> exitSequence;
  std::uint16_t hwmBar = 0;      // base of the hardware monitor's ports
  std::uint8_t envIndexReg = 0;  // offsets from hwmBar
  std::uint8_t envDataReg = 0;
  std::uint8_t gpioLdn = 7;
  std::uint16_t gpioBar = 0;  // base of the GPIO ports

 private:
  struct BarKeys;
  std::uint16_t FindBar(const BarKeys& keys);
  [[nodiscard]] IndexedPorts EnvPorts() const;
};

}  // namespace panelglow
