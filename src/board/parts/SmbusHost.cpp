#include "board/parts/SmbusHost.h"

#include "platform/Host.h"

namespace panelglow {

namespace {

// Offsets from the base.
constexpr std::uint16_t kControl = 0;  // starts a transaction; reading it clears the status
constexpr std::uint16_t kStatus = 1;
constexpr std::uint16_t kAddress = 2;
constexpr std::uint16_t kCommand = 3;
constexpr std::uint16_t kData = 4;

constexpr std::uint8_t kWriteByte = 6;  // transactions
constexpr std::uint8_t kReadByte = 7;
constexpr std::uint8_t kUnderWay = 0x1A;  // status
constexpr std::uint8_t kDone = 0x80;      // bit of the status
constexpr int kMostLooks = 5;
constexpr std::uint32_t kBetweenLooks_ms = 20;

}  // namespace

void SmbusHost::Out(std::uint16_t offset, std::uint8_t value) const {
  devio->OutportByte(static_cast<std::uint16_t>(base + offset), value);
}

std::uint8_t SmbusHost::In(std::uint16_t offset) const {
  return devio->InportByte(static_cast<std::uint16_t>(base + offset));
}

std::uint8_t SmbusHost::AwaitEnd() const {
  std::uint8_t status = kUnderWay;
  for (int look = 0; look < kMostLooks && status == kUnderWay; ++look) {
    platform::TheHost().clock.Sleep(kBetweenLooks_ms);
    status = In(kStatus);
  }
  return status;
}

std::optional<std::uint8_t> SmbusHost::ReadByte(std::uint8_t address, std::uint8_t command) const {
  Out(kAddress, address);
  Out(kCommand, command);
  Out(kControl, kReadByte);
  const std::uint8_t status = AwaitEnd();
  const std::uint8_t value = In(kData);
  In(kControl);
  return (status & kDone) != 0 ? std::optional(value) : std::nullopt;
}

bool SmbusHost::WriteByte(std::uint8_t address, std::uint8_t command, std::uint8_t value) const {
  Out(kAddress, address);
  Out(kCommand, command);
  Out(kData, value);
  Out(kControl, kWriteByte);
  return (AwaitEnd() & kDone) != 0;
}

}  // namespace panelglow
