#include "board/chips/generic/GIoSpaceChip.h"

#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint32_t kSettle_ms = 30;  // after each entry

void Settle() { platform::TheHost().clock.Sleep(kSettle_ms); }

}  // namespace

// A sequence's address is a port number: the low 16 bits of it, for the I/O space has no more.

// The latch is cleared first; what the pin register then shows is what the other pins carry.
std::uint8_t GIoSpaceChip::ReadPins(std::uint16_t port) {
  devio.OutportByte(port, 0);
  return devio.InportByte(static_cast<std::uint16_t>(port + 1));
}

void GIoSpaceChip::SetEntry(std::uint32_t address, std::uint8_t mask) {
  const auto port = static_cast<std::uint16_t>(address);
  const std::uint8_t value = ReadPins(port);
  devio.OutportByte(port, value | mask);
  Settle();
}

void GIoSpaceChip::KeepEntry(std::uint32_t address, std::uint8_t mask) {
  const auto port = static_cast<std::uint16_t>(address);
  const std::uint8_t value = ReadPins(port);
  devio.OutportByte(port, value & mask);
  Settle();
}

void GIoSpaceChip::FlipEntry(std::uint32_t address, std::uint8_t mask) {
  const auto port = static_cast<std::uint16_t>(address);
  devio.OutportByte(port, devio.InportByte(port) ^ mask);
  Settle();
}

std::uint8_t GIoSpaceChip::ReadRegisterByte(std::uint32_t address) {
  return devio.InportByte(static_cast<std::uint16_t>(address));
}

void GIoSpaceChip::WriteRegisterByte(std::uint32_t address, std::uint8_t value) {
  devio.OutportByte(static_cast<std::uint16_t>(address), value);
}

}  // namespace panelglow
