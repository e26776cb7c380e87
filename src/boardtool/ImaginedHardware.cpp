#include "boardtool/ImaginedHardware.h"

#include <algorithm>
#include <array>

#include "platform/DriverRecords.h"

namespace panelglow::boardtool {

namespace {

namespace driver = platform::driver;
using Kind = HardwareAccess::Kind;

constexpr std::uint64_t kMapped = std::uint64_t{1} << 48U;  // where the memory of address 0 is mapped

// Configuration registers of a Super-I/O.
constexpr std::uint64_t kSelectDevice = 0x07;
constexpr std::uint64_t kGlobalControl = 0x02;
constexpr std::uint64_t kPartId = 0x20;
constexpr std::uint64_t kPartIdLow = 0x21;
constexpr std::uint64_t kActivate = 0x30;
constexpr std::uint64_t kFirstBase = 0x60;
constexpr std::uint64_t kLastBase = 0x65;
constexpr std::uint8_t kSomePart = 0x5A;
constexpr int kLastConfigPort = 0x3FF;
constexpr std::uint8_t kBasesBegin = 0x08;  // high byte of the base address of device 0

// Status ports of embedded controllers: ready to take a byte, and with one to give.
constexpr std::array<std::uint16_t, 3> kStatusPorts{0x64, 0x66, 0x6C};
constexpr std::uint8_t kReady = 0x01;

// Configuration space: base address registers, and where bridges keep bases of their own.
constexpr std::uint64_t kFirstBar = 0x10;
constexpr std::uint64_t kLastBarByte = 0x27;
constexpr std::uint64_t kBridgeRegisters = 0x40;
constexpr std::uint16_t kOnlyFunction = 0x00F8;  // bus 0, device 0x1F, function 0
constexpr std::uint8_t kDeviceNotFound = 0x86;

// Where an access begins, whether it reads or writes.
ImaginedHardware::Cell CellOf(const HardwareAccess& access) {
  const bool isMemory = access.kind == Kind::kMemoryRead || access.kind == Kind::kMemoryWrite;
  const bool isPci = access.kind == Kind::kPciRead || access.kind == Kind::kPciWrite;
  return {isMemory ? Kind::kMemoryWrite
          : isPci  ? Kind::kPciWrite
                   : Kind::kPortWrite,
          access.indexPort, access.logicalDevice,
          access.reg < 0 ? access.address : static_cast<std::uint64_t>(access.reg)};
}

}  // namespace

void ImaginedHardware::AddWait(std::uint32_t milliseconds) {
  if (milliseconds == 0) {
    return;
  }
  if (!accesses_.empty() && accesses_.back().kind == Kind::kWait) {
    accesses_.back().value += milliseconds;
    return;
  }
  HardwareAccess wait;
  wait.value = milliseconds;
  accesses_.push_back(std::move(wait));
}

void ImaginedHardware::AddFirmwareCall(const platform::ManagementCall& call) {
  HardwareAccess access;
  access.kind = Kind::kFirmwareCall;
  const auto number = [&](std::u16string_view property) -> std::uint64_t {
    const platform::ManagementValue* value = call.input.Find(property);
    const auto* scalar = value == nullptr ? nullptr : std::get_if<platform::ManagementScalar>(&value->content);
    const auto* word = scalar == nullptr ? nullptr : std::get_if<std::int32_t>(scalar);
    return word == nullptr ? 0 : static_cast<std::uint32_t>(*word);
  };
  access.address = number(u"Command");
  access.value = number(u"CommandType");
  if (const platform::ManagementValue* data = call.input.Find(u"tmbBData")) {
    if (const auto* array = std::get_if<platform::ManagementArray>(&data->content)) {
      for (const platform::ManagementScalar& element : *array) {
        const auto* byte = std::get_if<std::uint8_t>(&element);
        access.bytes.push_back(byte == nullptr ? std::uint8_t{0} : *byte);
      }
    }
  }
  accesses_.push_back(std::move(access));
}

// ---- bytes

std::optional<std::uint8_t> ImaginedHardware::MadeUp(const Cell& cell) const {
  if (cell.space == Kind::kPciWrite) {
    const std::uint64_t reg = cell.address & 0xFFFFU;
    if (reg >= kFirstBar && reg <= kLastBarByte) {  // memory at 0xFE0r0000
      return static_cast<std::uint8_t>((reg & 3U) == 3 ? 0xFE : (reg & 3U) == 2 ? reg & 0xFCU : 0);
    }
    if (reg >= kBridgeRegisters) {  // ports at 0xrr00
      return static_cast<std::uint8_t>((reg & 3U) == 1 ? reg : (reg & 3U) == 0 ? 1 : 0);
    }
    return std::nullopt;
  }
  if (cell.indexPort < 0 || cell.indexPort > kLastConfigPort) {
    return std::nullopt;
  }
  if (cell.address == kPartId || cell.address == kPartIdLow) {
    return kSomePart;
  }
  if (cell.address == kActivate) {
    return std::uint8_t{1};
  }
  if (cell.address >= kFirstBase && cell.address <= kLastBase) {
    const bool isHigh = (cell.address & 1U) == 0;
    const auto device = static_cast<std::uint8_t>(std::max(cell.logicalDevice, 0) & 0x1F);
    return static_cast<std::uint8_t>(isHigh ? kBasesBegin + device : (cell.address - kFirstBase) / 2 * 0x40);
  }
  return std::nullopt;
}

std::uint8_t ImaginedHardware::ReadByte(const Cell& cell) {
  if (cell.space == Kind::kPortWrite && cell.indexPort < 0 &&
      std::find(kStatusPorts.begin(), kStatusPorts.end(), cell.address) != kStatusPorts.end()) {
    return kReady;
  }
  const auto written = cells_.find(cell);
  if (written != cells_.end()) {
    return written->second;
  }
  return MadeUp(cell).value_or(background_);
}

std::map<ImaginedHardware::Cell, std::uint8_t> ImaginedHardware::Written() const {
  std::map<Cell, std::uint8_t> written;
  for (const auto& [cell, value] : cells_) {
    const bool steers = cell.indexPort >= 0 && (cell.address == kSelectDevice || cell.address == kGlobalControl);
    const bool isIndex =
        cell.indexPort < 0 && cell.space == Kind::kPortWrite &&
        std::any_of(cells_.begin(), cells_.end(), [&, port = cell.address](const auto& other) {
          return other.first.indexPort >= 0 && static_cast<std::uint64_t>(other.first.indexPort) == port;
        });
    if (!steers && !isIndex) {
      written.emplace(cell, value);
    }
  }
  return written;
}

std::uint32_t ImaginedHardware::Read(HardwareAccess access) {
  Cell cell = CellOf(access);
  repeats_ = lastRead_ == cell ? repeats_ + 1 : 0;
  lastRead_ = cell;
  std::uint32_t value = 0;
  for (unsigned i = 0; i < access.width; ++i, ++cell.address) {
    value |= std::uint32_t{ReadByte(cell)} << (8 * i);
  }
  if (repeats_ % 2 == 1) {  // who reads the same again waits for another value
    value = ~value & (access.width >= 4 ? ~0U : (1U << (8 * access.width)) - 1);
  }
  access.value = value;
  accesses_.push_back(std::move(access));
  return value;
}

void ImaginedHardware::Write(HardwareAccess access) {
  lastRead_.reset();
  Cell cell = CellOf(access);
  for (unsigned i = 0; i < access.width; ++i, ++cell.address) {
    cells_[cell] = static_cast<std::uint8_t>(access.value >> (8 * i));
  }
  accesses_.push_back(std::move(access));
}

// ---- requests

std::uint32_t ImaginedHardware::Control(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) {
  if (std::optional<HardwareAccess> access = DecodeRequest(code, in, {})) {
    tracker_.Follow(*access);
    switch (access->kind) {
      case Kind::kPortWrite:
        Write(std::move(*access));
        break;
      case Kind::kPciWrite:
        Write(std::move(*access));
        driver::PutNumber(out, driver::kPciStatus, 1, 0);
        break;
      case Kind::kPciRead:
        driver::PutNumber(out, driver::kPciValue, 4, Read(std::move(*access)));
        driver::PutNumber(out, driver::kPciStatus, 1, 0);
        break;
      case Kind::kMsrRead:
        accesses_.push_back(std::move(*access));
        std::fill(out.begin(), out.end(), static_cast<std::byte>(background_));
        break;
      default:
        driver::PutNumber(out, 0, 4, Read(std::move(*access)));
        break;
    }
    return 0;
  }
  switch (code) {
    case driver::kFindPciDevice:
    case driver::kFindPciClass: {  // the one function there is
      const bool isFound = driver::NumberAt(in, driver::kSearchIndex, 2) == 0;
      driver::PutNumber(out, driver::kSearchLocation, 2, isFound ? kOnlyFunction : 0);
      driver::PutNumber(out, driver::kSearchStatus, 1, isFound ? 0 : kDeviceNotFound);
      return 0;
    }
    case driver::kMapPhysicalMemory: {
      const bool isWide = in.size() >= driver::kMapSize64;
      const std::size_t word = isWide ? 8 : 4;
      driver::PutNumber(out, 2 * word, word, driver::NumberAt(in, 0, word) + (isWide ? kMapped : 0));
      return 0;
    }
    case driver::kUnmapPhysicalMemory:
    case driver::kGetVersion:
      return 0;
    default:
      std::fill(out.begin(), out.end(), std::byte{0});
      return 0;
  }
}

std::uint32_t ImaginedHardware::ReadMapped(std::uint64_t mapped, std::size_t width) {
  HardwareAccess access;
  access.kind = Kind::kMemoryRead;
  access.width = static_cast<unsigned>(width);
  access.address = mapped & (kMapped - 1);
  return Read(std::move(access));
}

void ImaginedHardware::WriteMapped(std::uint64_t mapped, std::size_t width, std::uint32_t value) {
  HardwareAccess access;
  access.kind = Kind::kMemoryWrite;
  access.width = static_cast<unsigned>(width);
  access.address = mapped & (kMapped - 1);
  access.value = width >= 4 ? value : value & 0xFFU;
  Write(std::move(access));
}

// ---- the driver's device

namespace {

class ImaginedDevice : public platform::DriverDevice {
 public:
  explicit ImaginedDevice(std::shared_ptr<ImaginedHardware> hardware) : hardware_(std::move(hardware)) {}
  std::uint32_t Control(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) override {
    return hardware_->Control(code, in, out);
  }
  std::uint32_t ReadMapped(std::uint64_t mapped, std::size_t width) override {
    return hardware_->ReadMapped(mapped, width);
  }
  void WriteMapped(std::uint64_t mapped, std::size_t width, std::uint32_t value) override {
    hardware_->WriteMapped(mapped, width, value);
  }

 private:
  std::shared_ptr<ImaginedHardware> hardware_;
};

}  // namespace

std::unique_ptr<platform::DriverDevice> ImaginedDrivers::Open(std::string_view /*linkName*/, std::uint32_t& error) {
  error = 0;
  return std::make_unique<ImaginedDevice>(hardware_);
}

}  // namespace panelglow::boardtool
