// An embedded controller behind the two ports of the ACPI interface: commands and data bytes that its firmware takes
// one by one, answers that it gives when it has them, and lamps that it lights by command.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "platform/sim/base/Scheduler.h"
#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

/// Found without making a string: they are looked for at every access to the hardware.
using LampNames = std::set<std::string, std::less<>>;

/// What a command with these data bytes does to the lamps. A command that no row fits does nothing.
struct EcLedCommand {
  enum class Effect {
    kStage,      // names the lamps of the pattern to be shown next
    kShow,       // shows the staged pattern, and holds it
    kAutomatic,  // gives the lamps back to the firmware
    kLight,      // lights the named lamps at once, and holds them
    kDarken,     // ... darkens them
  };

  std::uint8_t code = 0;
  std::vector<std::uint8_t> data;  // all rows of one code have the same number
  Effect effect = Effect::kStage;
  LampNames lamps;
};

/// A lamp on a bit of the controller's memory.
struct EcMemoryLamp {
  std::string name;
  std::uint16_t address = 0;
  std::uint8_t bit = 0;
};

struct EmbeddedControllerSetup {
  enum class Fault {
    kNone,
    kStuckInput,   // the firmware hangs: the input buffer stays full
    kStuckOutput,  // answers never come: the output buffer stays empty
  };

  std::uint16_t commandPort = 0x66;
  std::uint16_t dataPort = 0x62;
  Microseconds take_us = 10;    // from a written byte until the firmware has taken it
  Microseconds answer_us = 50;  // from the last byte of a command until the answer stands in the output buffer
  bool wideAddresses = false;   // 16-bit addresses, high byte first
  std::uint8_t readCommand = 0x80;
  std::uint8_t writeCommand = 0x81;
  std::uint8_t queryCommand = 0x84;
  std::optional<std::uint8_t> pwmCommand;  // data: the fan's register, in pwmRegisterBytes, and the duty
  std::uint8_t pwmRegisterBytes = 1;
  std::map<std::uint16_t, std::uint8_t> memory;
  LampNames automatic;  // lamps that the firmware lights while it has them
  std::vector<EcLedCommand> commands;
  std::vector<EcMemoryLamp> memoryLamps;
  Fault fault = Fault::kNone;
};

/// Status bits: 0 output buffer full, 1 input buffer full, 3 the last byte written was a command.
///
/// There is one input buffer: a byte written before the firmware has taken the one before replaces it. A command that
/// comes while another still waits for data ends that one. Data without a command is dropped. Reading the data port
/// empties the output buffer; an empty one reads as what was in it last. After power-on both buffers are empty, and
/// nothing stands in the output buffer unless a command asked for it, so a host that wants to see it full first waits
/// for nothing.
///
/// Pins: the lamps' names.
class EmbeddedController : public Device {
 public:
  EmbeddedController(const EmbeddedControllerSetup& setup, const Scheduler& time);

  [[nodiscard]] std::vector<AddressRange> PortRanges() const override {
    return {{setup_.commandPort, 1}, {setup_.dataPort, 1}};
  }
  std::uint8_t ReadPort(std::uint16_t port) override;
  void WritePort(std::uint16_t port, std::uint8_t value) override;

  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<Microseconds> NextEvent() const override;
  [[nodiscard]] std::optional<Microseconds> UnderWayUntil() const override { return NextEvent(); }
  void Advance() override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view /*pin*/) const override {
    return setup_.commandPort;
  }
  /// Memory, lamps and duties; not what is under way.
  [[nodiscard]] std::string State() const override;

 private:
  struct Written {
    std::uint8_t value = 0;
    bool isCommand = false;
    Microseconds taken = 0;  // when the firmware takes it
  };
  struct Answer {
    std::uint8_t value = 0;
    Microseconds ready = 0;
  };

  void Take(const Written& byte);
  [[nodiscard]] std::optional<std::size_t> DataBytesOf(std::uint8_t command) const;
  void Execute(Microseconds now);
  void RunLedCommand();
  [[nodiscard]] std::uint16_t Address() const;

  EmbeddedControllerSetup setup_;
  const Scheduler& time_;
  LampNames lamps_;  // all there are

  std::optional<Written> input_;
  std::optional<Answer> answer_;  // that the firmware still works on
  bool outputFull_ = false;
  std::uint8_t output_ = 0;
  bool lastWasCommand_ = false;
  std::optional<std::uint8_t> command_;  // that waits for data
  std::vector<std::uint8_t> data_;

  std::map<std::uint16_t, std::uint8_t> memory_;
  std::map<std::uint16_t, std::uint8_t> duties_;
  LampNames staged_;
  LampNames shown_;
  bool held_ = false;  // shown_ counts, not the firmware's own pattern
};

}  // namespace panelglow::platform::sim
