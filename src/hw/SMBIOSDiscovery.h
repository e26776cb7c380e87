// What the machine's firmware says about the machine, read once per process from the management service's copy of the
// firmware's structure table. Its weight lies in the product text, which names the model.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <vector>

namespace panelglow {

/// A type 4 structure.
struct ProcessorInfo {
  std::uint32_t family = 0;  // the published processor family number
  std::string manufacturer;
  std::uint8_t coreCount = 0;
  std::uint16_t externalClock = 0;  // MHz
  std::uint16_t maximumSpeed = 0;   // MHz
  std::uint16_t currentSpeed = 0;   // MHz
  std::string processorId;          // first word of the id, eight hexadecimal digits
  std::string version;
  std::uint32_t model = 0;
  std::string hyperThreading;  // "true" or "false", of the processor that runs this program
  std::string longMode;        // "yes" or "no"
};

/// A type 17 structure.
struct MemoryDeviceInfo {
  std::string size;        // megabytes, or "Unknown"
  std::string totalWidth;  // bits, or "Unknown"
  std::string dataWidth;   // bits, or "Unknown"
  std::string installed;   // "Installed" or "Not Installed"
  std::string type;
  std::string speed;  // MHz, or "Unknown"
  std::string deviceLocator;
  std::string bankLocator;
  std::string manufacturer;
  std::string serial;
  std::string assetTag;
  std::string partNumber;
};

/// A type 16 structure.
struct MemoryArrayInfo {
  std::string errorCorrection;
  std::string maximumCapacity;  // as "32 GB", or "Unknown"
};

/// A type 7 structure.
struct CacheInfo {
  std::string level;  // as "L1"
  std::string size;   // kilobytes
  std::string socket;
};

/// The type 1 structure.
struct SystemInfo {
  std::string manufacturer;
  std::string productName;
  std::string version;
  std::string serialNumber;
  std::string sku;
  std::string family;
  std::string uuid;
};

/// The type 0 structure.
struct BiosInfo {
  std::uint16_t handle = 0;
  std::string vendor;
  std::string version;
  std::string releaseDate;
  std::uint32_t characteristics = 0;
};

class SMBIOSDiscovery {
 public:
  static constexpr std::size_t kMostProcessors = 10;
  static constexpr std::size_t kMostMemoryDevices = 100;

  /// Reads the machine's table at first use. Throws CDMException 990405 for a table that cannot be handled, and what
  /// WMIDiscovery throws.
  static SMBIOSDiscovery& Instance();

  /// Reads a table given as bytes. Lengths that lie end the walk at the table's end; records past the limits are left
  /// unstored.
  explicit SMBIOSDiscovery(std::span<const std::uint8_t> table);
  virtual ~SMBIOSDiscovery() = default;

  /// At most the first four characters of the base board's product name.
  [[nodiscard]] std::string GetProductText() const { return productText; }

  /// An empty record for an index past the last.
  [[nodiscard]] ProcessorInfo GetProcessor(std::size_t index) const {
    return index < processors.size() ? processors[index] : ProcessorInfo{};
  }

  std::string productText;
  std::vector<ProcessorInfo> processors;
  std::string boardSerial;
  std::uint8_t chassisType = 0;
  std::vector<MemoryDeviceInfo> memoryDevices;
  SystemInfo systemInfo;
  BiosInfo biosInfo;
  std::uint32_t populatedSockets = 0;
  bool isAmd = false;
  std::uint8_t oemByte = ' ';
  std::vector<MemoryArrayInfo> memoryArrays;
  std::vector<CacheInfo> caches;

 private:
  class Structure;

  SMBIOSDiscovery();
  void Walk(std::span<const std::uint8_t> table);
  std::size_t ParseStructure(std::span<const std::uint8_t> rest);
  void ReadBios(const Structure& s);
  void ReadSystem(const Structure& s);
  void ReadBaseBoard(const Structure& s);
  void ReadEnclosure(const Structure& s);
  void ReadProcessor(const Structure& s);
  void ReadCache(const Structure& s);
  void ReadMemoryArray(const Structure& s);
  void ReadMemoryDevice(const Structure& s);
  void ReadVendorDefined(const Structure& s);
};

}  // namespace panelglow
