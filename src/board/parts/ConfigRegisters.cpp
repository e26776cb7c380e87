#include "board/parts/ConfigRegisters.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kLogicalDeviceNumber = 0x07;  // the register that selects the device

}  // namespace

void ConfigRegisters::EnterConfigMode() {
  selected.reset();
  ports.Send(enter);
}

void ConfigRegisters::ExitConfigMode() { ports.Send(exit); }

void ConfigRegisters::SelectDevice(std::uint8_t device) {
  ports.Write(kLogicalDeviceNumber, device);
  selected = device;
}

void ConfigRegisters::SelectPlace(std::uint8_t place) {
  if (place != kGlobal && place != selected) {
    SelectDevice(place);
  }
}

std::uint8_t ConfigRegisters::Read(RegisterId id) {
  SelectPlace(id.place);
  return ports.Read(id.reg);
}

void ConfigRegisters::Write(RegisterId id, std::uint8_t value) {
  SelectPlace(id.place);
  ports.Write(id.reg, value);
}

}  // namespace panelglow
