// The buses of a simulated machine: I/O ports, physical memory, PCI configuration space.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <memory>
#include <set>
#include <span>
#include <string>
#include <vector>

#include "platform/sim/silicon/Device.h"
#include "platform/sim/silicon/PciFunction.h"

namespace panelglow::platform::sim {

class Buses {
 public:
  explicit Buses(const std::vector<PciFunction>& functions) : functions_(functions) {}

  /// Puts a device on the buses; the buses own it.
  void Attach(const std::string& name, std::unique_ptr<Device> device);

  /// Null when there is no device of that name.
  [[nodiscard]] Device* Find(const std::string& name) const;

  /// A device taken off the buses: it answers no access, its pins stay where they are.
  void Remove(const std::string& name);
  [[nodiscard]] bool IsRemoved(const std::string& name) const;

  /// Writes to this port or memory address succeed and change nothing.
  void IgnoreWrites(const std::string& device, std::uint64_t address) { ignored_.insert({device, address}); }
  [[nodiscard]] bool IsIgnored(const std::string& device, std::uint64_t address) const {
    return !ignored_.empty() && ignored_.count({device, address}) != 0;
  }

  /// `width` is 1, 2 or 4 bytes; where nothing answers a read gives ones.
  std::uint32_t ReadPort(std::uint16_t port, unsigned width);
  void WritePort(std::uint16_t port, unsigned width, std::uint32_t value);

  /// Addresses without a device are RAM.
  std::uint8_t ReadMemory(std::uint64_t address);
  void WriteMemory(std::uint64_t address, std::uint8_t value);

  /// Puts bytes into RAM, also where a device hides it.
  void LoadMemory(std::uint64_t address, std::span<const std::uint8_t> bytes);

  [[nodiscard]] const PciFunction* FindPci(std::uint16_t location) const;
  [[nodiscard]] std::uint8_t ReadPciByte(std::uint16_t location, std::uint16_t offset) const;
  void WritePciByte(std::uint16_t location, std::uint16_t offset, std::uint8_t value);
  [[nodiscard]] const std::vector<PciFunction>& PciFunctions() const { return functions_; }

  /// The registers of all devices, as text.
  [[nodiscard]] std::string State() const;

 private:
  struct Attached {
    std::string name;
    std::unique_ptr<Device> device;
    bool isRemoved = false;
  };
  [[nodiscard]] const Attached* AtPort(std::uint16_t port) const;
  [[nodiscard]] const Attached* AtMemory(std::uint64_t address) const;

  static constexpr std::uint64_t kPage = 4096;

  std::vector<Attached> devices_;
  std::set<std::pair<std::string, std::uint64_t>> ignored_;
  std::vector<PciFunction> functions_;
  std::map<std::uint64_t, std::array<std::uint8_t, kPage>> ram_;  // by page number
};

}  // namespace panelglow::platform::sim
