#include "board/sets/ZoneSet.h"

namespace panelglow {

bool ZoneSet::Load() { return true; }
void ZoneSet::Take(std::vector<TempZone> list, const ProbeSettings& settings) {
  zones = std::move(list);
  probe = settings;
}
bool ZoneSet::LoadGroups() { return true; }
const TempZone* ZoneSet::Find(int /*zone*/) const { return nullptr; }
bool ZoneSet::IsSkipped(int /*zone*/) const { return false; }
bool ZoneSet::SetSkipped(int /*zone*/, bool /*skip*/) { return false; }
int ZoneSet::Read(int /*zone*/) { return kChipReadFailed; }
bool ZoneSet::Check(int /*zone*/, ZoneCheck& /*check*/) { return false; }
int ZoneSet::ReadProchot(int /*zone*/) { return 0; }
int ZoneSet::GetHigh(int /*zone*/) { return kNoLimit; }
int ZoneSet::GetLow(int /*zone*/) const { return kNoLimit; }

}  // namespace panelglow
