#include "platform/sim/silicon/SmbusHost.h"

#include <algorithm>
#include <cstdio>

#include "platform/sim/silicon/LedPins.h"
#include "platform/sim/silicon/RegisterBanks.h"

namespace panelglow::platform::sim {

namespace {

enum Offset : std::uint16_t { kProtocol, kStatus, kAddress, kCommand, kData };

constexpr std::uint8_t kWriteByte = 6;
constexpr std::uint8_t kReadByte = 7;

constexpr std::uint8_t kDone = 0x80;
constexpr std::uint8_t kBusy = 0x1A;
constexpr std::uint8_t kNoDevice = 0x10;
constexpr std::uint8_t kNoCommand = 0x12;
constexpr std::uint8_t kNoProtocol = 0x17;

// Of a device's lamps.
LedFieldReader ReaderOf(const SmbusDevice& device) {
  return [&device](const SuperIoField& field) {
    const auto found = device.registers.find(field.address);
    return static_cast<std::uint8_t>(found == device.registers.end() ? 0 : found->second & field.mask);
  };
}

}  // namespace

SmbusHost::SmbusHost(const SmbusHostSetup& setup, const Scheduler& time) : setup_(setup), time_(time) {}

// ---- the host

std::uint8_t SmbusHost::ReadPort(std::uint16_t port) {
  Advance();
  switch (port - setup_.base) {
    case kStatus:
      return status_;
    case kAddress:
      return address_;
    case kCommand:
      return command_;
    case kData:
      return data_;
    default:
      if (end_) {
        return protocol_;
      }
      status_ = 0;
      return 0;
  }
}

void SmbusHost::WritePort(std::uint16_t port, std::uint8_t value) {
  Advance();
  if (end_) {
    return;
  }
  switch (port - setup_.base) {
    case kProtocol:
      protocol_ = value;
      status_ = kBusy;
      end_ = time_.Now() + setup_.transfer_us;
      break;
    case kAddress:
      address_ = value;
      break;
    case kCommand:
      command_ = value;
      break;
    case kData:
      data_ = value;
      break;
    default:
      break;
  }
}

void SmbusHost::Advance() {
  if (const std::optional<Microseconds> end = UnderWayUntil(); end && time_.Now() >= *end) {
    end_.reset();
    Transfer();
  }
}

void SmbusHost::Transfer() {
  if (protocol_ != kReadByte && protocol_ != kWriteByte) {
    status_ = kNoProtocol;
    return;
  }
  const auto device = setup_.devices.find(static_cast<std::uint8_t>(address_ >> 1U));
  if (device == setup_.devices.end()) {
    status_ = kNoDevice;
    return;
  }
  const auto found = device->second.registers.find(command_);
  if (found == device->second.registers.end()) {
    status_ = kNoCommand;
    return;
  }
  if (protocol_ == kReadByte) {
    data_ = found->second;
  } else if (device->second.readOnly.count(command_) == 0) {
    found->second = data_;
  }
  status_ = kDone;
}

// ---- the devices

std::optional<Microseconds> SmbusHost::UnderWayUntil() const {
  return setup_.fault == SmbusHostSetup::Fault::kStuckBusy ? std::nullopt : end_;
}

std::optional<Microseconds> SmbusHost::NextEvent() const {
  std::optional<Microseconds> next = UnderWayUntil();
  for (const auto& [address, device] : setup_.devices) {
    if (const auto edge = NextLedEdge(device.lamps, ReaderOf(device), time_.Now())) {
      next = std::min(next.value_or(*edge), *edge);
    }
  }
  return next;
}

std::optional<bool> SmbusHost::Signal(std::string_view pin) const {
  for (const auto& [address, device] : setup_.devices) {
    for (const SuperIoLed& lamp : device.lamps) {
      if (lamp.name == pin) {
        return LedLevel(lamp, ReaderOf(device), time_.Now());
      }
    }
  }
  return std::nullopt;
}

std::string SmbusHost::State() const {
  std::string text;
  for (const auto& [address, device] : setup_.devices) {
    char name[32];
    std::snprintf(name, sizeof name, "smbus device %02X", address);
    text += RegisterRow(name, device.registers);
  }
  return text;
}

}  // namespace panelglow::platform::sim
