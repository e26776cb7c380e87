// The firmware's own call interface, as the management service passes it on: radios, fans and temperatures behind
// numbered commands with signed records.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "platform/Management.h"
#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

struct FirmwareCallSetup {
  enum class Fault {
    kNone,
    kWrongSignature,  // answers are not signed as good ones
    kShortData,       // answers hold one byte only
    kStaleRecord,     // behind what they say, answers hold bytes of an earlier one
    kFailingStep,     // a step of the call fails in the management service
  };

  struct Radio {
    std::uint8_t number = 0;  // by which it is switched; 0xFF stands for all of them
    std::uint8_t offset = 0;  // of its state in the wireless record
    bool on = true;
  };

  struct Fan {
    std::uint8_t speed = 0;  // in units of the platform, 0: stands still
    std::uint8_t duty = 0;
  };

  std::string path = R"(tmbBIntM.InstanceName="ACPI\PNP0C14\0_0")";
  std::vector<std::uint8_t> header{1,
                                   0};  // the first two bytes of the wireless record, to be given back with a write
  std::vector<Radio> radios;
  std::vector<Fan> fans;
  std::vector<std::uint8_t> temperatures;  // in degrees Celsius
  Fault fault = Fault::kNone;
  ManagementCallStep failingStep = ManagementCallStep::kNone;
};

/// The caller signs its record "SECU" and says how long it is; a record that does not fit is answered without the
/// signature "PASS", and changes nothing. The method names the size of the answer.
///
/// Command type 0x1B, wireless: command 1 reads 128 bytes, the header and at each radio's offset its state (bit 0: it
/// is on; bit 1: software allows it; bits 2 and 3: the firmware and the switch on the case allow it). Command 2 with
/// the header's two bytes, a radio's number and 0 or 1 switches the radio.
///
/// Command type 0x28, thermal: command 1 reads, first input byte 3: speeds of the fans, 0 or 1: temperatures, 0x23:
/// duties; byte 0 of the answer is the count, the byte at n + 1 belongs to item n. Command 2 with a record of the
/// form 0x23, count, duties sets the duties.
///
/// Pins: "radio", lit while any radio is on, as the lamp on the case.
class FirmwareCall : public Device {
 public:
  explicit FirmwareCall(const FirmwareCallSetup& setup) : setup_(setup) {}

  /// The one row of the class, with its path.
  [[nodiscard]] ManagementRow Instance() const;
  [[nodiscard]] ManagementCallResult Call(const ManagementCall& call);

  /// From now on orders are answered as ever and change nothing.
  void IgnoreOrders() { ignoresOrders_ = true; }
  /// From now on no call reaches the firmware.
  void GoAway() { isGone_ = true; }

  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::string State() const override;

 private:
  using Bytes = std::vector<std::uint8_t>;

  /// The answer of a good call; nothing for one that the firmware refuses.
  [[nodiscard]] std::optional<Bytes> Answer(std::uint32_t command, std::uint32_t type, const Bytes& input);
  [[nodiscard]] std::optional<Bytes> AnswerWireless(std::uint32_t command, const Bytes& input);
  [[nodiscard]] std::optional<Bytes> AnswerThermal(std::uint32_t command, const Bytes& input);

  FirmwareCallSetup setup_;
  bool ignoresOrders_ = false;
  bool isGone_ = false;
};

}  // namespace panelglow::platform::sim
