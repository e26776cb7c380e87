#include "board/sets/ZoneSet.h"

#include <algorithm>
#include <cstddef>
#include <limits>

#include "board/base/IniReader.h"
#include "board/base/mblib_exception.h"
#include "board/parts/BitName.h"
#include "board/parts/RowOf.h"
#include "board/sets/ReadSettings.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "harness/base/Notices.h"

namespace panelglow {

namespace {

// Chips that are read in ways of their own.
constexpr const char* kProcessors = "acpi";
constexpr const char* kGraphics = "videochip";
constexpr const char* kFirmware = "casl";

constexpr const char* kAllCards = "allcards";  // in place of an index

// What the processor's throttling bits say.
constexpr int kAtLow = 1;
constexpr int kAtHigh = 3;

constexpr int kLastRegister = 0xFFFF;  // of a hardware monitor, with its bank

void Log(const std::string& text) { CDMout::LogMessage(LogOptions::Debug, kNote, text); }

// Limits come from files: sums of them stay numbers.
int Sum(std::int64_t limit, std::int64_t difference) {
  const std::int64_t sum = limit + difference;
  return static_cast<int>(
      std::clamp<std::int64_t>(sum, std::numeric_limits<int>::min(), std::numeric_limits<int>::max()));
}

void Extend(int& max, int& min, int value) {
  const bool isFirst = max == kNoLimit || max >= kFirstInvalidReading;
  max = isFirst ? value : std::max(max, value);
  min = isFirst ? value : std::min(min, value);
}

// The limit of a zone that the files give in degrees.
int PlainHigh(const TempZone& zone) { return zone.thresholdFix == kNoLimit ? zone.thresholdHigh : zone.thresholdFix; }

bool HasReading(const TempZone& zone) {
  return zone.lastReading != kNoLimit && zone.lastReading < kFirstInvalidReading;
}

// The bit of a register byte, by its number as text.
std::string ReadBit(const std::string& key) {
  constexpr int kLastBit = 7;
  const Setting setting = IniReader::Instance().ReadIniSetting(key, "");
  std::string bit = CDMUtil::Trim(setting.text);
  if (!bit.empty()) {
    const int number = CDMUtil::ToInt(bit);
    CheckNumber(bit, kIntBits, static_cast<std::uint32_t>(number), setting);
    if (number < 0 || number > kLastBit) {
      TellOf(setting, "a byte has no bit " + bit + "; it is never set");
    }
  }
  return bit;
}

// One limit of a zone and its cores, each kNoLimit when there is none: whether one applied, and the readings in a row
// that were beyond one of them.
template <class Beyond>
bool Judge(Beyond beyond, const TempZone& zone, int limit, int hottestOrColdest, int coreLimit, int& inARow,
           bool& isCounted, bool& isBeyond) {
  const bool applies = limit != kNoLimit;
  const bool appliesToCores = coreLimit != kNoLimit && !zone.coreReadings.empty();
  if (!applies && !appliesToCores) {
    return false;
  }
  isBeyond = (applies && beyond(zone.lastReading, limit)) || (appliesToCores && beyond(hottestOrColdest, coreLimit));
  if (!isCounted) {
    inARow = isBeyond ? inARow + 1 : 0;
    isCounted = true;
  }
  return true;
}

}  // namespace

// ---- from the files

TempZone ZoneSet::ReadZone(const std::string& prefix) const {
  const auto limit = [&](const char* key) { return ReadIniInt(prefix + key, kNoLimit); };
  TempZone zone;
  zone.thresholdAdj = ReadIniInt(prefix + "threshold.adj", zone.thresholdAdj);
  zone.thresholdDelta = limit("threshold.delta");
  zone.thresholdFix = limit("threshold.fix");
  const Setting type = IniReader::Instance().ReadIniSetting(prefix + "type", zone.type);
  if (type.text == "cpu" || type.text == "gpu") {
    zone.type = type.text;
  } else {
    TellOf(type, "\"" + type.text + "\" is neither cpu nor gpu and counts as " + zone.type);
  }
  zone.thresholdHigh = limit("threshold.high");
  zone.thresholdLow = limit("threshold.low");
  zone.thresholdLowFix = limit("thresholdlow.fix");
  zone.tjmaxDelta = limit("threshold.tjmax.delta");
  zone.cpuCore = ReadWord(prefix + "cpu.core", "true", "false");
  zone.coreHigh = limit("cpu.core.threshold.high");
  zone.coreTjmaxDelta = limit("cpu.core.threshold.tjmax.delta");
  zone.coreLow = limit("cpu.core.threshold.low");
  zone.prochot = ReadYesNo(prefix + "prochot", zone.prochot);
  zone.prochotChip = ReadChipName(prefix + "prochot.chip", "", chipOf);
  zone.prochotOffset = ReadIniInt(prefix + "prochot.offset", zone.prochotOffset);
  if (zone.prochotOffset < 0 || zone.prochotOffset > kLastRegister) {
    const Setting offset = IniReader::Instance().ReadIniSetting(prefix + "prochot.offset", "");
    TellOf(offset, "there is no register " + offset.text + ", and nothing is read of the processor's throttling");
  }
  zone.prochotLowBit = ReadBit(prefix + "prochot.threshold.low.bit");
  zone.prochotHighBit = ReadBit(prefix + "prochot.threshold.high.bit");
  return zone;
}

// A zone's own one, or the board's.
std::string ZoneSet::ReadZoneChip(const std::string& prefix) const {
  const std::string own = ReadChipName(prefix + "chip", presetChip, chipOf);
  return own.empty() ? ReadChipName("test.tempcaution.chip", "sio", chipOf, true) : own;
}

bool ZoneSet::Load() {
  probe.rate_s = ReadIniInt("test.tempcaution.proberate", ProbeSettings{}.rate_s);
  probe.consecutiveHigh = ReadIniInt("test.tempcaution.consecutivehigh", ProbeSettings{}.consecutiveHigh);
  probe.consecutiveLow = ReadIniInt("test.tempcaution.consecutivelow", ProbeSettings{}.consecutiveLow);
  probe.retriesOnInvalid = ReadIniInt("test.tempcaution.retriesoninvalidtemp", ProbeSettings{}.retriesOnInvalid);
  std::vector<TempZone> list;
  for (int n = 1;; ++n) {
    const std::string prefix = "test.tempcaution.zone." + CDMUtil::ToString(n) + ".";
    const std::string name = ReadIniValue(prefix + "name", "");
    if (name.empty()) {
      break;
    }
    TempZone zone = ReadZone(prefix);
    zone.number = n;
    zone.name = name;
    zone.chip = ReadZoneChip(prefix);
    AddZone(std::move(zone), prefix, list);
  }
  Take(std::move(list), probe);
  return true;
}

// Of graphics cards that stand for one key each gets its number behind the name.
void ZoneSet::AddZone(TempZone zone, const std::string& prefix, std::vector<TempZone>& list) const {
  if (zone.prochot && zone.prochotLowBit.empty() && zone.prochotHighBit.empty()) {
    Log(zone.name + " : Low or High bit values are missing for Prochot in INI file");
  }
  if (zone.chip != kGraphics || CDMUtil::Trim(ReadIniValue(prefix + "index", "")) != kAllCards) {
    zone.index = ReadIniInt(prefix + "index", zone.index);
    LimitByChip(zone, prefix);
    list.push_back(std::move(zone));
    return;
  }
  const int cards = chipOf(zone.chip).CountCards();
  for (int card = 0; card < cards; ++card) {
    TempZone one = zone;
    one.index = card;
    one.name += " " + CDMUtil::ToString(card + 1);
    LimitByChip(one, prefix);
    list.push_back(std::move(one));
  }
}

// By what the processor allows itself; a graphics card by the limits that the files have for its kind, where the zone
// has none.
void ZoneSet::LimitByChip(TempZone& zone, const std::string& prefix) const {
  Chip& chip = chipOf(zone.chip);
  const auto limit = [&](const char* key, int delta, const char* sign, int& threshold) {
    if (delta == kNoLimit) {
      return;
    }
    Log(zone.name + " : Delta value from ini  " + sign + " " + CDMUtil::ToString(delta));
    if (!chip.ReadThreshold(zone.index, zone.tjMax)) {
      Notices::Tell("The zone \"" + zone.name + "\" has no limit by \"" + prefix + key + "\": what the chip \"" +
                    zone.chip + "\" allows at most is not known.");
      return;
    }
    threshold = Sum(zone.tjMax, -std::int64_t{delta});
    Log(zone.name + " : TjMax value using MSR " + sign + " " + CDMUtil::ToString(zone.tjMax));
    Log(zone.name + " : Max threshold value (TjMax - Delta) " + sign + " " + CDMUtil::ToString(threshold));
  };
  limit("threshold.tjmax.delta", zone.tjmaxDelta, "=", zone.thresholdHigh);
  limit("cpu.core.threshold.tjmax.delta", zone.coreTjmaxDelta, ":", zone.coreHigh);
  if (zone.chip != kGraphics) {
    return;
  }
  if (zone.thresholdHigh == kNoLimit && zone.thresholdDelta == kNoLimit) {
    chip.ReadThreshold(zone.index, zone.thresholdHigh);
  }
  if (zone.thresholdLow == kNoLimit) {
    chip.ReadLowLimitTemperature(zone.index, zone.thresholdLow);
  }
}

void ZoneSet::Take(std::vector<TempZone> list, const ProbeSettings& settings) {
  zones = std::move(list);
  groups.clear();
  for (TempZone& zone : zones) {
    zone.lastHighLimit = PlainHigh(zone);
  }
  probe = settings;
  startTime = TimeStamp();
}

bool ZoneSet::LoadGroups() {
  constexpr const char* kBad = "Missing or invalid Zone Group information";
  std::vector<ZoneGroup> found;
  for (int n = 1;; ++n) {
    const std::string prefix = "test.tempzones.group." + CDMUtil::ToString(n);
    ZoneGroup group{ReadIniValue(prefix + ".name", ""), {}};
    if (group.name.empty()) {
      groups = std::move(found);
      return true;
    }
    for (const int number : NumbersIn(IniReader::Instance().ReadIniSetting(prefix + ".zones", ""))) {
      const std::size_t before = group.zones.size();
      for (std::size_t i = 0; i < zones.size(); ++i) {
        if (zones[i].number == number) {
          group.zones.push_back(static_cast<int>(i) + 1);
        }
      }
      if (group.zones.size() == before) {
        throw mblib_exception(kBad);
      }
    }
    if (group.zones.empty()) {
      throw mblib_exception(kBad);
    }
    found.push_back(std::move(group));
  }
}

// ---- one zone

const TempZone* ZoneSet::Find(int zone) const { return RowOf(zones, zone); }

TempZone* ZoneSet::At(int zone) {
  return Find(zone) == nullptr ? nullptr : &zones[static_cast<std::size_t>(zone) - 1];
}

bool ZoneSet::IsSkipped(int zone) const {
  const TempZone* found = Find(zone);
  return found != nullptr && found->skipped;
}

bool ZoneSet::SetSkipped(int zone, bool skip) {
  TempZone* found = At(zone);
  if (found != nullptr) {
    found->skipped = skip;
  }
  return found != nullptr;
}

int ZoneSet::GetHigh(int zone) {
  const TempZone* found = Find(zone);
  if (found == nullptr) {
    return kNoLimit;
  }
  if (const int plain = PlainHigh(*found); plain != kNoLimit || found->thresholdDelta == kNoLimit) {
    return plain;
  }
  Chip& chip = chipOf(found->chip);
  int threshold = 0;
  if (chip.ReadThreshold(found->index, threshold)) {
    return Sum(threshold, found->thresholdDelta);
  }
  return chip.ReadLowLimitTemperature(found->index, threshold)
             ? Sum(Sum(threshold, found->thresholdAdj), found->thresholdDelta)
             : kNoLimit;
}

int ZoneSet::GetLow(int zone) const {
  const TempZone* found = Find(zone);
  if (found == nullptr) {
    return kNoLimit;
  }
  return found->thresholdLowFix != kNoLimit ? found->thresholdLowFix : found->thresholdLow;
}

int ZoneSet::Read(int zone) {
  TempZone* found = At(zone);
  if (found == nullptr) {
    return kChipReadFailed;
  }
  Chip& chip = chipOf(found->chip);
  found->coreReadings.clear();
  int value = 0;
  bool done = false;
  int failure = kChipReadFailed;
  if (found->chip == kProcessors) {
    done = chip.ReadProcessorTemperature(found->index, value, found->cpuCore, found->name);
    failure = kFirmwareReadFailed;
  } else if (found->chip == kFirmware) {
    done = chip.ReadVirtualTemperature(found->index, found->cpuCore, value);
    failure = kFirmwareReadFailed;
  } else {
    done = chip.ReadTemperature(found->index, value);
  }
  if (!done) {
    return failure;
  }
  found->coreReadings = chip.GetCoreTemperatures();
  found->readingTime = TimeStamp();
  return chip.MapTemperature(value);
}

int ZoneSet::ReadProchot(int zone) {
  const TempZone* found = Find(zone);
  if (found == nullptr || found->prochotOffset < 0 || found->prochotOffset > kLastRegister) {
    return 0;
  }
  std::uint8_t value = 0;
  if (!chipOf(found->prochotChip).ReadEnvironmentRegister(static_cast<std::uint16_t>(found->prochotOffset), value)) {
    return 0;
  }
  const auto isSet = [value](const std::string& bit) { return !bit.empty() && (value & MaskOfBitName(bit, 8)) != 0; };
  const bool low = isSet(found->prochotLowBit);
  const bool high = isSet(found->prochotHighBit);
  if (found->prochotHighBit.empty()) {
    return low ? kAtLow : 0;
  }
  return low || high ? kAtHigh : 0;
}

// ---- checks

bool ZoneSet::Measure(int zone, int& value) {
  TempZone* found = At(zone);
  if (found == nullptr) {
    return false;
  }
  found->lastReading = kChipReadFailed;  // ... it stays, when the chip throws
  value = found->lastReading = steps.read ? steps.read(zone) : Read(zone);
  found->isHighCounted = found->isLowCounted = false;
  if (value >= kFirstInvalidReading) {
    found->minReading = found->maxReading = value;
    ++found->invalidReadings;
    return false;
  }
  Extend(found->maxReading, found->minReading, value);
  if (!found->coreReadings.empty()) {
    const auto [coldest, hottest] = std::minmax_element(found->coreReadings.begin(), found->coreReadings.end());
    found->coreMin = *coldest;
    found->coreMax = *hottest;
  }
  return true;
}

bool ZoneSet::JudgeHigh(int zone, bool& high) {
  TempZone* found = At(zone);
  if (found == nullptr || !HasReading(*found)) {
    return false;
  }
  found->lastHighLimit = steps.high ? steps.high(zone) : GetHigh(zone);
  return Judge([](int value, int limit) { return value > limit; }, *found, found->lastHighLimit, found->coreMax,
               found->coreHigh, found->consecutiveHigh, found->isHighCounted, high);
}

bool ZoneSet::JudgeLow(int zone, bool& low) {
  TempZone* found = At(zone);
  return found != nullptr && HasReading(*found) &&
         Judge([](int value, int limit) { return value < limit; }, *found, steps.low ? steps.low(zone) : GetLow(zone),
               found->coreMin, found->coreLow, found->consecutiveLow, found->isLowCounted, low);
}

bool ZoneSet::Check(int zone, ZoneCheck& check) {
  TempZone* found = At(zone);
  if (found == nullptr) {
    return false;
  }
  check = {};
  bool applied = false;
  if (Measure(zone, check.value)) {
    if (found->prochot) {
      check.prochotStatus = steps.prochot ? steps.prochot(zone) : ReadProchot(zone);
      found->prochotStatus = check.prochotStatus == 0 ? found->prochotStatus : check.prochotStatus;
    }
    const bool hasHigh = JudgeHigh(zone, check.high);
    const bool hasLow = JudgeLow(zone, check.low);
    applied = hasHigh || hasLow;
  }
  check.consecutiveHigh = found->consecutiveHigh;
  check.consecutiveLow = found->consecutiveLow;
  check.invalid = found->invalidReadings;
  return applied;
}

}  // namespace panelglow
