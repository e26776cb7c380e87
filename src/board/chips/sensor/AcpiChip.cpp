#include "board/chips/sensor/AcpiChip.h"

#include <numeric>

#include "board/base/IniReader.h"
#include "board/base/SelectedSystem.h"
#include "harness/base/CDMException.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "hw/PciDeviceList.h"
#include "hw/WMIDiscovery.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr int kNoSuchRegister = 990700;
constexpr unsigned kNoSuchRegisterMessage = 71;
constexpr std::uint32_t kErrorInvalidParameter = 87;  // what the driver answers for a register that is not there

constexpr unsigned kMaskBits = 64;

// Of an AMD processor n (from 0) the northbridge is device 0x18 + n of bus 0; its function 3 is "Miscellaneous
// Control".
constexpr std::uint16_t kAmd = 0x1022;
constexpr int kFirstNorthbridge = 0x18;
constexpr int kLastNorthbridge = 0x1F;
constexpr std::uint8_t kMiscellaneousControl = 3;
constexpr std::uint16_t kFirstWithSensor = 0x1103;  // has its sensor in another register than the later ones
constexpr std::uint16_t kThermtripStatus = 0xE4;    // of that one

// Runs the process on chosen processors, and as before when it goes.
class AffinityHold {
 public:
  AffinityHold() : before_(platform::TheHost().cpu.Affinity()) {}
  ~AffinityHold() {
    if (before_ != 0) {
      platform::TheHost().cpu.SetAffinity(before_);
    }
  }
  AffinityHold(const AffinityHold&) = delete;
  AffinityHold& operator=(const AffinityHold&) = delete;

  [[nodiscard]] std::vector<std::uint64_t> Cores() const {
    std::vector<std::uint64_t> masks;
    for (unsigned core = 0; core < kMaskBits; ++core) {
      if ((before_ >> core & 1U) != 0) {
        masks.push_back(std::uint64_t{1} << core);
      }
    }
    return masks;
  }

 private:
  std::uint64_t before_;
};

// Neither way of reading needs it; read so that the record of look-ups is whole.
void ReadTjMax(const std::string& prefix, std::uint32_t defaultValue) {
  ReadIniUnsigned(prefix + ".tjmax", defaultValue);
}

void Log(const std::string& text) { CDMout::LogMessage(LogOptions::Debug, kNote, text); }

}  // namespace

std::optional<AcpiChip::Source> AcpiChip::FindSource() {
  const SelectedSystem system = GetSelectedSystem();
  constexpr std::uint32_t kNoFamily = 0xFFFFFFFF;
  for (int n = 1;; ++n) {
    const std::string prefix = "test.tempcaution.processor." + CDMUtil::ToString(n);
    const std::string manufacturer = ReadIniValue(prefix + ".manufacturer", "");
    if (manufacturer.empty()) {
      return std::nullopt;
    }
    if (manufacturer != system.processorManufacturer ||
        ReadIniUnsigned(prefix + ".familyid", kNoFamily) != system.processorFamily) {
      continue;
    }
    const Setting mechanism = IniReader::Instance().ReadIniSetting(prefix + ".mechanism", "Mechanism not defined");
    if (mechanism.text == "msr") {
      ReadTjMax(prefix, 90);
      return Source{Mechanism::kModelRegisters, ReadIniUnsigned(prefix + ".maxtempreg", 0x1A2),
                    ReadIniUnsigned(prefix + ".tempprobereg", 0x19C)};
    }
    if (mechanism.text == "pci") {
      ReadTjMax(prefix, 0);
      return Source{Mechanism::kPciConfiguration, 0, ReadIniUnsigned(prefix + ".tempprobereg", 0xA4)};
    }
    TellOf(mechanism, "\"" + mechanism.text + "\" is no way to read a processor's temperature; it is msr or pci");
    return std::nullopt;
  }
}

// Bits 16 to 23 of a model-specific register.
std::optional<int> AcpiChip::ReadModelByte(std::uint32_t index) {
  std::uint64_t value = index;
  const std::uint32_t error = devio.ReadMsr(value);
  if (error == kErrorInvalidParameter) {
    CDMException missing(kNoSuchRegister);
    missing.addMessage(LogOptions::DeviceErrors, kNoSuchRegisterMessage, "");
    throw missing;
  }
  return error == 0 ? std::optional(static_cast<int>(value >> 16U & 0xFFU)) : std::nullopt;
}

