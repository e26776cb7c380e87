// A network controller whose output pin can be driven, to see what is wired to it.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>

#include "hw/CDevio.h"

namespace panelglow {

/// Is told what a DashController does, for a log.
class DashWatcher {
 public:
  virtual ~DashWatcher() = default;

  /// `bytes`: how many of the pin control dword the driver gave.
  virtual void Read(std::uint64_t /*address*/, std::uint32_t /*value*/, std::uint32_t /*bytes*/) {}
  virtual void Write(std::uint64_t /*address*/, std::uint32_t /*value*/) {}

  /// Whether the line was seen to follow the pin to a level.
  virtual void See(bool /*isHigh*/, bool /*follows*/) {}
};

class DashController {
 public:
  /// The controller of these ids: vendor, device, subsystem vendor, subsystem device as numbers, separated by blanks.
  /// Nothing when there is none, when it has no memory, or when the text is not four numbers of 16 bits.
  static std::optional<DashController> Find(CDevio& client, const std::string& idList);

  /// The controller at a PCI location; nothing when it has no memory.
  static std::optional<DashController> At(CDevio& client, std::uint16_t location);

  /// The network controllers' class, for who looks for one.
  static constexpr std::uint32_t kNetworkClass = 0x20000;

  /// First address of its memory.
  [[nodiscard]] std::uint64_t Base() const { return base; }

  /// Drives the pin low and then high, and looks 10 ms behind each whether the line follows: true when it does both
  /// times. Nothing when the controller's memory cannot be reached or the line not be read. The pin ends high,
  /// whatever was seen, once it could be driven at all.
  [[nodiscard]] std::optional<bool> LineFollows(const std::function<int()>& readLine, DashWatcher& watcher) const;

 private:
  class LowPin;

  DashController(CDevio& client, std::uint64_t address) : devio(&client), base(address) {}

  // False when the driver cannot reach the controller's memory.
  [[nodiscard]] bool SetOutput(bool high, DashWatcher& watcher) const;
  [[nodiscard]] bool Change(std::uint32_t clear, std::uint32_t set, DashWatcher& watcher) const;

  CDevio* devio;
  std::uint64_t base;
};

}  // namespace panelglow
