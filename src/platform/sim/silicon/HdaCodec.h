// An HD Audio controller with one codec behind its immediate command registers; the codec's GPIO pins drive lamps.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "platform/sim/base/Scheduler.h"
#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

struct HdaCodecSetup {
  enum class Fault {
    kNone,
    kStuckBusy,  // no command ever comes to its end
  };

  std::uint64_t base = 0;         // the controller's memory, as in its base address register
  std::uint8_t codecAddress = 0;  // on the link
  std::uint8_t pins = 4;          // GPIO pins of the codec
  std::uint8_t data = 0;          // at power-on
  std::uint8_t enable = 0;
  std::uint8_t direction = 0;  // bit set: output
  std::uint8_t inputs = 0xFF;  // level of the pins that the codec does not drive: resistors pull them high
  Fault fault = Fault::kNone;
};

/// Controller registers: 0x60 immediate command (32 bits), 0x64 immediate response (32 bits), 0x68 immediate command
/// status (16 bits): bit 0 is set to send the command and stays set until the link has carried it, bit 1 says that a
/// response stands there and is cleared by writing it as 1. A command is taken when the start bit is set, from what
/// the command register holds then; while one is under way another start does nothing. The response of a command
/// replaces the one before whether that was cleared or not.
///
/// A command is the codec's address in bits 31 to 28, the node in 27 to 20, a verb in 19 to 8, its payload in 7 to 0.
/// The GPIO registers belong to node 1, the audio function group: data (set 0x715, get 0xF15), enable mask (0x716,
/// 0xF16), direction (0x717, 0xF17). Nothing answers a command for a codec that is not there.
///
/// Pins: "gpio<number>", the level: of an output that is enabled its data bit, of any other the outside level.
class HdaCodec : public Device {
 public:
  HdaCodec(const HdaCodecSetup& setup, const Scheduler& time);

  [[nodiscard]] std::vector<AddressRange> MemoryRanges() const override { return {{setup_.base, kSize}}; }
  std::uint8_t ReadMemory(std::uint64_t address) override;
  void WriteMemory(std::uint64_t address, std::uint8_t value) override;

  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<Microseconds> NextEvent() const override;
  [[nodiscard]] std::optional<Microseconds> UnderWayUntil() const override { return NextEvent(); }
  void Advance() override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  [[nodiscard]] std::string State() const override;

 private:
  static constexpr std::uint64_t kSize = 0x4000;

  void Carry(std::uint32_t command);
  [[nodiscard]] std::uint32_t Respond(unsigned node, unsigned verb, std::uint8_t payload);
  [[nodiscard]] std::uint8_t Levels() const;
  [[nodiscard]] std::uint8_t AllPins() const { return static_cast<std::uint8_t>((1U << setup_.pins) - 1); }

  HdaCodecSetup setup_;
  const Scheduler& time_;
  std::uint32_t command_ = 0;
  std::uint32_t response_ = 0;
  bool valid_ = false;
  std::uint32_t carried_ = 0;
  std::optional<Microseconds> carriedAt_;  // end of the command under way

  std::uint8_t data_;
  std::uint8_t enable_;
  std::uint8_t direction_;
};

}  // namespace panelglow::platform::sim