bool AcpiChip::ReadThreshold(int /*zone*/, int& value) {
  const std::optional<Source> source = FindSource();
  if (!source || source->mechanism != Mechanism::kModelRegisters) {
    return false;
  }
  const std::optional<int> read = ReadModelByte(source->maxTemperatureRegister);
  value = read.value_or(value);
  return read.has_value();
}

bool AcpiChip::ReadProcessorTemperature(int zone, int& value, bool allCores, const std::string& /*zoneName*/) {
  coreTemperatures.clear();
  const std::optional<Source> source = FindSource();
  if (!source || zone < 0) {
    return false;
  }
  if (source->mechanism == Mechanism::kModelRegisters) {
    return ReadCores(*source, zone, value, allCores);
  }
  if (allCores) {
    Log("AMD processor detected, ignoring the Core temperature reading.");
  }
  return ReadNorthbridge(*source, zone, value);
}

// A machine whose management service does not count them has one.
std::size_t AcpiChip::CountProcessors() {
  if (!processors) {
    int rows = 0;
    try {
      rows = WMIDiscovery::Instance().RunQuery(u"SELECT * FROM Win32_PROCESSOR");
    } catch (const std::string&) {  // no management service
      rows = 0;
    }
    processors = rows > 0 ? static_cast<std::size_t>(rows) : 1;
  }
  return *processors;
}

// The cores of all processors are numbered in their order, an equal number each.
bool AcpiChip::ReadCores(const Source& source, int processor, int& value, bool allCores) {
  const AffinityHold affinity;
  const std::vector<std::uint64_t> cores = affinity.Cores();
  const std::size_t coresEach = cores.size() / CountProcessors();
  const std::size_t first = static_cast<std::size_t>(processor) * coresEach;
  if (coresEach == 0 || static_cast<std::size_t>(processor) >= CountProcessors()) {
    return false;
  }
  std::vector<int> readings;
  for (std::size_t core = 0; core < coresEach; ++core) {
    if (!platform::TheHost().cpu.SetAffinity(cores[first + core])) {
      return false;
    }
    const std::optional<int> highest = ReadModelByte(source.maxTemperatureRegister);
    const std::optional<int> below = ReadModelByte(source.probeRegister);
    if (!highest || !below) {
      return false;
    }
    readings.push_back(*highest - *below);
    if (allCores) {
      Log("Temperature for the processor :" + CDMUtil::ToString(processor) +
          " and core number :" + CDMUtil::ToString(core) + " is " + CDMUtil::ToString(readings.back()) + " ");
    }
  }
  value = readings.front();
  if (allCores) {
    value = std::accumulate(readings.begin(), readings.end(), 0) / static_cast<int>(readings.size());
    Log("Average Temperature for the processor number :" + CDMUtil::ToString(processor) + " is " +
        CDMUtil::ToString(value) + " ");
    coreTemperatures = readings;
  }
  return true;
}

bool AcpiChip::ReadNorthbridge(const Source& source, int processor, int& value) {
  if (processor > kLastNorthbridge - kFirstNorthbridge) {
    return false;
  }
  const std::vector<PciDevice>* list = nullptr;
  try {
    list = &PciDeviceList::Instance().Devices();
  } catch (int) {  // no inventory
    return false;
  }
  for (const PciDevice& device : *list) {
    if (device.vendorId == kAmd && device.bus == 0 && device.device == kFirstNorthbridge + processor &&
        device.function == kMiscellaneousControl) {
      const auto location =
          static_cast<std::uint16_t>(static_cast<unsigned>(device.device) << 3U | kMiscellaneousControl);
      const std::uint16_t reg =
          device.deviceId == kFirstWithSensor ? kThermtripStatus : static_cast<std::uint16_t>(source.probeRegister);
      std::uint32_t dword = 0;
      if (devio.ReadPciConfigDword(location, reg, dword) != 0) {
        return false;
      }
      value = static_cast<int>(dword >> 24U);
      return true;
    }
  }
  return false;
}

}  // namespace panelglow
