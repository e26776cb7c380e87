// PCI configuration space by the kernel's files for each function, in the order of bus, device and function.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace panelglow::platform::host_linux {

class PciConfiguration {
 public:
  /// `folder`: where the kernel shows its PCI devices.
  explicit PciConfiguration(std::string folder = "/sys/bus/pci/devices") : folder_(std::move(folder)) {}

  /// The functions of domain 0: bus in the high byte, device in bits 7 to 3, function below.
  [[nodiscard]] std::vector<std::uint16_t> Functions() const;

  /// Nothing for a function that there is not, or a register that the kernel does not show: without the right to it
  /// only the first 64 bytes are there. `width` is 1, 2 or 4 bytes.
  [[nodiscard]] std::optional<std::uint32_t> Read(std::uint16_t location, std::uint16_t reg, unsigned width) const;

  /// 0, or the kernel's error number; ENXIO for a register behind the end.
  [[nodiscard]] int Write(std::uint16_t location, std::uint16_t reg, unsigned width, std::uint32_t value) const;

 private:
  [[nodiscard]] std::string FileOf(std::uint16_t location) const;

  std::string folder_;
};

}  // namespace panelglow::platform::host_linux
