// The only road to the machine's hardware: I/O ports, PCI configuration space, physical memory, model-specific
// registers, the firmware segment. Each operation is one request record to the privileged driver; nothing is
// interpreted here.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>

#include "hw/DriverLoader.h"
#include "platform/DriverDevice.h"

namespace panelglow {

/// Legal on an object without a driver as well: reads give 0, writes false, PCI operations 0x81. No operation throws.
/// Two threads may use one object: each request is a single call. Requests that belong together are guarded by the
/// board library's mutex.
class CDevio {
 public:
  using LoadState = DriverLoadState;

  /// The answer of a mapping request: the five words of the 32-bit record.
  using MappingRecord = std::array<std::uint32_t, 5>;

  /// Loads the driver under its present names, and when its file is missing under its older ones.
  CDevio();
  CDevio(std::string service, std::string display, std::string deviceLink, std::string image);

  /// The image path is "system32\drivers\" with the service's name and ".sys".
  CDevio(const std::string& service, const std::string& display, const std::string& deviceLink);

  /// Nothing is loaded before LoadOnce: for an object that exists before anybody knows whether the hardware is
  /// needed.
  struct LoadLater {};
  explicit CDevio(LoadLater later);

  /// Closes the device. The service stays running.
  virtual ~CDevio() = default;
  CDevio(const CDevio&) = delete;
  CDevio& operator=(const CDevio&) = delete;

  [[nodiscard]] bool IsDriverLoaded() const { return device != nullptr; }
  [[nodiscard]] LoadState GetLoadState() const { return loadState; }

  /// Registers the service if it is new, starts it and opens the device, under the names of this object. True when
  /// the device is open.
  bool LoadDriver();

  /// As the constructor without names, unless the device is open or its service was started before. True when the
  /// device is open.
  bool LoadOnce();

  /// One debug line with the driver's name and version.
  void LogDriverVersion();

  // ---- I/O ports
  std::uint8_t InportByte(std::uint16_t port);
  std::uint16_t InportWord(std::uint16_t port);
  std::uint32_t InportDword(std::uint16_t port);

  /// True when the request succeeded.
  bool OutportByte(std::uint16_t port, std::uint8_t value);
  bool OutportWord(std::uint16_t port, std::uint16_t value);
  void OutportDword(std::uint16_t port, std::uint32_t value);

  // ---- PCI; a location holds the bus in its high byte, device in bits 7 to 3, function in bits 2 to 0. Results are
  // the driver's status: 0 is success, and only then the out value is set to anything but 0.
  std::uint8_t ReadPciConfigByte(std::uint16_t location, std::uint16_t reg, std::uint8_t& value);
  std::uint8_t ReadPciConfigWord(std::uint16_t location, std::uint16_t reg, std::uint16_t& value);
  std::uint8_t ReadPciConfigDword(std::uint16_t location, std::uint16_t reg, std::uint32_t& value);
  std::uint8_t WritePciConfigByte(std::uint16_t location, std::uint16_t reg, std::uint8_t value);
  std::uint8_t WritePciConfigWord(std::uint16_t location, std::uint16_t reg, std::uint16_t value);
  std::uint8_t WritePciConfigDword(std::uint16_t location, std::uint16_t reg, std::uint32_t value);

  /// The `index`-th (from 0) device of these ids, or of a class code.
  std::uint8_t FindPciDevice(std::uint16_t vendor, std::uint16_t deviceId, std::uint16_t index,
                             std::uint16_t& location);
  std::uint8_t FindPciClass(std::uint32_t classCode, std::uint16_t index, std::uint16_t& location);

  /// A base address register without its flag bits, with the next register as high half when it is a 64-bit one.
  std::uint8_t ReadPciBar(std::uint16_t location, std::uint16_t reg, std::uint64_t& base);

  /// The first function of the class whose four ids equal the arguments; false, and location 0, when there is none.
  bool FindPciDeviceByIds(std::uint32_t classCode, std::uint16_t vendor, std::uint16_t deviceId,
                          std::uint16_t subVendor, std::uint16_t subDevice, std::uint16_t& location);

  /// The `occurrence`-th (from 0) function of the class whose description in the device tree contains `name`; false,
  /// and location 0, when there is none.
  bool FindPciDeviceByName(std::uint32_t classCode, const std::string& name, unsigned occurrence,
                           std::uint16_t& location);

  // ---- physical memory; results are the bytes copied: `length`, or 0 on failure. `length` is limited to the buffer.
  std::uint32_t ReadPhysicalMemory(std::uint32_t address, std::uint32_t length, std::span<std::byte> buffer);
  std::uint32_t ReadPhysicalMemory64(std::uint32_t low, std::uint32_t high, std::uint32_t length,
                                     std::span<std::byte> buffer);
  std::uint32_t WritePhysicalMemory(std::uint32_t address, std::uint32_t length, std::span<const std::byte> buffer);
  std::uint32_t WritePhysicalMemory64(std::uint32_t low, std::uint32_t high, std::uint32_t length,
                                      std::span<const std::byte> buffer);

  /// The mapped address, or 0; `record`, when given, takes the whole answer.
  std::uint32_t MapPhysicalMemory(std::uint32_t address, std::uint32_t length, MappingRecord* record);

  /// Releases a mapping and zeroes its record. False when the driver refused.
  bool UnmapPhysicalMemory(MappingRecord& record);

  // ---- others

  /// In: the register's index in the low half of `value`. Out: its content. 0, or the system's error number.
  std::uint32_t ReadMsr(std::uint64_t& value);

  std::uint8_t ReadFirmwareByte(std::uint16_t segment, std::uint16_t offset);
  std::uint16_t ReadFirmwareWord(std::uint16_t segment, std::uint16_t offset);

 private:
  using PciIds = std::array<std::uint16_t, 4>;  // vendor, device, subsystem vendor, subsystem device

  /// The first function of the class that is the wanted one.
  template <class Wanted>
  bool FindPciFunction(std::uint32_t classCode, std::uint16_t& location, Wanted isWanted);
  explicit CDevio(DriverNames given);
  std::uint32_t Inport(std::uint32_t code, std::uint16_t port, std::uint32_t width);
  bool Outport(std::uint32_t code, std::uint16_t port, std::uint32_t width, std::uint32_t value,
               std::size_t answerSize);
  std::uint8_t PciRequest(std::uint32_t code, std::uint16_t location, std::uint16_t reg, std::uint32_t& value);
  std::uint8_t PciSearch(std::uint32_t code, std::uint32_t classCode, std::uint16_t vendor, std::uint16_t deviceId,
                         std::uint16_t index, std::uint16_t& location);
  std::uint64_t Map32(std::uint32_t address, std::uint32_t length, MappingRecord* record);
  std::uint64_t Map64(std::uint64_t address, std::uint32_t length);
  std::uint64_t Map(std::uint64_t address, std::uint32_t length);
  std::uint32_t CopyFrom(std::uint64_t mapped, std::span<std::byte> buffer);
  std::uint32_t CopyTo(std::uint64_t mapped, std::span<const std::byte> buffer);
  std::uint16_t ReadFirmware(std::uint32_t code, std::uint16_t segment, std::uint16_t offset);

  DriverNames names;
  LoadState loadState = LoadState::kNotStarted;
  std::unique_ptr<platform::DriverDevice> device;  // null: not loaded
};

}  // namespace panelglow
