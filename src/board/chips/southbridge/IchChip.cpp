#include "board/chips/southbridge/IchChip.h"

#include <array>

#include "board/base/IniReader.h"
#include "board/chips/southbridge/DashController.h"
#include "board/parts/LineActivity.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

// GPIO levels, offsets from the base; 32 lines each.
constexpr std::array<LineRange, 3> kGpioLevels{{{0, 31, 0x0C}, {32, 63, 0x38}, {64, 95, 0x48}}};

// Power management block, offsets from the base.
constexpr std::uint16_t kButtonControl = 0x58;
constexpr std::uint16_t kIntruderLatch = 0x66;  // word
constexpr std::uint16_t kLatched = 0x0001;      // cleared by writing it

constexpr int kLatchLine = 238;
constexpr int kLatchItself = -1;  // in place of a line
constexpr std::uint32_t kLatchSettle_ms = 10;

// Where the intruder input can be pulled.
constexpr std::uint16_t kIntruderPort = 0x1293;
constexpr std::uint8_t kIntruderPulled = 0xFD;
constexpr std::uint8_t kIntruderFree = 0xFF;
constexpr std::uint32_t kIntruderSettle_ms = 75;

constexpr std::uint32_t kPinSettle_ms = 10;  // of the network controller

}  // namespace

IchChip::IchChip(std::string chipName)
    : Chip(std::move(chipName)),
      gpiobar(ReadIniWordUnlessZero("chip.ich.gpiobar", 0xFA00)),
      enableOffset(ReadIniWord("chip.ich.pm.enable.offset", 2)),
      statusOffset(ReadIniWord("chip.ich.pm.status.offset", 1)),
      primary(ReadIniInt("test.powerled.gpio.primary", 12)),
      secondary(ReadIniInt("test.powerled.gpio.secondary", 24)),
      button(devio, {}) {
  SetPmbar(ReadIniWordUnlessZero("chip.ich.pmbar", 0xF800));
}

void IchChip::SetPmbar(std::uint16_t base) {
  pmbar = base;
  button = PowerButton(devio, {.control = static_cast<std::uint16_t>(pmbar + kButtonControl),
                               .enable = static_cast<std::uint16_t>(pmbar + enableOffset),
                               .status = static_cast<std::uint16_t>(pmbar + statusOffset)});
}

// ---- lines

std::optional<LinePlace> IchChip::MapGpio(int line) const {
  std::optional<LinePlace> found = FindLine(kGpioLevels, line);
  if (found) {
    found->place = static_cast<std::uint16_t>(gpiobar + found->place);
  }
  return found;
}

void IchChip::ClearLatch() { devio.OutportWord(static_cast<std::uint16_t>(pmbar + kIntruderLatch), kLatched); }

bool IchChip::IsLatched() {
  return (devio.InportWord(static_cast<std::uint16_t>(pmbar + kIntruderLatch)) & kLatched) != 0;
}

int IchChip::ReadLine(int line) {
  if (line == kLatchLine) {
    ClearLatch();
    platform::TheHost().clock.Sleep(kLatchSettle_ms);
    return LineState(IsLatched());
  }
  const std::optional<LinePlace> place = MapGpio(line);
  return place ? LineState((devio.InportDword(place->place) & place->mask) != 0) : kNoSuchLine;
}

bool IchChip::PullIntruderInput() {
  platform::Clock& clock = platform::TheHost().clock;
  devio.OutportByte(kIntruderPort, kIntruderPulled);
  clock.Sleep(kIntruderSettle_ms);
  ClearLatch();
  if (!IsLatched()) {
    return false;
  }
  devio.OutportByte(kIntruderPort, kIntruderFree);
  clock.Sleep(kIntruderSettle_ms);
  ClearLatch();
  return true;
}

bool IchChip::ReadIntrusionLatch(int line, bool clearFirst, bool& value) {
  if (line != kLatchLine && clearFirst && !PullIntruderInput()) {
    return false;
  }
  if (line == kLatchItself) {
    value = IsLatched();
    return true;
  }
  const int state = ReadLine(line);
  if (state != kNoSuchLine) {
    value = state == kAsserted;
  }
  return state != kNoSuchLine;
}

bool IchChip::ReadLineActivity(int line, int& value) {
  value = -1;
  const std::optional<LinePlace> place = MapGpio(line);
  if (!place) {
    return false;
  }
  value = MeasureLineActivity([&] { return (devio.InportDword(place->place) & place->mask) != 0; });
  return true;
}

// ---- power button

bool IchChip::SavePowerButtonState() {
  button.Save();
  return true;
}

bool IchChip::ArmPowerButton() {
  button.Arm();
  return true;
}

bool IchChip::IsPowerButtonPressed(bool& pressed) {
  pressed = button.IsPressed();
  return true;
}

bool IchChip::RestorePowerButtonState() {
  button.Restore();
  return true;
}

// ---- power LED

bool IchChip::IsPowerLedRedSupported(bool& supported) {
  supported = true;
  return true;
}

bool IchChip::SavePowerLedState() {
  const std::optional<LinePlace> green = MapGpio(primary);
  const std::optional<LinePlace> red = MapGpio(secondary);
  if (!green || !red) {
    return false;
  }
  if (savedLed.empty()) {
    std::vector<std::pair<std::uint16_t, std::uint32_t>> taken{{green->place, devio.InportDword(green->place)}};
    if (red->place != green->place) {
      taken.emplace_back(red->place, devio.InportDword(red->place));
    }
    savedLed = std::move(taken);
  }
  return true;
}

bool IchChip::SetLine(int line) {
  const std::optional<LinePlace> place = MapGpio(line);
  if (place) {
    devio.OutportDword(place->place, devio.InportDword(place->place) | place->mask);
  }
  return place.has_value();
}

void IchChip::ClearBits(std::uint16_t port, std::uint32_t mask) {
  devio.OutportDword(port, devio.InportDword(port) & ~mask);
}

bool IchChip::DeassertPowerLed() {
  const std::optional<LinePlace> green = MapGpio(primary);
  const std::optional<LinePlace> red = MapGpio(secondary);
  if (!green || !red) {
    return false;
  }
  if (green->place == red->place) {
    ClearBits(green->place, green->mask | red->mask);
  } else {
    ClearBits(green->place, green->mask);
    ClearBits(red->place, red->mask);
  }
  return true;
}

bool IchChip::RestorePowerLedState() {
  for (const auto& [port, value] : savedLed) {
    devio.OutportDword(port, value);
  }
  savedLed.clear();
  return true;
}

// ---- others

bool IchChip::DetectDashCable(int line, const std::string& idList) {
  if (line < 0) {
    return false;
  }
  const std::optional<DashController> controller = DashController::Find(devio, idList);
  if (!controller || !controller->EnableOutput()) {
    return false;
  }
  // Both levels are driven, so that the pin ends high whatever the line says.
  const bool followsLow = controller->SetOutput(false) && ReadsAfterSettling(line, kNotAsserted);
  const bool followsHigh = controller->SetOutput(true) && ReadsAfterSettling(line, kAsserted);
  return followsLow && followsHigh;
}

bool IchChip::ReadsAfterSettling(int line, int state) {
  platform::TheHost().clock.Sleep(kPinSettle_ms);
  return ReadLine(line) == state;
}

}  // namespace panelglow
