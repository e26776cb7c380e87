#include "board/OldestBoard.h"

#include <utility>

#include "board/parts/Lines.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint16_t kGpioPort = 0xFA00;
constexpr int kGpioLines = 16;

}  // namespace

OldestBoard::OldestBoard(std::string boardClass, std::uint16_t boardId, const Traits& fixed)
    : MotherBoard(std::move(boardClass), boardId),
      traits(fixed),
      superIo(devio, fixed.indexPort),
      settings(LegacySettings::Load()),
      monitor(devio, settings.monitorIndexPort, settings.monitorDataPort,
              {.tachClock = traits.fanDivisor, .isLatched = traits.fanLatched, .fans = traits.fans}) {
  OldestBoard::LoadFans();
  OldestBoard::LoadZones();
}

bool OldestBoard::IsPowerLedRedSupported(bool& supported) {
  supported = traits.fanLatched;
  return true;
}

Chip& OldestBoard::ChipFor(const std::string& chipName) { return chipName.empty() ? monitor : GetChip(chipName); }

// ---- from the flat keys

bool OldestBoard::LoadLegacySettings() {
  settings = LegacySettings::Load();
  return LoadFans() && LoadZones();
}

bool OldestBoard::LoadFans() {
  fans.Take(settings.fans, settings.stabilizationWait_ms);
  return true;
}

bool OldestBoard::LoadZones() {
  zones.Take(settings.zones, settings.probe);
  return true;
}

// ---- devices

int OldestBoard::ReadGpioLine(int line) {
  if (line < 0 || line >= kGpioLines || !devio.IsDriverLoaded()) {
    return kNoSuchLineState;
  }
  return LineState((devio.InportWord(kGpioPort) >> line & 1) != 0);
}

void OldestBoard::TellOfLine() { platform::TheHost().console.Write("  Orchard GPIO_ERROR !!!!!!!!!\n"); }

bool OldestBoard::DetectLegacyDevice(LegacyDevice device, bool& present) {
  const int line = settings.lines[static_cast<std::size_t>(device)];
  if (line == LegacySettings::kNoLine) {
    return false;
  }
  const int state = ReadGpioLine(line);
  if (state == kNoSuchLineState) {
    TellOfLine();
    return false;
  }
  present = state == kLineAsserted;
  return true;
}

// ---- fans

bool OldestBoard::ReadFan(int index, int& rpm) {
  const Fan* fan = fans.Find(index);
  return fan != nullptr && monitor.ReadFanRpm(fan->tachIndex, rpm, fan->tachMultiplier);
}

bool OldestBoard::DetectLegacyFan(int index, bool& present) {
  if (fans.Find(index) == nullptr || !monitor.IsKnown()) {
    return false;
  }
  int rpm = 0;
  present = ReadFan(index, rpm) && rpm > 0;
  return true;
}

bool OldestBoard::SaveLegacyFanState() { return monitor.SaveFanState(); }
bool OldestBoard::RestoreLegacyFanState() { return monitor.RestoreFanState(); }

bool OldestBoard::SetLegacyFanFull(int index) {
  const Fan* fan = fans.Find(index);
  return fan != nullptr && monitor.SetFanFullSpeed(fan->pwmIndex);
}

bool OldestBoard::SetLegacyFanPwm(int index) {
  const Fan* fan = fans.Find(index);
  return fan != nullptr && monitor.SetManualFanMode(true) && monitor.SetFanPwmPercent(fan->pwmIndex, fan->pwmDuty);
}

// ---- zones

bool OldestBoard::ReadLegacyZone(int zone, int& value) { return zones.Measure(zone, value); }
bool OldestBoard::IsLegacyZoneHigh(int zone, bool& high) { return zones.JudgeHigh(zone, high); }
bool OldestBoard::IsLegacyZoneLow(int zone, bool& low) { return zones.JudgeLow(zone, low); }

}  // namespace panelglow
