// A network adapter whose lamp is lit while its link is up.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

struct AdapterSetup {
  enum class Fault { kNone, kStaysDown, kStaysUp, kNoProperties };

  std::string name;
  std::string deviceName;  // as the connection manager tells it
  bool isUp = true;        // at the start
  Microseconds disconnect_us = 0;
  Microseconds connect_us = 0;
  Fault fault = Fault::kNone;
};

/// The connection manager carries out one order after the other, whether or not its caller still waits.
class AdapterDevice : public Device {
 public:
  AdapterDevice(AdapterSetup setup, const Scheduler& time)
      : setup_(std::move(setup)), time_(time), wasUp_(setup_.isUp) {}

  [[nodiscard]] const AdapterSetup& Setup() const { return setup_; }

  /// Orders the link up or down; returns when it will be carried out.
  Microseconds Order(bool up);

  /// Pin "link".
  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<Microseconds> NextEvent() const override;
  [[nodiscard]] std::optional<Microseconds> UnderWayUntil() const override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  [[nodiscard]] std::string State() const override;

 private:
  struct Change {
    Microseconds at = 0;
    bool up = false;
  };

  [[nodiscard]] bool IsUp() const;

  AdapterSetup setup_;
  const Scheduler& time_;
  bool wasUp_;                   // ahead of the changes
  std::vector<Change> changes_;  // in order of time; those that have come are dropped at the next order
};

}  // namespace panelglow::platform::sim
