// The configuration registers of a Super-I/O: keys open and close them, a register selects the logical device.
#pragma once

#include <cstdint>
#include <optional>
#include <utility>
#include <vector>

#include "board/parts/IndexedPorts.h"
#include "board/parts/RegisterFile.h"

namespace panelglow {

/// The mode is held for an operation (ConfigMode), in which a device is selected when it is not the last one. Where a
/// part is opened and closed for each access, EachAccess stands around this.
class ConfigRegisters : public RegisterFile {
 public:
  /// The place of a register that all devices share: none is selected for it.
  static constexpr std::uint8_t kGlobal = 0xFF;

  /// Keys go to the index port.
  ConfigRegisters(const IndexedPorts& at, std::vector<std::uint8_t> enterKeys, std::vector<std::uint8_t> exitKeys)
      : ports(at), enter(std::move(enterKeys)), exit(std::move(exitKeys)) {}

  std::uint8_t Read(RegisterId id) override;
  void Write(RegisterId id, std::uint8_t value) override;
  void EnterConfigMode() override;
  void ExitConfigMode() override;

  /// Always written, unlike the selection that an access makes by itself.
  void SelectDevice(std::uint8_t device);

 protected:
  [[nodiscard]] const IndexedPorts& Ports() const { return ports; }

 private:
  void SelectPlace(std::uint8_t place);

  IndexedPorts ports;
  std::vector<std::uint8_t> enter;
  std::vector<std::uint8_t> exit;
  std::optional<std::uint8_t> selected;  // in this stay in the mode
};

}  // namespace panelglow
