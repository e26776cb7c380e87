// Byte registers in I/O ports, as a southbridge's GPIO and power-management blocks.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "platform/sim/base/Scheduler.h"
#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

/// 32 GPIO lines: one bit each in registers of four bytes.
struct PortLines {
  std::uint16_t level = 0;                 // offsets, as the following
  std::optional<std::uint16_t> select;     // bit clear: the line serves another function
  std::optional<std::uint16_t> direction;  // bit set: an input
  std::uint32_t outside = 0;               // levels of lines that are no outputs
};

/// Someone presses a button for a while.
struct PortPress {
  std::uint16_t offset = 0;
  std::uint8_t mask = 0;
  Microseconds from_us = 0;
  Microseconds until_us = 0;
  bool isLow = false;  // the bits are clear meanwhile
};

/// A bolt that a motor moves: a set bit of the command moves it, and is cleared when it has.
struct PortBolt {
  std::uint16_t command = 0;  // offset
  std::uint8_t lock = 0x01;   // masks
  std::uint8_t unlock = 0x02;
  std::uint16_t level = 0;    // offset of the bit that shows it
  std::uint8_t unlocked = 0;  // mask, set while it is open
  Microseconds move_us = 8000;
};

struct PortRegistersSetup {
  std::uint16_t base = 0;
  std::map<std::uint16_t, std::uint8_t> registers;   // by offset
  std::map<std::uint16_t, std::uint8_t> clearByOne;  // masks: bits of events, which a written 1 clears and 0 leaves
  std::map<std::uint16_t, std::uint8_t> readOnly;    // masks
  std::map<std::uint16_t, std::uint8_t> lasting;     // masks: events whose cause lasts, set again soon when cleared
  std::vector<PortLines> lines;
  std::vector<PortPress> presses;
  std::vector<PortBolt> bolts;
};

/// Only the ports of registers that are told answer. A level register drives the lines that are outputs and reads the
/// pins of the others, whose bits take nothing.
class PortRegisters : public Device {
 public:
  PortRegisters(PortRegistersSetup setup, const Scheduler& time)
      : setup_(std::move(setup)), time_(time), moving_(setup_.bolts.size()) {}

  [[nodiscard]] std::vector<AddressRange> PortRanges() const override;
  std::uint8_t ReadPort(std::uint16_t port) override;
  void WritePort(std::uint16_t port, std::uint8_t value) override;

  /// Pins "<offset>.<bit>" as the register reads, the offset in hexadecimal.
  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  [[nodiscard]] std::optional<Microseconds> NextEvent() const override { return UnderWayUntil(); }
  [[nodiscard]] std::optional<Microseconds> UnderWayUntil() const override;
  void Advance() override;

  /// Without the events that come back and the buttons that are pressed by themselves.
  [[nodiscard]] std::string State() const override;

 private:
  [[nodiscard]] std::uint8_t Latch(std::uint16_t offset) const;
  [[nodiscard]] const PortLines* LinesAt(std::uint16_t offset) const;  // of a level register
  [[nodiscard]] std::uint8_t Outputs(const PortLines& lines, unsigned byte) const;
  [[nodiscard]] std::uint8_t Read(std::uint16_t offset) const;

  [[nodiscard]] bool IsPressed(const PortPress& press) const {
    return time_.Now() >= press.from_us && time_.Now() < press.until_us;
  }
  void StartBolts(std::uint16_t offset, std::uint8_t value);

  PortRegistersSetup setup_;
  const Scheduler& time_;
  std::map<std::uint16_t, Microseconds> clearedAt_;  // lasting events, by offset
  std::set<const PortPress*> latched_;               // presses whose event is set
  struct Move {
    Microseconds end = 0;
    bool unlocks = false;
  };
  std::vector<std::optional<Move>> moving_;  // by bolt
};

}  // namespace panelglow::platform::sim
