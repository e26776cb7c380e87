#include "board/sets/FanSet.h"

namespace panelglow {

bool FanSet::Load() { return true; }
void FanSet::Take(std::vector<Fan> list, std::uint32_t wait_ms) {
  fans = std::move(list);
  stabilizationWait_ms = wait_ms;
}
bool FanSet::LoadGroups() { return true; }
bool FanSet::Detect() { return true; }
const Fan* FanSet::Find(int /*index*/) const { return nullptr; }
bool FanSet::SetActiveReadingSet(std::uint32_t index) {
  readingSet = index < kFanReadings ? index : readingSet;
  return index < kFanReadings;
}
void FanSet::SetTests(bool /*full*/, bool /*pwm*/, bool /*nominal*/) {}
void FanSet::TakeControl() {}
void FanSet::ReleaseControl() {}
bool FanSet::SetManualMode(bool /*on*/) { return true; }
bool FanSet::SaveStates() { return true; }
bool FanSet::RestoreStates() { return true; }
bool FanSet::ReadAll() { return true; }
bool FanSet::ReadOne(int /*index*/) { return false; }
bool FanSet::SetAllFull() { return true; }
bool FanSet::SetAllPwm() { return true; }
bool FanSet::SetPwm(int /*index*/) { return false; }
void FanSet::Wait() const {}

}  // namespace panelglow
