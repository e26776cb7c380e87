// The front panel: what a person sees. LED states come from the simulated hardware alone, and from what is broken in
// the panel itself; every change is kept on a time line.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/sim/base/Scheduler.h"
#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

/// What can be wrong with one LED of the panel, or with the register behind it.
enum class LedFault { kNone, kDead, kStuck, kWrongColor, kSwapped, kShorted, kInverted, kLyingWrite, kAbsentChip };

struct Led {
  std::string name;    // unique, as "power-green"
  std::string symbol;  // what is printed beside it, as "power"
  std::string color;   // what it glows in
  std::string device;  // whose pin drives it
  std::string pin;
  bool activeLow = false;

  LedFault fault = LedFault::kNone;
  std::string partner;  // of a swapped or shorted LED
};

struct LedChange {
  Microseconds time = 0;
  std::size_t led = 0;  // index into Leds()
  bool lit = false;
};

class FrontPanel {
 public:
  /// Resolves a device's pin level.
  using PinReader = std::function<std::optional<bool>(const std::string& device, const std::string& pin)>;

  FrontPanel(std::vector<Led> leds, PinReader reader);

  /// Applies a fault. False when there is no LED of that name, or no partner where one is needed.
  bool Break(std::string_view led, LedFault fault, std::string_view partner);

  /// Looks at all pins again; to be called after everything that may have moved one.
  void Update(Microseconds now);

  [[nodiscard]] const std::vector<Led>& Leds() const { return leds_; }
  [[nodiscard]] bool IsLit(std::size_t led) const { return lit_[led]; }
  [[nodiscard]] bool IsLit(std::string_view name) const;
  [[nodiscard]] std::optional<std::size_t> Find(std::string_view name) const;
  [[nodiscard]] const std::vector<LedChange>& TimeLine() const { return timeLine_; }

 private:
  [[nodiscard]] bool Level(const Led& led) const;
  [[nodiscard]] bool Appearance(const Led& led) const;

  std::vector<Led> leds_;
  PinReader reader_;
  std::vector<bool> lit_;
  std::vector<LedChange> timeLine_;
};

/// The fault of a name such as "wrong-color"; nothing when there is none of that name.
std::optional<LedFault> LedFaultByName(std::string_view name);

/// All names of faults, separated by ", ".
std::string LedFaultNames();

/// What each fault does, a line each.
std::string LedFaultHelp();

}  // namespace panelglow::platform::sim
