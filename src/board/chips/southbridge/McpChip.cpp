#include "board/chips/southbridge/McpChip.h"

#include "board/base/IniReader.h"
#include "board/parts/ClearedLatch.h"
#include "board/parts/ConfigMode.h"
#include "board/parts/SavedRegisters.h"

namespace panelglow {

namespace {

// Power management block, offsets from the base.
constexpr unsigned kButtonStatus = 1;  // cleared by writing its bit
constexpr std::uint8_t kPressed = 0x01;
constexpr unsigned kButtonEnable = 2;  // word
constexpr unsigned kInputs = 0x400;    // how inputs are latched
constexpr unsigned kLines = 0x4C0;     // a byte for each line

// Of a line's byte.
constexpr std::uint8_t kOtherFunction = 0x0C;
constexpr std::uint8_t kLineIsHigh = 0x20;

constexpr int kLastLine = 63;
constexpr int kLatchLine = 238;
constexpr RegisterId kLatchStatus{0, 0x44};  // from kInputs on
constexpr std::uint8_t kLatched = 0x04;
constexpr RegisterId kLatchControl{0, 0x49};
constexpr std::uint8_t kLatchMode = 0x03;
constexpr std::uint8_t kLatchOnLevel = 0x01;
constexpr std::uint32_t kLatchSettle_ms = 100;

// The latch follows the switch; for the life of a ConfigMode.
class OpenLatch {
 public:
  explicit OpenLatch(RegisterFile& inputs) : file(inputs) {}

  void EnterConfigMode() {
    saved.Keep(file, kLatchControl);
    file.Write(kLatchControl, static_cast<std::uint8_t>((saved.At(kLatchControl) & ~kLatchMode) | kLatchOnLevel));
  }
  void ExitConfigMode() { saved.Restore(file, {&kLatchControl, 1}); }

 private:
  RegisterFile& file;
  SavedRegisters saved;
};

}  // namespace

McpChip::McpChip() : Chip("mcp"), pmbar(ReadIniWord("chip.mcp.pmbar", 0x2000)), inputs(devio, PortOf(kInputs)) {}

int McpChip::ReadLatch() {
  OpenLatch latch(inputs);
  const ConfigMode mode(latch);
  return LineState(ReadClearedLatch(inputs, kLatchStatus, kLatched, kLatchSettle_ms));
}

int McpChip::ReadLine(int line) {
  if (line == kLatchLine) {
    return ReadLatch();
  }
  if (line < 0 || line > kLastLine) {
    return kNoSuchLine;
  }
  const std::uint8_t status = devio.InportByte(PortOf(kLines + static_cast<unsigned>(line)));
  return (status & kOtherFunction) != 0 ? kNoSuchLine : LineState((status & kLineIsHigh) != 0);
}

// ---- power button

bool McpChip::SavePowerButtonState() {
  if (!savedEnable) {
    savedEnable = devio.InportWord(PortOf(kButtonEnable));
  }
  return true;
}

bool McpChip::ArmPowerButton() {
  SavePowerButtonState();
  devio.OutportWord(PortOf(kButtonEnable), 0);
  return true;
}

bool McpChip::IsPowerButtonPressed(bool& pressed) {
  pressed = (devio.InportByte(PortOf(kButtonStatus)) & kPressed) != 0;
  return true;
}

bool McpChip::RestorePowerButtonState() {
  if (savedEnable) {
    devio.OutportByte(PortOf(kButtonStatus), kPressed);
    devio.OutportWord(PortOf(kButtonEnable), *savedEnable);
    savedEnable.reset();
  }
  return true;
}

}  // namespace panelglow
