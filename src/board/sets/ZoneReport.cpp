#include "board/sets/ZoneReport.h"

#include "board/sets/ReadSettings.h"
#include "config/XmlObject.h"

namespace panelglow {

namespace {

constexpr std::size_t kStars = 59;
constexpr const char* kInvalid = "InvalidData";

bool IsReading(int value) { return value != kNoLimit && value < kFirstInvalidReading; }

// Why a reading is none.
const char* WhyInvalid(const TempZone& zone) {
  if (zone.index < 0) {
    return "IniIndexErr";
  }
  if (zone.lastReading == kChipReadFailed) {
    return "SIOErr";
  }
  if (zone.lastReading != kFirmwareReadFailed) {
    return "InvalidTempErr";
  }
  if (zone.chip != "acpi") {
    return kInvalid;
  }
  // Who tells its limit is known; then it is the processor that is not there.
  return zone.tjMax == kNoLimit ? "ProcessorInfoMissingErr" : "ProcessorNotInstalledErr";
}

}  // namespace

std::string ZoneStatus(const TempZone& zone, const ProbeSettings& probe) {
  if (zone.skipped || zone.lastReading == kNoLimit) {
    return "NotTested";
  }
  if (!IsReading(zone.lastReading)) {
    return WhyInvalid(zone);
  }
  if (zone.consecutiveHigh > 0 && zone.consecutiveHigh >= probe.consecutiveHigh) {
    return "OverTempErr";
  }
  return zone.consecutiveLow > 0 && zone.consecutiveLow >= probe.consecutiveLow ? "UnderTempErr" : "NoErr";
}

void WriteZoneLog(const LineSink& write, const ZoneSet& zones) {
  const ProbeSettings& probe = zones.Probe();
  const auto number = [&](const char* label, int value) { write(label + std::to_string(value)); };
  write(std::string(kStars, '*'));
  write("Halcyon Temp Caution Test started:" + zones.StartTime());
  number("NumberOfZones=", zones.Count());
  for (int i = 1; i <= zones.Count(); ++i) {
    const TempZone& zone = *zones.Find(i);
    write("ZoneName=" + zone.name);
    number("MinReading=", zone.minReading);
    number("MaxReading=", zone.maxReading);
    number("Threshold=", zone.lastHighLimit);
    number("ProbeRate=", probe.rate_s);
    number("ConsecutiveHighReadings=", probe.consecutiveHigh);
    number("ConsecutiveLowReadings=", probe.consecutiveLow);
    number("RetriesOnInvalidTemp=", probe.retriesOnInvalid);
    write("Status=" + ZoneStatus(zone, probe));
    number("ProchotStatus=", zone.prochotStatus);
  }
  write("Test ended:" + TimeStamp());
  write(std::string(kStars, '*'));
}

void WriteZoneResults(XmlObject& parent, const ZoneSet& zones) {
  XmlObject results;
  results.name = "tempcautiontestresults";
  for (int i = 1; i <= zones.Count(); ++i) {
    const TempZone& zone = *zones.Find(i);
    XmlObject entry;
    entry.name = "tempcautiontestresult";
    entry.SetAttribute("timestamp", zone.readingTime);
    XmlObject element;
    element.name = "zone";
    element.SetAttribute("name", zone.name);
    element.SetAttribute("number", i);
    element.SetAttribute("threshold", zone.lastHighLimit);
    element.SetAttribute("TJMax", zone.tjMax);
    element.value = IsReading(zone.lastReading) ? std::to_string(zone.lastReading) : kInvalid;
    for (std::size_t core = 0; core < zone.coreReadings.size(); ++core) {
      XmlObject reading;
      reading.name = "core";
      reading.SetAttribute("number", static_cast<int>(core));
      reading.value = std::to_string(zone.coreReadings[core]);
      element.AddChild(std::move(reading));
    }
    entry.AddChild(std::move(element));
    results.AddChild(std::move(entry));
  }
  parent.AddChild(std::move(results));
}

}  // namespace panelglow
