// Hardware that nobody has built: it takes every request, remembers it, and answers as plain registers would, so that
// the board library can be rehearsed without a machine.
//
// What was written is read back; what was not is the background. A register that is read again and again changes, so
// that every wait for a bit comes to an end. A base address is made up where configuration space or a configuration
// register is asked for one.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <utility>
#include <vector>

#include "boardtool/HardwareAccess.h"
#include "platform/DriverDevice.h"
#include "platform/Management.h"

namespace panelglow::boardtool {

class ImaginedHardware {
 public:
  /// `background`: what every bit of an unwritten register byte is, 0x00 or 0xFF.
  explicit ImaginedHardware(std::uint8_t background) : background_(background) {}

  /// Everything that was done, in order.
  [[nodiscard]] const std::vector<HardwareAccess>& Accesses() const { return accesses_; }
  [[nodiscard]] std::vector<HardwareAccess> TakeAccesses() { return std::exchange(accesses_, {}); }

  void AddWait(std::uint32_t milliseconds);
  void AddFirmwareCall(const platform::ManagementCall& call);

  /// The answer of a driver to a record; see platform/DriverRecords.h.
  std::uint32_t Control(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out);
  std::uint32_t ReadMapped(std::uint64_t mapped, std::size_t width);
  void WriteMapped(std::uint64_t mapped, std::size_t width, std::uint32_t value);

  /// A byte that was written, by where it stands.
  struct Cell {
    HardwareAccess::Kind space = HardwareAccess::Kind::kPortWrite;
    int indexPort = -1;
    int logicalDevice = -1;
    std::uint64_t address = 0;  // of the port, byte of memory, or PCI location and register; a register's number
    auto operator<=>(const Cell&) const = default;  // NOLINT(modernize-use-nullptr): the check misreads it
  };

  /// The bytes that were written, as they are now, but for index ports and what steers the access to others.
  [[nodiscard]] std::map<Cell, std::uint8_t> Written() const;

 private:
  std::uint8_t ReadByte(const Cell& cell);
  [[nodiscard]] std::optional<std::uint8_t> MadeUp(const Cell& cell) const;
  std::uint32_t Read(HardwareAccess access);
  void Write(HardwareAccess access);

  std::uint8_t background_;
  std::vector<HardwareAccess> accesses_;
  std::map<Cell, std::uint8_t> cells_;
  IndexTracker tracker_;
  std::optional<Cell> lastRead_;  // and nothing was written since
  unsigned repeats_ = 0;
};

/// The driver's device on such hardware, which it keeps.
class ImaginedDrivers : public platform::DriverDevices {
 public:
  explicit ImaginedDrivers(std::shared_ptr<ImaginedHardware> hardware) : hardware_(std::move(hardware)) {}
  std::unique_ptr<platform::DriverDevice> Open(std::string_view linkName, std::uint32_t& error) override;

 private:
  std::shared_ptr<ImaginedHardware> hardware_;
};

}  // namespace panelglow::boardtool
