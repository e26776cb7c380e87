// A piece of simulated silicon on the machine's buses.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/sim/base/Scheduler.h"

namespace panelglow::platform::sim {

/// A range of addresses on one of the buses.
struct AddressRange {
  std::uint64_t first = 0;
  std::uint64_t size = 0;

  [[nodiscard]] bool Contains(std::uint64_t address) const { return address >= first && address - first < size; }
};

/// Accesses come byte by byte in bus order (a word access is two bytes at rising addresses).
class Device {
 public:
  virtual ~Device() = default;

  [[nodiscard]] virtual std::vector<AddressRange> PortRanges() const { return {}; }
  [[nodiscard]] virtual std::vector<AddressRange> MemoryRanges() const { return {}; }

  virtual std::uint8_t ReadPort(std::uint16_t /*port*/) { return 0xFF; }
  virtual void WritePort(std::uint16_t /*port*/, std::uint8_t /*value*/) {}
  virtual std::uint8_t ReadMemory(std::uint64_t /*address*/) { return 0xFF; }
  virtual void WriteMemory(std::uint64_t /*address*/, std::uint8_t /*value*/) {}

  /// Level of one of the device's output pins, by its name in the machine's file; nothing when it has no such pin.
  [[nodiscard]] virtual std::optional<bool> Signal(std::string_view pin) const = 0;

  /// When the device next does something by itself that can move a pin (its firmware takes a byte, a lamp blinks);
  /// nothing for a device that only answers accesses.
  [[nodiscard]] virtual std::optional<Microseconds> NextEvent() const { return {}; }

  /// When what the device has under way (a step of its firmware, a command on its link) comes to its end; nothing
  /// when nothing is, or when it never will. A lamp that blinks is not under way: it is a state.
  [[nodiscard]] virtual std::optional<Microseconds> UnderWayUntil() const { return {}; }

  /// Lets the device do what it has had to do by now. It is called when NextEvent() has come, not before each access.
  virtual void Advance() {}

  /// The address (port or memory) whose writes move a pin, for the fault "a write that lies".
  [[nodiscard]] virtual std::optional<std::uint64_t> RegisterOf(std::string_view /*pin*/) const { return {}; }

  /// All register contents as text, one per line: what a run must leave as it found it. Of a device that has
  /// something under way it tells only what it has done so far.
  [[nodiscard]] virtual std::string State() const = 0;
};

}  // namespace panelglow::platform::sim
