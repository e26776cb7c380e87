#include "boardtool/CapturedDrivers.h"

#include <algorithm>
#include <optional>
#include <utility>

namespace panelglow::boardtool {

struct CapturedDrivers::Log {
  void Add(const HardwareAccess& access) {
    const auto known = std::find_if(registers.begin(), registers.end(), [&](const CapturedRegister& other) {
      return other.access.kind == access.kind && other.access.address == access.address &&
             other.access.reg == access.reg && other.access.logicalDevice == access.logicalDevice;
    });
    if (known == registers.end()) {
      registers.push_back({access, 1});
    } else {
      known->access.value = access.value;
      ++known->reads;
    }
  }
  std::vector<CapturedRegister> registers;
  IndexTracker tracker;
};

namespace {

class CapturedDevice : public platform::DriverDevice {
 public:
  CapturedDevice(std::unique_ptr<platform::DriverDevice> device, std::shared_ptr<CapturedDrivers::Log> log)
      : device_(std::move(device)), log_(std::move(log)) {}

  std::uint32_t Control(std::uint32_t code, std::span<const std::byte> in, std::span<std::byte> out) override {
    std::optional<HardwareAccess> access = DecodeRequest(code, in, {});  // `out` may be the same memory
    std::optional<HardwareAccess> answered;
    const std::vector<std::byte> request(in.begin(), in.end());
    const std::uint32_t result = device_->Control(code, in, out);
    if (access) {
      if (IsRead(access->kind)) {
        answered = DecodeRequest(code, request, out);
        access->value = answered->value;
      }
      log_->tracker.Follow(*access);
      if (IsRead(access->kind) && result == 0) {
        log_->Add(*access);
      }
    }
    return result;
  }
  std::uint32_t ReadMapped(std::uint64_t mapped, std::size_t width) override {
    return device_->ReadMapped(mapped, width);
  }
  void WriteMapped(std::uint64_t mapped, std::size_t width, std::uint32_t value) override {
    device_->WriteMapped(mapped, width, value);
  }

 private:
  std::unique_ptr<platform::DriverDevice> device_;
  std::shared_ptr<CapturedDrivers::Log> log_;
};

}  // namespace

CapturedDrivers::CapturedDrivers(platform::DriverDevices& drivers)
    : drivers_(drivers), log_(std::make_shared<Log>()) {}

std::unique_ptr<platform::DriverDevice> CapturedDrivers::Open(std::string_view linkName, std::uint32_t& error) {
  std::unique_ptr<platform::DriverDevice> device = drivers_.Open(linkName, error);
  return device == nullptr ? nullptr : std::make_unique<CapturedDevice>(std::move(device), log_);
}

std::vector<CapturedRegister> CapturedDrivers::Take() { return std::exchange(log_->registers, {}); }

}  // namespace panelglow::boardtool
