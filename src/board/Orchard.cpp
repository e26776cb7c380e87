#include "board/Orchard.h"

#include <array>
#include <iomanip>
#include <optional>
#include <sstream>
#include <utility>

#include "board/chips/southbridge/DashController.h"
#include "harness/base/CDMout.h"

namespace panelglow {

namespace {

constexpr std::uint16_t kIndexPort = 0x2E;
constexpr PowerButtonPorts kPowerButton{.control = 0x458, .enable = 0xF802, .status = 0xF801};

constexpr std::uint16_t kLedPort = 0x420;
constexpr std::uint8_t kGreen = 0x40;
constexpr std::uint8_t kRed = 0x10;
constexpr std::uint8_t kDark = 0x00;

// Super-I/O registers: pin multiplexer, logical device, and of that device the line that is set up and how.
constexpr std::uint8_t kPinMultiplexer = 0x25;
constexpr std::uint8_t kPinsAreGpio = 0x58;
constexpr std::uint8_t kPinsAtStart = 0x40;
constexpr std::array<std::pair<std::uint8_t, std::uint8_t>, 6> kGpioSetUp{
    {{kPinMultiplexer, kPinsAreGpio}, {0x07, 0x07}, {0xF0, 0x04}, {0xF1, 0x03}, {0xF0, 0x06}, {0xF1, 0x03}}};

// Hardware monitor: what starts it, a mode a fan, ramps.
constexpr std::int64_t kFanDivisor = 5'400'000;
constexpr RegisterId kStart{0, 0x40};
constexpr std::array<RegisterId, 3> kFanModes{{{0, 0x5C}, {0, 0x5D}, {0, 0x5E}}};
constexpr std::uint8_t kManual = 0xE0;
constexpr RegisterId kRamp1{0, 0x62};
constexpr RegisterId kRamp2{0, 0x63};

FanTable Fans() {
  return {
      .duties = RegisterRun(0, 0x30, 3),
      .fullSpeed = 0xFF,
      .saved = {kStart, {0, 0x30}, {0, 0x31}, {0, 0x32}, kFanModes[0], kFanModes[1], kFanModes[2], kRamp1, kRamp2},
      .manual = {FromSaved(kStart, 0xFD, 0x01), FromSaved(kFanModes[0], 0xFF, kManual),
                 FromSaved(kFanModes[1], 0xFF, kManual), FromSaved(kFanModes[2], 0xFF, kManual),
                 FromSaved(kRamp1, 0xF0, 0), Put(kRamp2, 0)}};
}

constexpr const char* kNicName = "Broadcom NetXtreme Gigabit Ethernet";

void Log(const std::string& text) { CDMout::LogMessage(LogOptions::Debug, kFreeText, text); }

// A number as the log has it: "0x" and at least so many upper-case digits.
std::string Hex(std::uint64_t number, std::size_t digits) {
  std::ostringstream text;
  text << "0x" << std::hex << std::uppercase << std::setfill('0') << std::setw(static_cast<int>(digits)) << number;
  return text.str();
}

class DashLog : public DashWatcher {
 public:
  void Read(std::uint64_t address, std::uint32_t value, std::uint32_t bytes) override {
    Log("----NIC Read  addr=" + Hex(address, 8) + ", 32bit data=" + Hex(value, 8) +
        ", Bytes=" + std::to_string(bytes));
  }
  void Write(std::uint64_t address, std::uint32_t value) override {
    Log("----NIC WRITE addr=" + Hex(address, 8) + ", 32bit data=" + Hex(value, 8));
  }
  void See(bool isHigh, bool follows) override {
    const std::string level = isHigh ? "de-asserted (high)" : "asserted (low)";
    Log(follows ? "----Detected NIC Dash Cable is " + level
                : "----Failed to detect NIC Dash Cable is " + level + "!");
  }
};

}  // namespace

Orchard::Orchard(std::uint16_t boardId)
    : OldestBoard("Orchard", boardId,
                  {.indexPort = kIndexPort, .fanLatched = true, .fanDivisor = kFanDivisor, .fans = Fans()}),
      button(devio, kPowerButton) {}

// ---- devices

bool Orchard::DetectLegacyDevice(LegacyDevice device, bool& present) {
  return device == LegacyDevice::kNicDashCable
             ? DetectNicDashCable(Settings().lines[static_cast<std::size_t>(device)], present)
             : OldestBoard::DetectLegacyDevice(device, present);
}

bool Orchard::DetectNicDashCable(int line, bool& present) {
  Log("----Entered Orchard DetectNICDashCableInstalled()");
  if (line == LegacySettings::kNoLine) {
    Log("----INI file has detection disabled (-1)");
    return false;
  }
  std::optional<DashController> controller;
  std::uint16_t location = 0;
  if (devio.FindPciDeviceByName(DashController::kNetworkClass, kNicName, 0, location)) {
    Log("----[" + std::string(kNicName) + "] NIC PCI address = " + Hex(location, 4));
    controller = DashController::At(devio, location);
  }
  if (!controller) {
    Log("----DID NOT GET NIC BAR SUCCESSFULLY!");
    return false;
  }
  Log("----Got NIC PCI BAR1 = " + Hex(controller->Base(), 8));
  DashLog log;
  bool isLine = true;
  const std::optional<bool> follows = controller->LineFollows(
      [&] {
        const int state = ReadGpioLine(line);
        isLine = state != kNoSuchLineState;
        return state;
      },
      log);
  if (!isLine) {
    TellOfLine();
  }
  if (!follows) {
    return false;  // the log has how far it came
  }
  present = *follows;
  Log(present ? "----Reporting NIC Dash Cable is installed." : "----Reporting NIC Dash Cable is NOT installed!");
  return true;
}

// ---- power LED

bool Orchard::SavePowerLedState() {
  isSaved = true;
  for (const auto& [reg, value] : kGpioSetUp) {
    superIo.Write(reg, value);
  }
  return true;
}

bool Orchard::Light(std::uint8_t lines) {
  devio.OutportByte(kLedPort, lines);
  return true;
}

bool Orchard::AssertPowerLedGreen() { return Light(kGreen); }
bool Orchard::AssertPowerLedRed() { return Light(kRed); }
bool Orchard::DeassertPowerLed() { return Light(kDark); }

bool Orchard::RestorePowerLedState() {
  if (!isSaved) {
    return true;
  }
  Light(kGreen);
  superIo.Write(kPinMultiplexer, kPinsAtStart);
  isSaved = false;  // last: a restore that is interrupted is done again
  return true;
}

bool Orchard::SavePowerButton() {
  button.Save();
  return true;
}
bool Orchard::RestorePowerButton() {
  button.Restore();
  return true;
}
bool Orchard::ArmPowerButton() {
  button.Arm();
  return true;
}
bool Orchard::IsPowerButtonPressed(bool& pressed) {
  pressed = button.IsPressed();
  return true;
}

}  // namespace panelglow
