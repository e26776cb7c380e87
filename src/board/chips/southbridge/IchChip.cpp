#include "board/chips/southbridge/IchChip.h"

#include <algorithm>
#include <array>

#include "board/base/IniReader.h"
#include "board/chips/southbridge/DashController.h"
#include "board/parts/ConfigMode.h"
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

// The intruder input held down; for the life of a ConfigMode.
class PulledInput {
 public:
  explicit PulledInput(CDevio& client) : devio(client) {}
  void EnterConfigMode() { devio.OutportByte(kIntruderPort, kIntruderPulled); }
  void ExitConfigMode() {
    if (!staysPulled) {
      devio.OutportByte(kIntruderPort, kIntruderFree);
    }
  }

  /// A latch that does not see it is looked at with the input as it is: the next attempt pulls and frees it.
  void LeavePulled() { staysPulled = true; }

 private:
  CDevio& devio;
  bool staysPulled = false;
};

}  // namespace

IchChip::IchChip() : IchChip("ich", ReadIniWordUnlessZero("chip.ich.pmbar", 0xF800)) {}

IchChip::IchChip(std::string chipName, std::uint16_t base)
    : Chip(std::move(chipName)),
      pmbar(base),
      gpiobar(ReadIniWordUnlessZero("chip.ich.gpiobar", 0xFA00)),
      enableOffset(ReadIniWord("chip.ich.pm.enable.offset", 2)),
      statusOffset(ReadIniWord("chip.ich.pm.status.offset", 1)),
      primary(ReadIniInt("test.powerled.gpio.primary", 12)),
      secondary(ReadIniInt("test.powerled.gpio.secondary", 24)),
      button(devio, {.control = static_cast<std::uint16_t>(pmbar + kButtonControl),
                     .enable = static_cast<std::uint16_t>(pmbar + enableOffset),
                     .status = static_cast<std::uint16_t>(pmbar + statusOffset)}) {}

// ---- lines

std::optional<LinePlace> IchChip::MapGpio(int line) const {
  std::optional<LinePlace> found = FindLine(kGpioLevels, line);
  if (found) {
    found->place = static_cast<std::uint16_t>(gpiobar + found->place);
  }
  return found;
}

bool IchChip::HasLine(int line) const { return line == kLatchLine || MapGpio(line).has_value(); }

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
  {
    PulledInput input(devio);
    const ConfigMode pulled(input);
    clock.Sleep(kIntruderSettle_ms);
    ClearLatch();
    if (!IsLatched()) {
      input.LeavePulled();
      return false;
    }
  }
  clock.Sleep(kIntruderSettle_ms);
  ClearLatch();
  return true;
}

bool IchChip::ReadIntrusionLatch(int line, bool clearFirst, bool& value) {
  if (line != kLatchItself && !HasLine(line)) {
    return false;
  }
  if (line != kLatchLine && clearFirst && !PullIntruderInput()) {
    return false;
  }
  if (line == kLatchItself) {
    value = IsLatched();
    return true;
  }
  value = ReadLine(line) == kAsserted;
  return true;
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
  for (const std::optional<LinePlace>& line : {green, red}) {
    if (line) {
      KeepPort(line->place);
    }
  }
  return green && red;
}

void IchChip::KeepPort(std::uint16_t port) {
  const bool isKept =
      std::any_of(savedLed.begin(), savedLed.end(), [&](const auto& saved) { return saved.first == port; });
  if (!isKept) {
    savedLed.emplace_back(port, devio.InportDword(port));
  }
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

int IchChip::ReadDashCable(int line, const std::string& idList) {
  if (!HasLine(line)) {
    return kNoSuchLine;
  }
  DashWatcher nobody;
  const std::optional<DashController> controller = DashController::Find(devio, idList);
  const std::optional<bool> follows =
      controller ? controller->LineFollows([&] { return ReadLine(line); }, nobody) : std::nullopt;
  return follows ? LineState(*follows) : kNoSuchLine;
}

}  // namespace panelglow
