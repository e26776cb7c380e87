// What the three oldest board classes share: a driver client of their own, LED and button code in the board itself,
// and fans, zones and devices from the flat keys of the detection file.
#pragma once

#include <cstdint>
#include <string>

#include "board/LegacyMonitor.h"
#include "board/MotherBoard.h"
#include "board/parts/IndexedPorts.h"
#include "hw/CDevio.h"

namespace panelglow {

/// Fans and zones without a chip of their own are the hardware monitor's.
class OldestBoard : public MotherBoard {
 public:
  bool IsPowerLedRedSupported(bool& supported) override;

  /// Done by the constructor; reads the fans and zones anew. The monitor's ports stay the ones that were read first.
  bool LoadLegacySettings() override;
  bool LoadFans() override;
  bool LoadZones() override;

  bool DetectLegacyDevice(LegacyDevice device, bool& present) override;
  bool DetectLegacyFan(int index, bool& present) override;
  bool ReadFan(int index, int& rpm) override;
  bool SaveLegacyFanState() override;

  /// Gives the fans back to the monitor.
  bool RestoreLegacyFanState() override;
  bool SetLegacyFanFull(int index) override;
  bool SetLegacyFanPwm(int index) override;

  // ---- a check of a zone in its parts: the reading, and what the last one is by the limits
  virtual bool ReadLegacyZone(int zone, int& value);
  virtual bool IsLegacyZoneHigh(int zone, bool& high);
  virtual bool IsLegacyZoneLow(int zone, bool& low);

 protected:
  /// What is fixed for a class. The data port stands behind the index port.
  struct Traits {
    std::uint16_t indexPort;  // of the Super-I/O
    bool fanLatched;          // ... whose fans' counters are latched; also: the power LED has a red part
    std::int64_t fanDivisor;  // counts of a tachometer per minute
    FanTable fans;
  };

  OldestBoard(std::string boardClass, std::uint16_t boardId, const Traits& fixed);

  Chip& ChipFor(const std::string& chipName) override;

  /// The word of GPIO levels, which all three have in one place, at a line's bit; kNoSuchLineState for a line that it
  /// does not have.
  [[nodiscard]] int ReadGpioLine(int line);

  /// Prints that a line cannot be read.
  static void TellOfLine();

  [[nodiscard]] const LegacySettings& Settings() const { return settings; }

  CDevio devio;
  Traits traits;
  IndexedPorts superIo;

 private:
  LegacySettings settings;
  LegacyMonitor monitor;
};

}  // namespace panelglow
