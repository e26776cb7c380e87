// A Super-I/O: configuration registers behind an index and a data port, base addresses of its logical devices, an
// environment controller and GPIO level ports.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "platform/sim/base/Scheduler.h"
#include "platform/sim/silicon/Device.h"
#include "platform/sim/silicon/EnvironmentController.h"
#include "platform/sim/silicon/SuperIoTables.h"

namespace panelglow::platform::sim {

enum class SuperIoFamily { kPlain, kIte, kFintek };

/// Eight GPIO lines.
struct GpioSet {
  std::uint8_t outputs = 0;  // of the plain family alone; the others have registers for it
  std::uint8_t inputs = 0;   // outside level of the lines that are no outputs
  std::uint8_t latch = 0;
};

struct SuperIoSetup {
  SuperIoFamily family = SuperIoFamily::kPlain;
  std::uint16_t indexPort = 0x2E;        // the data port is the next one; a strap on the board picks 0x2E or 0x4E
  std::vector<std::uint8_t> enterKeys;   // written to the index port in a row; none: it is always open
  std::optional<std::uint8_t> exitKey;   // written to the index port; the ITE family leaves by a register instead
  std::array<std::uint8_t, 3> chipId{};  // registers 0x20 to 0x22
  std::map<std::uint8_t, std::uint8_t> globals;                          // global registers, 0x00 to 0x2F
  std::map<std::uint8_t, std::map<std::uint8_t, std::uint8_t>> devices;  // by logical device, 0x30 to 0xFF
  std::optional<EnvironmentSetup> environment;
  std::uint8_t gpioDevice = 7;
  std::vector<GpioSet> gpio;  // ITE and plain: lines 10 to 17, 20 to 27, ...; Fintek begins with lines 0 to 7
  SuperIoTables tables;       // of the plain family
};

/// The plain family, and what all have in common. The part waits for its keys and then is in configuration mode until
/// it is told to leave; outside that mode both ports read as 0xFF and take nothing but the keys. Register 7 selects a
/// logical device, which stays selected. Global registers (below 0x30) belong to no device. A device that the part
/// does not have has no registers.
///
/// A device answers at its base address once bit 0 of its register 0x30 is set: the environment controller at
/// registers 0x60 and 0x61 (high, low), the level ports, one for each set of lines, at 0x62 and 0x63.
///
/// Pins: "GP<line>", as "GP12".
class SuperIo : public Device {
 public:
  SuperIo(const SuperIoSetup& setup, const Scheduler& time);

  [[nodiscard]] std::vector<AddressRange> PortRanges() const override;
  std::uint8_t ReadPort(std::uint16_t port) override;
  void WritePort(std::uint16_t port, std::uint8_t value) override;

  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  /// All registers but the index and the selected device, which every user sets before use. A part left in
  /// configuration mode counts as a change.
  [[nodiscard]] std::string State() const override;

 protected:
  /// A register of the selected device or a global one, as software reads it.
  [[nodiscard]] virtual std::uint8_t ReadRegister(std::uint8_t address) const;
  virtual void WriteRegister(std::uint8_t address, std::uint8_t value);

  /// The level that a GPIO line drives, or the outside level where it drives none.
  [[nodiscard]] virtual bool LineLevel(std::size_t set, unsigned bit) const;
  /// Number of the first set's lines, tens digit.
  [[nodiscard]] virtual std::size_t FirstSet() const { return 1; }
  /// False where the lines are reached by configuration registers instead.
  [[nodiscard]] virtual bool HasLevelPorts() const { return true; }
  /// Whether the device answers at its base address.
  [[nodiscard]] virtual bool IsActive(std::uint8_t device) const;

  /// The address in a register and the next one, the high byte first.
  [[nodiscard]] std::uint16_t Base(std::uint8_t device, std::uint8_t highRegister) const;

  /// 0 for a device that the part does not have.
  [[nodiscard]] std::uint8_t DeviceRegister(std::uint8_t device, std::uint8_t address) const;
  [[nodiscard]] std::uint8_t Global(std::uint8_t address) const { return globals_[address]; }
  [[nodiscard]] std::uint8_t SelectedDevice() const { return selected_; }
  [[nodiscard]] const SuperIoSetup& Setup() const { return setup_; }
  [[nodiscard]] const Scheduler& Time() const { return time_; }
  [[nodiscard]] std::uint8_t Latch(std::size_t set) const { return latches_[set]; }
  void LeaveConfigurationMode() { configuration_ = false; }

 private:
  using Registers = std::array<std::uint8_t, 256>;

  void WriteIndex(std::uint8_t value);
  [[nodiscard]] std::uint8_t Levels(std::size_t set) const;
  [[nodiscard]] std::optional<std::pair<std::size_t, unsigned>> Locate(std::string_view pin) const;  // set and bit

  SuperIoSetup setup_;
  const Scheduler& time_;
  Registers globals_{};
  std::map<std::uint8_t, Registers> devices_;
  std::vector<std::uint8_t> latches_;  // output levels, by set
  std::optional<EnvironmentController> environment_;
  bool configuration_ = false;
  std::size_t keysSeen_ = 0;
  std::uint8_t index_ = 0;
  std::uint8_t selected_ = 0;
};

/// Level of a blinking output: equal halves, counted by a divider that runs on from power-on whoever looks at it.
bool BlinkLevel(Microseconds now, Microseconds half_us);

/// The next edge of such an output.
Microseconds NextBlinkEdge(Microseconds now, Microseconds half_us);

}  // namespace panelglow::platform::sim
