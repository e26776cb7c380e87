// Which jumpers, cables and other parts a machine has, by the lines that the files name for them.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "board/sets/ChipFinder.h"

namespace panelglow {

/// One device that the files name.
struct DEVICE_INFO {
  std::string name;
  bool present = false;  // the files have it; whether the machine has it is the status
  std::string chip;
  std::uint32_t gpio = 0;    // line
  std::uint32_t offset = 0;  // of the register with the bit, in place of a line
  std::string bit;
  std::string clearBit;  // pulsed before the bit is read
  bool reversedLogic = false;
  bool specialLine = false;                              // the line is given by a word
  bool useOffset = false;                                // offset and bit in place of a line
  std::string status = "ERROR: no detection performed";  // then "true", "false", "ERROR: device detection failed"
};

enum class DeviceKind : std::size_t {
  kJumpers,
  kFrontPanel,
  kSecurityDevices,
  kPowerSupply,
  kHeatsink,  // status "low", "high" or "liquid"
  kDashCable,
  kRiser,
  kCables,
  kPoweredDevices,
  kInternalSpeaker,  // status "unknown": no line tells
  kTouchScreen,      // as the speaker
};
inline constexpr std::size_t kDeviceKinds = 11;

/// A title for people, as "Jumpers".
const char* TitleOf(DeviceKind kind);

class DeviceDetection {
 public:
  explicit DeviceDetection(ChipFinder finder) : chipOf(std::move(finder)) {}

  /// Reads which devices of the kind the files name and looks for each, in place of what was found before. A device
  /// that cannot be read has a status that says so. True: no kind fails as a whole.
  bool Detect(DeviceKind kind);

  /// What the last Detect found; empty before it.
  [[nodiscard]] const std::vector<DEVICE_INFO>& List(DeviceKind kind) const {
    return lists[static_cast<std::size_t>(kind)];
  }

 private:
  bool IsNamed(DeviceKind kind, const std::string& prefix, DEVICE_INFO& device);
  static bool ReadPlace(const std::string& prefix, const char* offsetLabel, DEVICE_INFO& device);
  void Look(DeviceKind kind, const std::string& prefix, DEVICE_INFO& device);

  ChipFinder chipOf;
  std::array<std::vector<DEVICE_INFO>, kDeviceKinds> lists;
};

}  // namespace panelglow
