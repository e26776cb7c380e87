// A Super-I/O whose LED pins, GPIO lines, banks and locks are told by tables.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "platform/sim/silicon/LedPins.h"
#include "platform/sim/silicon/SuperIo.h"

namespace panelglow::platform::sim {

/// Run-time registers answer at the base address of their device (0x60, 0x61) while it is active.
///
/// Pins: the names of the LED pins, "GP<line>"; and several joined by "&" for a lamp that needs all of them high.
class TableSuperIo : public SuperIo {
 public:
  TableSuperIo(const SuperIoSetup& setup, const Scheduler& time);

  [[nodiscard]] std::vector<AddressRange> PortRanges() const override;
  std::uint8_t ReadPort(std::uint16_t port) override;
  void WritePort(std::uint16_t port, std::uint8_t value) override;

  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  [[nodiscard]] std::optional<Microseconds> NextEvent() const override;
  [[nodiscard]] std::string State() const override;

 protected:
  [[nodiscard]] std::uint8_t ReadRegister(std::uint8_t address) const override;
  void WriteRegister(std::uint8_t address, std::uint8_t value) override;

 private:
  [[nodiscard]] const SuperIoTables& Tables() const { return Setup().tables; }
  [[nodiscard]] std::uint8_t Value(const SuperIoField& field) const;
  [[nodiscard]] bool IsLocked(bool isRuntime, std::optional<std::uint8_t> device, std::uint8_t address) const;
  [[nodiscard]] LedFieldReader Reader() const {
    return [this](const SuperIoField& field) { return Value(field); };
  }
  [[nodiscard]] bool BitOf(const SuperIoLines& lines, std::uint8_t address, unsigned bit) const;
  [[nodiscard]] bool Drives(const SuperIoLines& lines, unsigned bit) const;
  [[nodiscard]] bool PinLevel(const SuperIoLines& lines, unsigned bit) const;
  [[nodiscard]] const SuperIoLed* FindLed(std::string_view pin) const;
  [[nodiscard]] std::map<std::uint8_t, std::uint8_t>::iterator AtPort(std::uint16_t port);

  std::map<std::uint8_t, std::uint8_t> runtime_;  // by offset
  std::map<std::uint8_t, RegisterBanks> banked_;  // by device
};

}  // namespace panelglow::platform::sim
