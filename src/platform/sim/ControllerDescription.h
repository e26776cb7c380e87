// Storage controllers and other devices of a machine that have no registers of their own here.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace panelglow::platform::sim {

struct ControllerDescription {
  enum class Kind { kIde, kScsi };  // which management class lists it

  std::string name;
  std::string instanceId;
  Kind kind = Kind::kIde;
  std::uint32_t classCode = 0;  // of a PCI function, 24 bits
  std::uint8_t bus = 0;         // likewise; device and function stand in the instance id
  std::string description;
  std::string driver;                   // name of its driver's service, empty: it has none
  std::vector<std::uint8_t> scsiPorts;  // of the registry's ports, those that name this driver
  std::optional<std::uint32_t> uiNumber;
};

struct EnumeratedDescription {
  std::string instanceId;
  std::vector<std::string> hardwareIds;
  std::string description;
  std::string parent;  // an instance id; empty: the root
};

/// What the instance id of a PCI function says of it.
struct PciIdentity {
  std::uint16_t vendor = 0;
  std::uint16_t device = 0;
  std::uint32_t subsystem = 0;  // the device in the high half, the vendor in the low one
  std::uint8_t revision = 0;
  std::uint8_t place = 0;  // device << 3 | function
};

/// Nothing for an id that has not the usual form, as PCI\VEN_8086&DEV_2922&SUBSYS_12345678&REV_02\3&11583659&0&FA.
std::optional<PciIdentity> ParsePciInstanceId(const std::string& instanceId);

}  // namespace panelglow::platform::sim
