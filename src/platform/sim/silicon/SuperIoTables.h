// What sets one plain Super-I/O apart from the next, as tables: which registers hold a LED pin's mode or a GPIO
// line, which select others, which lock others.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "platform/sim/base/Scheduler.h"
#include "platform/sim/silicon/RegisterBanks.h"

namespace panelglow::platform::sim {

/// Some bits of a register.
struct SuperIoField {
  bool isRuntime = false;              // a run-time register, counted from the base address of their device
  std::optional<std::uint8_t> device;  // of a configuration register; none: a global one
  std::optional<std::uint8_t> bank;    // of a register that stands in banks
  std::uint8_t address = 0;
  std::uint8_t mask = 0xFF;
};

struct SuperIoCondition {
  SuperIoField field;
  std::uint8_t value = 0;  // of the masked register
};

/// A pin with a mode: low but for the values named here.
struct SuperIoLed {
  std::string name;
  SuperIoField mode;
  std::set<std::uint8_t> high;
  std::map<std::uint8_t, Microseconds> half_us;  // half a period, by the values that make it blink
  std::vector<SuperIoCondition> needs;           // while one does not hold, something else has the pin
  bool otherwise = false;                        // ... and this is its level
};

/// Eight GPIO lines in configuration registers of a device.
struct SuperIoLines {
  std::uint8_t number = 0;  // tens digit of its lines
  std::uint8_t device = 0;
  std::optional<std::uint8_t> enableBit;  // of register 0x30; while it is clear the lines drive nothing
  std::uint8_t direction = 0;
  bool outputIsSet = false;  // what the direction bit of an output is
  std::uint8_t data = 0;     // an output's level; of an input, the level that it has
  std::optional<std::uint8_t> inversion;
  std::optional<std::uint8_t> status;    // read only: the levels of the pins
  std::optional<std::uint8_t> function;  // bit set: the pin is no GPIO line
  std::uint8_t inputs = 0;               // outside level
};

/// While the condition holds, writes to these registers of the same space are lost.
struct SuperIoLock {
  SuperIoCondition condition;
  std::set<std::uint8_t> stops;
};

struct SuperIoTables {
  std::optional<std::uint8_t> runtimeDevice;
  std::map<std::uint8_t, std::uint8_t> runtime;  // by offset
  std::vector<SuperIoLed> leds;
  std::vector<SuperIoLines> lines;
  std::vector<SuperIoLock> locks;
  std::map<std::uint8_t, BankSetup> banks;  // by device
};

}  // namespace panelglow::platform::sim
