#include "platform/sim/silicon/HdaCodec.h"

#include <cstdio>

#include "platform/sim/silicon/GpioBlock.h"

namespace panelglow::platform::sim {

namespace {

constexpr std::uint64_t kCommand = 0x60;
constexpr std::uint64_t kResponse = 0x64;
constexpr std::uint64_t kStatus = 0x68;

constexpr std::uint8_t kBusy = 0x01;
constexpr std::uint8_t kValid = 0x02;

// Out in one frame of the link, back in the next; and the wait for the first one to begin.
constexpr Microseconds kThreeFrames_us = 63;

constexpr unsigned kFunctionGroup = 1;
constexpr unsigned kSetData = 0x715;
constexpr unsigned kSetEnable = 0x716;
constexpr unsigned kSetDirection = 0x717;
constexpr unsigned kGet = 0x800;  // the get verb of a set verb
constexpr unsigned kGetParameter = 0xF00;
constexpr std::uint8_t kGpioCapabilities = 0x11;

std::uint8_t ByteOf(std::uint32_t value, std::uint64_t number) {
  return static_cast<std::uint8_t>(value >> (8 * number));
}

}  // namespace

HdaCodec::HdaCodec(const HdaCodecSetup& setup, const Scheduler& time)
    : setup_(setup), time_(time), data_(setup.data), enable_(setup.enable), direction_(setup.direction) {}

// ---- the controller

std::uint8_t HdaCodec::ReadMemory(std::uint64_t address) {
  Advance();
  const std::uint64_t offset = address - setup_.base;
  if (offset >= kCommand && offset < kCommand + 4) {
    return ByteOf(command_, offset - kCommand);
  }
  if (offset >= kResponse && offset < kResponse + 4) {
    return ByteOf(response_, offset - kResponse);
  }
  if (offset == kStatus) {
    return static_cast<std::uint8_t>((carriedAt_ ? kBusy : 0U) | (valid_ ? kValid : 0U));
  }
  return 0;
}

void HdaCodec::WriteMemory(std::uint64_t address, std::uint8_t value) {
  Advance();
  const std::uint64_t offset = address - setup_.base;
  if (offset >= kCommand && offset < kCommand + 4) {
    const unsigned shift = static_cast<unsigned>(8 * (offset - kCommand));
    command_ = (command_ & ~(0xFFU << shift)) | static_cast<std::uint32_t>(value) << shift;
    return;
  }
  if (offset != kStatus) {
    return;
  }
  if ((value & kValid) != 0) {
    valid_ = false;
  }
  if ((value & kBusy) != 0 && !carriedAt_) {
    carried_ = command_;
    carriedAt_ = time_.Now() + kThreeFrames_us;
  }
}

std::optional<Microseconds> HdaCodec::NextEvent() const {
  return setup_.fault == HdaCodecSetup::Fault::kStuckBusy ? std::nullopt : carriedAt_;
}

void HdaCodec::Advance() {
  if (NextEvent() && time_.Now() >= *carriedAt_) {
    carriedAt_.reset();
    Carry(carried_);
  }
}

// ---- the link and the codec

void HdaCodec::Carry(std::uint32_t command) {
  if ((command >> 28U) != setup_.codecAddress) {
    return;
  }
  response_ = Respond((command >> 20U) & 0xFFU, (command >> 8U) & 0xFFFU, ByteOf(command, 0));
  valid_ = true;
}

std::uint32_t HdaCodec::Respond(unsigned node, unsigned verb, std::uint8_t payload) {
  if (node != kFunctionGroup) {
    return 0;
  }
  const auto bits = static_cast<std::uint8_t>(payload & AllPins());
  switch (verb) {
    case kSetData:
      data_ = bits;
      return 0;
    case kSetEnable:
      enable_ = bits;
      return 0;
    case kSetDirection:
      direction_ = bits;
      return 0;
    case kSetData | kGet:
      return (Levels() & ~unsigned{direction_} & enable_) | (data_ & direction_);
    case kSetEnable | kGet:
      return enable_;
    case kSetDirection | kGet:
      return direction_;
    case kGetParameter:
      return payload == kGpioCapabilities ? setup_.pins : 0U;
    default:
      return 0;
  }
}

std::uint8_t HdaCodec::Levels() const {
  const unsigned driven = enable_ & direction_;
  return static_cast<std::uint8_t>(((data_ & driven) | (setup_.inputs & ~driven)) & AllPins());
}

std::optional<bool> HdaCodec::Signal(std::string_view pin) const {
  if (pin.substr(0, 4) != "gpio") {
    return std::nullopt;
  }
  const std::optional<unsigned> number = PinNumber(pin.substr(4));
  return number && *number < setup_.pins ? std::optional<bool>(((Levels() >> *number) & 1U) != 0) : std::nullopt;
}

std::optional<std::uint64_t> HdaCodec::RegisterOf(std::string_view /*pin*/) const { return setup_.base + kStatus; }

std::string HdaCodec::State() const {
  char text[96];
  std::snprintf(text, sizeof text, "codec gpio data = %02X\ncodec gpio enable = %02X\ncodec gpio direction = %02X\n",
                data_, enable_, direction_);
  return text;
}

}  // namespace panelglow::platform::sim
