// An SMBus host in I/O ports, with the devices on its bus.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "platform/sim/base/Scheduler.h"
#include "platform/sim/silicon/Device.h"
#include "platform/sim/silicon/SuperIoTables.h"

namespace panelglow::platform::sim {

struct SmbusDevice {
  std::map<std::uint8_t, std::uint8_t> registers;  // by command
  std::set<std::uint8_t> readOnly;                 // take what is written and lose it
  std::vector<SuperIoLed> lamps;                   // their fields are registers of the device
};

struct SmbusHostSetup {
  enum class Fault {
    kNone,
    kStuckBusy,  // a device holds the clock: no transfer comes to its end
  };

  std::uint16_t base = 0;
  Microseconds transfer_us = 500;               // of a byte, as at 100 kHz
  std::map<std::uint8_t, SmbusDevice> devices;  // by 7-bit address
  Fault fault = Fault::kNone;
};

/// Base + 0: protocol; a write starts a transfer: 6 writes a byte, 7 reads one, any other is not supported. + 1:
/// status. + 2: address in bits 7 to 1. + 3: command. + 4: data.
///
/// Status: 0x1A while a transfer is under way; then 0x80 for a good one, 0x10 when no device has acknowledged the
/// address, 0x12 when the device has not acknowledged the command, 0x17 for the protocol. Reading the protocol
/// register of an idle host clears it. Data holds the byte read only when the transfer is over, and what is written
/// to any register while one is under way is lost.
///
/// Pins: the lamps' names.
class SmbusHost : public Device {
 public:
  SmbusHost(const SmbusHostSetup& setup, const Scheduler& time);

  [[nodiscard]] std::vector<AddressRange> PortRanges() const override { return {{setup_.base, 5}}; }
  std::uint8_t ReadPort(std::uint16_t port) override;
  void WritePort(std::uint16_t port, std::uint8_t value) override;

  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view /*pin*/) const override {
    return setup_.base;  // without its protocols nothing is transferred
  }
  [[nodiscard]] std::optional<Microseconds> NextEvent() const override;
  [[nodiscard]] std::optional<Microseconds> UnderWayUntil() const override;
  void Advance() override;
  /// The devices' registers; those of the host are every user's own to set.
  [[nodiscard]] std::string State() const override;

 private:
  void Transfer();

  SmbusHostSetup setup_;
  const Scheduler& time_;
  std::uint8_t protocol_ = 0;  // of the transfer under way
  std::optional<Microseconds> end_;
  std::uint8_t status_ = 0;
  std::uint8_t address_ = 0;
  std::uint8_t command_ = 0;
  std::uint8_t data_ = 0;
};

}  // namespace panelglow::platform::sim
