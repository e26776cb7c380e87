// An embedded controller that is reached through mailbox registers: its whole memory, a byte at a time, and a few
// run-time registers on ports of their own.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "platform/sim/base/Scheduler.h"
#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

/// A pin with a multiplexer in front: while the field has the value, the pin follows its bit; else it is the
/// firmware's, which drives `otherwise`.
struct MailboxPin {
  std::string name;
  std::optional<std::uint16_t> port;  // of a run-time register; otherwise `address`, of the memory
  std::uint32_t address = 0;
  std::uint8_t bit = 0;
  std::optional<std::uint32_t> muxAddress;  // none: the pin always follows its bit
  std::uint8_t muxMask = 0;
  std::uint8_t muxValue = 0;
  bool otherwise = false;
};

struct MailboxControllerSetup {
  enum class Fault {
    kNone,
    kStuckBusy,  // the firmware never comes to an end of the first step
  };

  std::uint16_t indexPort = 0x200;      // the data port is the next one
  Microseconds step_us = 45'000;        // the firmware looks after one written register
  std::uint16_t configurationPort = 0;  // 0x2E or 0x4E, by a strap; 0: none
  std::map<std::uint8_t, std::uint8_t> configuration;
  std::map<std::uint16_t, std::uint8_t> runtime;  // by port
  std::map<std::uint32_t, std::uint8_t> memory;
  std::vector<MailboxPin> pins;
  Fault fault = Fault::kNone;
};

/// Mailbox registers: 0x82 command, 0x84 and 0x85 address (low, high), 0x86 data. A write to one of them is a step of
/// the firmware: it takes its time, and what is written meanwhile is lost. The index port is hardware and always
/// takes a value. Commands: 0x1D makes the address registers the page, the upper half of a memory address; 1 reads
/// the byte at page and address into the data register, 2 writes it. While a step is under way the data register
/// reads 0x48.
///
/// The configuration ports are silent (0xFF) until 0x55 is written to the index port, and again behind 0xAA.
///
/// Pins: as described.
class MailboxController : public Device {
 public:
  static constexpr std::uint8_t kBusy = 0x48;

  MailboxController(const MailboxControllerSetup& setup, const Scheduler& time);

  [[nodiscard]] std::vector<AddressRange> PortRanges() const override;
  std::uint8_t ReadPort(std::uint16_t port) override;
  void WritePort(std::uint16_t port, std::uint8_t value) override;

  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<Microseconds> NextEvent() const override;
  [[nodiscard]] std::optional<Microseconds> UnderWayUntil() const override { return NextEvent(); }
  void Advance() override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  /// Memory, run-time registers and configuration mode; not the mailbox, which every user sets before use.
  [[nodiscard]] std::string State() const override;

 private:
  void EndStep();
  [[nodiscard]] bool IsBusy() const { return stepEnd_.has_value(); }
  [[nodiscard]] std::uint16_t Address() const;
  std::uint8_t ReadConfiguration(bool data);
  void WriteConfiguration(bool data, std::uint8_t value);

  MailboxControllerSetup setup_;
  const Scheduler& time_;
  std::map<std::uint32_t, std::uint8_t> memory_;
  std::map<std::uint16_t, std::uint8_t> runtime_;

  std::uint8_t index_ = 0;
  std::array<std::uint8_t, 256> registers_{};
  std::uint8_t written_ = 0;  // register of the step under way
  std::optional<Microseconds> stepEnd_;
  std::uint16_t page_ = 0;

  bool configuring_ = false;
  std::uint8_t configurationIndex_ = 0;
};

}  // namespace panelglow::platform::sim
