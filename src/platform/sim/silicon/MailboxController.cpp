#include "platform/sim/silicon/MailboxController.h"

#include <algorithm>
#include <cstdio>

namespace panelglow::platform::sim {

namespace {

constexpr std::uint8_t kCommand = 0x82;
constexpr std::uint8_t kAddressLow = 0x84;
constexpr std::uint8_t kAddressHigh = 0x85;
constexpr std::uint8_t kData = 0x86;

constexpr std::uint8_t kReadByte = 0x01;
constexpr std::uint8_t kWriteByte = 0x02;
constexpr std::uint8_t kSelectPage = 0x1D;

constexpr std::uint8_t kEnterKey = 0x55;
constexpr std::uint8_t kExitKey = 0xAA;

}  // namespace

MailboxController::MailboxController(const MailboxControllerSetup& setup, const Scheduler& time)
    : setup_(setup), time_(time), memory_(setup.memory), runtime_(setup.runtime) {
  for (const MailboxPin& pin : setup_.pins) {
    if (pin.port) {
      runtime_.try_emplace(*pin.port);
    } else {
      memory_.try_emplace(pin.address);
    }
    if (pin.muxAddress) {
      memory_.try_emplace(*pin.muxAddress);
    }
  }
}

// ---- the host's side

std::vector<AddressRange> MailboxController::PortRanges() const {
  std::vector<AddressRange> ranges{{setup_.indexPort, 2}};
  if (setup_.configurationPort != 0) {
    ranges.push_back({setup_.configurationPort, 2});
  }
  for (const auto& [port, value] : runtime_) {
    ranges.push_back({port, 1});
  }
  return ranges;
}

std::uint8_t MailboxController::ReadPort(std::uint16_t port) {
  Advance();
  if (port == setup_.indexPort) {
    return index_;
  }
  if (port == setup_.indexPort + 1) {
    return index_ == kData && IsBusy() ? kBusy : registers_[index_];
  }
  const auto runtime = runtime_.find(port);
  return runtime != runtime_.end() ? runtime->second : ReadConfiguration(port != setup_.configurationPort);
}

void MailboxController::WritePort(std::uint16_t port, std::uint8_t value) {
  Advance();
  if (port == setup_.indexPort) {
    index_ = value;
  } else if (port == setup_.indexPort + 1) {
    if (!IsBusy()) {
      registers_[index_] = value;
      written_ = index_;
      stepEnd_ = time_.Now() + setup_.step_us;
    }
  } else if (const auto runtime = runtime_.find(port); runtime != runtime_.end()) {
    runtime->second = value;
  } else {
    WriteConfiguration(port != setup_.configurationPort, value);
  }
}

std::uint8_t MailboxController::ReadConfiguration(bool data) {
  if (!configuring_) {
    return 0xFF;
  }
  if (!data) {
    return configurationIndex_;
  }
  const auto found = setup_.configuration.find(configurationIndex_);
  return found == setup_.configuration.end() ? std::uint8_t{0} : found->second;
}

void MailboxController::WriteConfiguration(bool data, std::uint8_t value) {
  if (data) {
    return;  // nothing that drives a pin is set there
  }
  if (!configuring_) {
    configuring_ = value == kEnterKey;
  } else if (value == kExitKey) {
    configuring_ = false;
  } else {
    configurationIndex_ = value;
  }
}

// ---- the firmware's side

std::optional<Microseconds> MailboxController::NextEvent() const {
  return setup_.fault == MailboxControllerSetup::Fault::kStuckBusy ? std::nullopt : stepEnd_;
}

void MailboxController::Advance() {
  if (NextEvent() && time_.Now() >= *stepEnd_) {
    stepEnd_.reset();
    EndStep();
  }
}

std::uint16_t MailboxController::Address() const {
  return static_cast<std::uint16_t>(registers_[kAddressHigh] << 8U | registers_[kAddressLow]);
}

void MailboxController::EndStep() {
  if (written_ != kCommand) {
    return;
  }
  const std::uint32_t address = static_cast<std::uint32_t>(page_) << 16U | Address();
  switch (registers_[kCommand]) {
    case kSelectPage:
      page_ = Address();
      break;
    case kReadByte: {
      const auto found = memory_.find(address);
      registers_[kData] = found == memory_.end() ? std::uint8_t{0} : found->second;
      break;
    }
    case kWriteByte:
      memory_[address] = registers_[kData];
      break;
    default:
      break;
  }
}

// ---- what it drives

std::optional<bool> MailboxController::Signal(std::string_view pin) const {
  const auto found =
      std::find_if(setup_.pins.begin(), setup_.pins.end(), [&](const MailboxPin& p) { return p.name == pin; });
  if (found == setup_.pins.end()) {
    return std::nullopt;
  }
  if (found->muxAddress && (memory_.at(*found->muxAddress) & found->muxMask) != found->muxValue) {
    return found->otherwise;
  }
  const std::uint8_t value = found->port ? runtime_.at(*found->port) : memory_.at(found->address);
  return ((value >> found->bit) & 1U) != 0;
}

std::optional<std::uint64_t> MailboxController::RegisterOf(std::string_view pin) const {
  for (const MailboxPin& described : setup_.pins) {
    if (described.name == pin && described.port) {
      return *described.port;
    }
  }
  return setup_.indexPort + 1U;
}

std::string MailboxController::State() const {
  std::string text = "mailbox configuration mode = ";
  text += configuring_ ? "open\n" : "closed\n";
  text += "mailbox memory =";
  char part[32];
  for (const auto& [address, value] : memory_) {
    std::snprintf(part, sizeof part, " %08X:%02X", static_cast<unsigned>(address), value);
    text += part;
  }
  text += "\nmailbox ports =";
  for (const auto& [port, value] : runtime_) {
    std::snprintf(part, sizeof part, " %04X:%02X", port, value);
    text += part;
  }
  return text + "\n";
}

}  // namespace panelglow::platform::sim
