// The settings of the oldest boards: flat keys of the detection file, in the section of this very machine alone.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "board/sets/Fan.h"
#include "board/sets/TempZone.h"
#include "board/sets/ZoneSet.h"

namespace panelglow {

/// What the oldest boards can look for, a line each.
enum class LegacyDevice : std::size_t {
  kBootBlockJumper,
  kBootBlockRecoveryJumper,
  kFlashOverrideJumper,
  kPciRiser,
  kCoil,
  kHoodSwitchCable,
  kPasswordJumper,
  kUsbFrontPanel,
  k1394FrontPanel,
  kAudioCable,
  kPowerSupplyUnit,
  kNicDashCable,
};
inline constexpr std::size_t kLegacyDevices = 12;

/// A title for people, as "Boot block jumper".
const char* TitleOf(LegacyDevice device);

struct LegacySettings {
  static constexpr int kNoLine = -1;

  /// Reads the flat keys. Fans and zones count from 1, up to the number that the files give or the first without a
  /// name.
  static LegacySettings Load();

  std::uint16_t powerIoBase = 0;       // of the power management block; 0: not known
  std::uint16_t monitorIndexPort = 0;  // of the hardware monitor; 0: not known
  std::uint16_t monitorDataPort = 0;
  std::uint32_t stabilizationWait_ms = 5000;
  std::vector<Fan> fans;
  std::array<int, kLegacyDevices> lines{};  // by LegacyDevice; kNoLine: not to be looked for
  ProbeSettings probe;
  std::vector<TempZone> zones;
};

}  // namespace panelglow
