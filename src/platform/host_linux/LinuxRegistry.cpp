#include "platform/host_linux/LinuxRegistry.h"

#include <charconv>
#include <cstring>
#include <iterator>
#include <optional>
#include <string>

#include "platform/AsciiCase.h"
#include "platform/host_linux/CurrentThread.h"
#include "platform/host_linux/StorageInventory.h"

namespace panelglow::platform::host_linux {

namespace {

constexpr std::uint32_t kErrorFileNotFound = 2;

class DriverKey : public RegistryKey {
 public:
  explicit DriverKey(std::string driver) : driver_(std::move(driver)) {}

  std::uint32_t Read(std::string_view value, std::span<char> room, std::size_t& size) override {
    CurrentThread::CheckEndRequest();
    if (!EqualNames(value, "Driver")) {
      return kErrorFileNotFound;
    }
    size = driver_.size() + 1;
    if (room.size() < size) {
      return kMoreData;
    }
    std::memcpy(room.data(), driver_.c_str(), size);
    return 0;
  }

 private:
  std::string driver_;
};

// The number of a port's key; nothing for any other key.
std::optional<std::size_t> PortOf(std::string_view path) {
  constexpr std::string_view kPort = "HARDWARE\\DEVICEMAP\\Scsi\\Scsi Port ";
  if (!EqualNames(path.substr(0, kPort.size()), kPort)) {
    return std::nullopt;
  }
  std::size_t port = 0;
  const char* const end = path.data() + path.size();
  const auto [last, error] = std::from_chars(path.data() + kPort.size(), end, port);
  return error == std::errc() && last == end ? std::optional(port) : std::nullopt;
}

}  // namespace

std::unique_ptr<RegistryKey> LinuxRegistry::OpenMachineKey(std::string_view path) {
  CurrentThread::CheckEndRequest();
  const std::optional<std::size_t> port = PortOf(path);
  if (!port) {
    return nullptr;
  }
  const PciInventory pci(folders_);
  const auto drivers = ScsiPortDrivers(folders_, pci);
  if (*port >= drivers.size()) {
    return nullptr;
  }
  return std::make_unique<DriverKey>(std::next(drivers.begin(), static_cast<std::ptrdiff_t>(*port))->second);
}

}  // namespace panelglow::platform::host_linux
