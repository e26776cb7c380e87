// Fans that follow their duty, and temperatures that follow the fans, as a hardware monitor measures them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <vector>

#include "platform/sim/base/Scheduler.h"

namespace panelglow::platform::sim {

struct FanSetup {
  bool isPlugged = true;
  std::uint8_t tachHigh = 0;  // registers of the count, read only
  std::uint8_t tachLow = 0;
  std::uint32_t clock = 1'500'000;   // counts per minute
  std::uint16_t stopped = 0x0FFF;    // the count of a fan that stands, and the largest
  std::optional<std::uint8_t> duty;  // register, 0 to 255; none: it always runs at full speed
  std::uint8_t stall = 30;           // duty from which on it turns
  std::uint32_t full_rpm = 3000;
  std::uint32_t ramp_rpm = 1000;     // by which its speed changes in a second
  std::optional<std::uint8_t> mode;  // register; while not all bits of the mask are set the part chooses the duty
  std::uint8_t manual = 0xFF;        // that mask
  std::uint8_t automatic = 100;      // that duty
};

struct SensorSetup {
  std::uint8_t address = 0;       // register, degrees, read only
  std::uint8_t still = 60;        // degrees beside a fan that stands
  std::uint8_t cooled = 35;       // ... that runs at full speed
  std::size_t fan = 0;            // place in the list of fans
  std::uint32_t ramp_mdeg = 500;  // thousandths of a degree by which it changes in a second
};

struct CoolingSetup {
  std::vector<FanSetup> fans;
  std::vector<SensorSetup> sensors;
};

/// Moves in steps of 100 ms, whoever looks at it, so that what it shows depends on the time and the registers alone.
/// At the start everything has settled.
class CoolingModel {
 public:
  using Registers = std::function<std::uint8_t(std::uint8_t address)>;

  CoolingModel(CoolingSetup setup, const Registers& registers);

  /// To this time, with the registers as they have been since the last call.
  void Advance(Microseconds now, const Registers& registers);

  /// What it measures in a register; nothing for one that is not its own.
  [[nodiscard]] std::optional<std::uint8_t> Read(std::uint8_t address) const;

 private:
  [[nodiscard]] static std::int64_t Target(const FanSetup& fan, const Registers& registers);
  [[nodiscard]] std::int64_t Target(const SensorSetup& sensor) const;
  [[nodiscard]] std::uint32_t Count(std::size_t fan) const;

  CoolingSetup setup_;
  std::vector<std::int64_t> speeds_;   // rpm, by fan
  std::vector<std::int64_t> degrees_;  // thousandths, by sensor
  Microseconds steps_ = 0;             // done so far
};

}  // namespace panelglow::platform::sim
