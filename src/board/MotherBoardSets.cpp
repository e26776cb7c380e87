// The board's operations on fans, zones and devices: all of them are those of its sets.
#include <array>

#include "board/MotherBoard.h"
#include "board/sets/FanReport.h"
#include "board/sets/ZoneReport.h"

namespace panelglow {

namespace {

template <class Record, class Value>
bool Copy(const Record* from, Value Record::*field, Value& out) {
  if (from != nullptr) {
    out = from->*field;
  }
  return from != nullptr;
}

}  // namespace

// ---- devices

bool MotherBoard::DetectJumpers() { return devices.Detect(DeviceKind::kJumpers); }
bool MotherBoard::DetectFrontPanel() { return devices.Detect(DeviceKind::kFrontPanel); }
bool MotherBoard::DetectSecurityDevices() { return devices.Detect(DeviceKind::kSecurityDevices); }
bool MotherBoard::DetectPowerSupply() { return devices.Detect(DeviceKind::kPowerSupply); }
bool MotherBoard::DetectHeatsink() { return devices.Detect(DeviceKind::kHeatsink); }
bool MotherBoard::DetectDashCable() { return devices.Detect(DeviceKind::kDashCable); }
bool MotherBoard::DetectRiser() { return devices.Detect(DeviceKind::kRiser); }
bool MotherBoard::DetectCables() { return devices.Detect(DeviceKind::kCables); }
bool MotherBoard::DetectPoweredDevices() { return devices.Detect(DeviceKind::kPoweredDevices); }
bool MotherBoard::DetectInternalSpeaker() { return devices.Detect(DeviceKind::kInternalSpeaker); }
bool MotherBoard::DetectTouchScreen() { return devices.Detect(DeviceKind::kTouchScreen); }

bool MotherBoard::Detect(DeviceKind kind) {
  using Operation = bool (MotherBoard::*)();
  constexpr std::array<Operation, kDeviceKinds> kOperations{
      // in the order of DeviceKind
      &MotherBoard::DetectJumpers,         &MotherBoard::DetectFrontPanel, &MotherBoard::DetectSecurityDevices,
      &MotherBoard::DetectPowerSupply,     &MotherBoard::DetectHeatsink,   &MotherBoard::DetectDashCable,
      &MotherBoard::DetectRiser,           &MotherBoard::DetectCables,     &MotherBoard::DetectPoweredDevices,
      &MotherBoard::DetectInternalSpeaker, &MotherBoard::DetectTouchScreen};
  return (this->*kOperations[static_cast<std::size_t>(kind)])();
}

// ---- fans

bool MotherBoard::LoadFanGroups() { return fans.LoadGroups(); }
bool MotherBoard::LoadFans() { return fans.Load(); }
void MotherBoard::TakeFanControl() { fans.TakeControl(); }
void MotherBoard::ReleaseFanControl() { fans.ReleaseControl(); }
bool MotherBoard::SetActiveReadingSet(std::uint32_t index) { return fans.SetActiveReadingSet(index); }
void MotherBoard::SetFanTests(bool full, bool pwm, bool nominal) { fans.SetTests(full, pwm, nominal); }
bool MotherBoard::SetManualFanMode(bool on) { return fans.SetManualMode(on); }
bool MotherBoard::SaveFanStates() { return fans.SaveStates(); }
bool MotherBoard::RestoreFanStates() { return fans.RestoreStates(); }
bool MotherBoard::ReadAllFans() { return fans.ReadAll(); }
bool MotherBoard::ReadFan(int /*index*/, int& /*rpm*/) { return false; }
bool MotherBoard::ReadOneFan(int index) { return fans.ReadOne(index); }
bool MotherBoard::SetAllFansFull() { return fans.SetAllFull(); }
bool MotherBoard::SetAllFansPwm() { return fans.SetAllPwm(); }
bool MotherBoard::SetFanPwm(int index) { return fans.SetPwm(index); }
void MotherBoard::WaitForFans() { fans.Wait(); }
bool MotherBoard::DetectFans() { return fans.Detect(); }

void MotherBoard::WriteFanLog(const LineSink& write, const std::string& group) {
  panelglow::WriteFanLog(write, fans.List(), group, FanLogForm::kPlain);
}
void MotherBoard::WriteFanLogEx(const LineSink& write, const std::string& group) {
  panelglow::WriteFanLog(write, fans.List(), group, FanLogForm::kExtended);
}
void MotherBoard::WriteFanResults(XmlObject& parent) { panelglow::WriteFanResults(parent, fans.List()); }

bool MotherBoard::GetFanCount(int& count) {
  count = static_cast<int>(fans.List().size());
  return true;
}
bool MotherBoard::GetFans(std::vector<Fan>& list) {
  list = fans.List();
  return true;
}

bool MotherBoard::GetFanRecord(int index, Fan& record) {
  const Fan* fan = fans.Find(index);
  record = fan == nullptr ? record : *fan;
  return fan != nullptr;
}
bool MotherBoard::GetFanName(int index, std::string& fanName) { return Copy(fans.Find(index), &Fan::name, fanName); }
bool MotherBoard::GetFanFullLimits(int index, FanLimits& limits) {
  return Copy(fans.Find(index), &Fan::full, limits);
}
bool MotherBoard::GetFanNominalLimits(int index, FanLimits& limits) {
  return Copy(fans.Find(index), &Fan::nominal, limits);
}
bool MotherBoard::GetFanPwmLimits(int index, FanLimits& limits) { return Copy(fans.Find(index), &Fan::pwm, limits); }
bool MotherBoard::GetFanPwmDuty(int index, int& percent) { return Copy(fans.Find(index), &Fan::pwmDuty, percent); }
bool MotherBoard::GetFanReading(int index, FanReading column, int& rpm) {
  const Fan* fan = fans.Find(index);
  rpm = fan == nullptr ? rpm : fan->readings[static_cast<std::size_t>(column)];
  return fan != nullptr;
}

// ---- zones

bool MotherBoard::GetZones(std::vector<TempZone>& list) {
  list = zones.List();
  return true;
}
bool MotherBoard::LoadZones() { return zones.Load(); }
bool MotherBoard::LoadZoneGroups() { return zones.LoadGroups(); }
bool MotherBoard::GetZoneCount(int& count) {
  count = zones.Count();
  return true;
}
bool MotherBoard::GetProbeRate(int& seconds) {
  seconds = zones.Probe().rate_s;
  return true;
}
bool MotherBoard::SetProbeRate(int seconds) {
  zones.SetProbeRate(seconds);
  return true;
}
bool MotherBoard::GetConsecutiveHigh(int& count) {
  count = zones.Probe().consecutiveHigh;
  return true;
}
bool MotherBoard::GetConsecutiveLow(int& count) {
  count = zones.Probe().consecutiveLow;
  return true;
}
bool MotherBoard::GetRetriesOnInvalid(int& count) {
  count = zones.Probe().retriesOnInvalid;
  return true;
}
bool MotherBoard::IsZoneSkipped(int zone) { return zones.IsSkipped(zone); }
bool MotherBoard::SetZoneSkipped(int zone, bool skip) { return zones.SetSkipped(zone, skip); }
bool MotherBoard::CheckZone(int zone, ZoneCheck& check) { return zones.Check(zone, check); }
bool MotherBoard::GetZoneName(int zone, std::string& zoneName) {
  return Copy(zones.Find(zone), &TempZone::name, zoneName);
}
void MotherBoard::WriteZoneLog(const LineSink& write) { panelglow::WriteZoneLog(write, zones); }
void MotherBoard::WriteZoneResults(XmlObject& parent) { panelglow::WriteZoneResults(parent, zones); }
int MotherBoard::ReadProchot(int zone) { return zones.ReadProchot(zone); }
int MotherBoard::GetZoneHigh(int zone) { return zones.GetHigh(zone); }
int MotherBoard::GetZoneLow(int zone) { return zones.GetLow(zone); }
int MotherBoard::ReadZone(int zone) { return zones.Read(zone); }

// ---- hood and buttons

bool MotherBoard::LoadHoodSwitch() { return hoodSwitch.Load(); }
bool MotherBoard::ReadHoodSwitch(bool& value) { return hoodSwitch.Read(value); }
bool MotherBoard::ReadHoodLatch(bool clearFirst, bool& value) { return hoodSwitch.ReadLatch(clearFirst, value); }
bool MotherBoard::LoadHoodLock() { return hoodLock.Load(); }
bool MotherBoard::ReadHoodLock(bool& present) { return hoodLock.Read(present); }
int MotherBoard::LockHood() { return hoodLock.Lock(); }
int MotherBoard::UnlockHood() { return hoodLock.Unlock(); }
bool MotherBoard::LoadButtons() { return buttons.Load(); }
bool MotherBoard::SelectButton(const std::string& buttonName) { return buttons.Select(buttonName); }
bool MotherBoard::GetButtonState(const std::string& buttonName, bool& pressed) {
  return buttons.GetState(buttonName, pressed);
}
bool MotherBoard::ReadButtonDirect(bool& value) { return buttons.ReadDirect(value); }
bool MotherBoard::ReadButton(bool& pressed) { return buttons.Read(pressed); }
bool MotherBoard::ReadButtonLatch(bool& value) { return buttons.ReadLatch(value); }

// ---- the oldest boards alone

bool MotherBoard::LoadLegacySettings() { return false; }
bool MotherBoard::DetectLegacyDevice(LegacyDevice /*device*/, bool& /*present*/) { return false; }
bool MotherBoard::DetectLegacyFan(int /*index*/, bool& /*present*/) { return false; }
bool MotherBoard::SaveLegacyFanState() { return false; }
bool MotherBoard::RestoreLegacyFanState() { return false; }
bool MotherBoard::SetLegacyFanFull(int /*index*/) { return false; }
bool MotherBoard::SetLegacyFanPwm(int /*index*/) { return false; }

}  // namespace panelglow
