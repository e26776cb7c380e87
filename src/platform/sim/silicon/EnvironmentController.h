// The environment controller of a Super-I/O: fans, temperatures and the case switch behind an index and a data port.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <optional>
#include <string>

#include "platform/sim/base/Scheduler.h"

namespace panelglow::platform::sim {

/// The latch of the case switch: a status bit that stays set until software clears it, and comes back at the next
/// round of measurements while the case is open.
struct IntrusionSetup {
  std::uint8_t statusRegister = 0;
  std::uint8_t statusBit = 0;
  std::uint8_t clearRegister = 0;  // writing 1 to the bit clears the latch; the bit itself reads 0 again
  std::uint8_t clearBit = 0;
  bool wasOpened = false;
  bool isOpen = false;
};

struct EnvironmentSetup {
  std::uint8_t device = 4;       // logical device whose base address it answers at
  std::uint8_t indexOffset = 5;  // from that base
  std::uint8_t dataOffset = 6;
  std::map<std::uint8_t, std::uint8_t> settings;  // duties, limits: read and write
  std::map<std::uint8_t, std::uint8_t> sensors;   // tachs, temperatures: what is written is lost
  std::optional<IntrusionSetup> intrusion;
};

class EnvironmentController {
 public:
  EnvironmentController(const EnvironmentSetup& setup, const Scheduler& time);

  void Select(std::uint8_t index) { index_ = index; }
  [[nodiscard]] std::uint8_t Selected() const { return index_; }
  [[nodiscard]] std::uint8_t Read() const;
  void Write(std::uint8_t value);

  /// The settings; readings and the index are nothing that a run has to put back.
  [[nodiscard]] std::string State() const;

 private:
  EnvironmentSetup setup_;
  const Scheduler& time_;
  std::array<std::uint8_t, 256> registers_{};
  std::uint8_t index_ = 0;
  std::optional<Microseconds> latchedFrom_;  // the case switch's status bit is set from then on
};

}  // namespace panelglow::platform::sim
