// Temperature zones: whose chip is read how, which limit counts, and what a check counts up.
#include "board/sets/ZoneSet.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "board/SetBench.h"
#include "board/sets/ZoneReport.h"
#include "config/XmlObject.h"

namespace panelglow {
namespace {

using ::testing::AnyOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Not;

std::string Zone(const std::string& keys, int n = 1) {
  const std::string prefix = "test.tempcaution.zone." + std::to_string(n) + ".";
  std::string text = prefix + "name=Z" + std::to_string(n) + "\n";
  std::vector<std::string> lines;
  CDMUtil::Split(keys, lines, "\n");
  for (const std::string& line : lines) {
    text += prefix + line + "\n";
  }
  return text;
}

ZoneSet Loaded(SetBench& bench) {
  ZoneSet zones(bench.Finder());
  zones.Load();
  bench.Notes();
  return zones;
}

TEST(ZoneSet, EachChipIsReadInItsWay) {
  struct Case {
    const char* keys;
    const char* asked;
    int failed;
  };
  const Case kCases[] = {
      {"", "sio:temperature 0 ", 512},
      {"chip=a\nindex=3", "a:temperature 3 ", 512},
      {"chip=videochip\nindex=1", "videochip:temperature 1 ", 512},
      {"chip=acpi", "acpi:core 0 ", 513},
      {"chip=acpi\ncpu.core=true\nindex=1", "acpi:cores 1 ", 513},
      {"chip=casl\nindex=2", "casl:virtual 2 ", 513},
      {"chip=unknown", "", 512},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.keys);
    SetBench bench(Zone(c.keys));
    ZoneSet zones = Loaded(bench);
    EXPECT_EQ(zones.Read(1), c.failed);
    EXPECT_EQ(bench.Notes(), c.asked);
    EXPECT_EQ(zones.Find(1)->readingTime, "");
  }
  SetBench bench(Zone("chip=a"));
  ZoneSet zones = Loaded(bench);
  bench["a"].readings = {44, 0x80};
  EXPECT_EQ(zones.Read(1), 44);
  EXPECT_EQ(zones.Read(1), 300);  // as the chip maps it
  EXPECT_EQ(zones.Find(1)->readingTime.size(), 15U);
}

TEST(ZoneSet, TheLimitIsTheFirstThatTheFilesGive) {
  struct Case {
    const char* keys;
    int threshold;  // of the chip, as the next
    int lowLimit;
    int high;
    int low;
  };
  const Case kCases[] = {
      {"", 100, 50, kNoLimit, kNoLimit},
      {"threshold.adj=5", 100, 50, kNoLimit, kNoLimit},
      {"threshold.high=80\nthreshold.low=3", -1, -1, 80, 3},
      {"threshold.high=80\nthreshold.fix=70\nthreshold.low=3\nthresholdlow.fix=4", -1, -1, 70, 4},
      {"threshold.high=80\nthreshold.tjmax.delta=8", 100, -1, 92, kNoLimit},
      {"threshold.high=80\nthreshold.tjmax.delta=8", -1, -1, 80, kNoLimit},
      {"threshold.delta=-4", 100, 50, 96, kNoLimit},
      {"threshold.delta=2", -1, 50, 71, kNoLimit},
      {"threshold.delta=2\nthreshold.adj=10", -1, 50, 62, kNoLimit},
      {"threshold.delta=2", -1, -1, kNoLimit, kNoLimit},
      {"threshold.tjmax.delta=-2147483648", 100, -1, 2147483647, kNoLimit},
      {"index=0", 95, 7, 95, 7},  // of a graphics card from here
      {"index=allcards", 95, 7, 95, 7},
      {"index=0\nthreshold.delta=-4\nthreshold.low=3", 95, 7, 91, 3},
      {"index=allcards\nthreshold.delta=-4\nthreshold.low=3", 95, 7, 91, 3},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.keys);
    const std::string chip = std::string(c.keys).starts_with("index") ? "videochip" : "a";
    SetBench bench(Zone("chip=" + chip + "\n" + c.keys));
    bench[chip].threshold = c.threshold;
    bench[chip].lowLimit = c.lowLimit;
    ZoneSet zones = Loaded(bench);
    EXPECT_EQ(zones.GetHigh(1), c.high);
    EXPECT_EQ(zones.GetLow(1), c.low);
  }
}

TEST(ZoneSet, TellsWhatItMakesOfTheProcessorsOwnLimit) {
  SetBench bench(Zone("chip=acpi\nthreshold.tjmax.delta=8\ncpu.core.threshold.tjmax.delta=3\nprochot=yes"));
  bench["acpi"].threshold = 100;
  const ZoneSet zones = Loaded(bench);
  EXPECT_EQ(zones.Find(1)->coreHigh, 97);
  std::string lines;
  for (const char* line : {"Z1 : Low or High bit values are missing for Prochot in INI file",
                           "Z1 : Delta value from ini  = 8", "Z1 : TjMax value using MSR = 100",
                           "Z1 : Max threshold value (TjMax - Delta) = 92", "Z1 : Delta value from ini  : 3",
                           "Z1 : TjMax value using MSR : 100", "Z1 : Max threshold value (TjMax - Delta) : 97"}) {
    lines += std::string("LogMessage 14 8 \"") + line + "\" \"\"\n";
  }
  EXPECT_EQ(bench.bench.machine.Output(), lines);
}

TEST(ZoneSet, TellsOfKeysThatItCannotUse) {
  const std::pair<std::string, const char*> kCases[] = {
      {Zone(""), "no chip \"sio\", which counts without the key \"test.tempcaution.chip\""},
      {Zone("") + "test.tempcaution.chip=soi\n", "key \"test.tempcaution.chip\": the board has no chip \"soi\""},
      {Zone("prochot.chip=soi"), "prochot.chip\": the board has no chip \"soi\""},
      {Zone("prochot.offset=0x10000"), "prochot.offset\": there is no register 0x10000"},
      {Zone("prochot.threshold.low.bit=x"), "low.bit\": \"x\" is no number and counts as 0"},
      {Zone("prochot.threshold.high.bit=8"), "high.bit\": a byte has no bit 8"},
      {Zone("threshold.tjmax.delta=8"),
       "no limit by \"test.tempcaution.zone.1.threshold.tjmax.delta\": what the chip \"sio\""},
  };
  for (const auto& [keys, told] : kCases) {
    const SetBench bench(keys);
    Chip plain;
    ZoneSet zones([&](const std::string& /*name*/) -> Chip& { return plain; });
    zones.Load();
    EXPECT_THAT(bench.bench.machine.Errors(), HasSubstr(told));
  }
}

struct Step {
  int reading;  // -1: it fails
  std::vector<int> cores;
  const char* found;  // applied, high, low; in a row high, low; invalid; min, max
};

void Expect(const std::string& keys, const std::vector<Step>& steps) {
  SCOPED_TRACE(keys);
  SetBench bench(Zone(keys));
  ZoneSet zones = Loaded(bench);
  NotedChip& chip = bench[zones.Find(1)->chip];
  for (const Step& step : steps) {
    chip.readings = step.reading == -1 ? std::vector<int>{} : std::vector{step.reading};
    chip.cores = step.cores;
    ZoneCheck check;
    const bool applied = zones.Check(1, check);
    const TempZone& zone = *zones.Find(1);
    EXPECT_EQ(std::string(applied ? "a" : "-") + (check.high ? "h" : "") + (check.low ? "l" : "") + " " +
                  std::to_string(check.consecutiveHigh) + " " + std::to_string(check.consecutiveLow) + " " +
                  std::to_string(check.invalid) + " " + std::to_string(zone.minReading) + " " +
                  std::to_string(zone.maxReading),
              step.found)
        << step.reading;
  }
}

TEST(ZoneSet, ACheckCountsWhatIsBeyondALimitInARow) {
  Expect("chip=a\nthreshold.high=70\nthreshold.low=5", {{70, {}, "a 0 0 0 70 70"},
                                                        {71, {}, "ah 1 0 0 70 71"},
                                                        {-1, {}, "- 1 0 1 512 512"},  // counters stay
                                                        {255, {}, "- 1 0 2 255 255"},
                                                        {72, {}, "ah 2 0 2 72 72"},
                                                        {5, {}, "a 0 0 2 5 72"},
                                                        {4, {}, "al 0 1 2 4 72"},
                                                        {-20, {}, "al 0 2 2 -20 72"},
                                                        {254, {}, "ah 1 0 2 -20 254"}});
  Expect("chip=a", {{100, {}, "- 0 0 0 100 100"}, {-50, {}, "- 0 0 0 -50 100"}});
  Expect("chip=a\nthreshold.high=70", {{-60, {}, "a 0 0 0 -60 -60"}, {71, {}, "ah 1 0 0 -60 71"}});
  // One core is enough, and a zone and its cores count once.
  Expect("chip=acpi\ncpu.core=true\nthreshold.high=70\ncpu.core.threshold.high=80\ncpu.core.threshold.low=10",
         {{60, {50, 81}, "ah 1 0 0 60 60"},
          {71, {90, 60}, "ah 2 0 0 60 71"},
          {60, {9, 80}, "al 0 1 0 60 71"},
          {60, {}, "a 0 1 0 60 71"}});
}

TEST(ZoneSet, ProchotIsReadByItsBits) {
  struct Case {
    const char* low;
    const char* high;
    int value;  // -1: not read
    int status;
  };
  const Case kCases[] = {{"1", "2", 0x02, 3}, {"1", "2", 0x04, 3}, {"1", "2", 0x01, 0}, {"1", "", 0x02, 1},
                         {"", "2", 0x04, 3},  {"", "2", 0x02, 0},  {"", "", 0xFF, 0},   {"1", "2", -1, 0},
                         {"8", "", 0xFF, 0},  {"-1", "", 0xFF, 0}, {"0x3", "", 8, 1}};
  for (const Case& c : kCases) {
    SCOPED_TRACE(std::string(c.low) + "/" + c.high + "/" + std::to_string(c.value));
    SetBench bench(Zone("chip=a\nprochot=yes\nprochot.chip=b\nprochot.offset=0x119\nprochot.threshold.low.bit=" +
                        std::string(c.low) + "\nprochot.threshold.high.bit=" + c.high));
    ZoneSet zones = Loaded(bench);
    bench["b"].environment = c.value;
    EXPECT_EQ(zones.ReadProchot(1), c.status);
    EXPECT_EQ(bench.Notes(), "b:environment 281 ");
    bench["a"].readings = {40, 40};
    ZoneCheck check;
    zones.Check(1, check);
    EXPECT_EQ(check.prochotStatus, c.status);
    bench["b"].environment = 0;
    zones.Check(1, check);
    EXPECT_EQ(check.prochotStatus, 0);
    EXPECT_EQ(zones.Find(1)->prochotStatus, c.status);  // remembered
  }
  SetBench bench(Zone("chip=a\nprochot.chip=b\nprochot.offset=0x10000") + Zone("prochot.offset=-1", 2));
  ZoneSet zones = Loaded(bench);
  EXPECT_EQ(zones.ReadProchot(1) + zones.ReadProchot(2), 0);
  EXPECT_EQ(bench.Notes(), "");
}

TEST(ZoneSet, AZoneThatThereIsNotIsNothing) {
  SetBench bench(Zone("chip=a\nthreshold.high=5"));
  ZoneSet zones = Loaded(bench);
  for (const int none : {0, -1, 2, 0x7FFFFFFF, -0x7FFFFFFF - 1}) {
    ZoneCheck check;
    bool value = false;
    EXPECT_FALSE(zones.Check(none, check) || zones.SetSkipped(none, true) || zones.IsSkipped(none));
    EXPECT_FALSE(zones.JudgeHigh(none, value) || zones.JudgeLow(none, value));
    EXPECT_EQ(zones.Read(none), 512);
    EXPECT_EQ(zones.GetHigh(none) + zones.GetLow(none) + zones.ReadProchot(none), 2 * kNoLimit);
  }
  EXPECT_EQ(bench.Notes(), "");
  EXPECT_TRUE(zones.SetSkipped(1, true));
  EXPECT_TRUE(zones.IsSkipped(1));
}

// A group holds the zones of its keys' numbers, however many a number stands for.
TEST(ZoneSet, AKeyForAllCardsIsAZoneForEach) {
  SetBench bench(Zone("chip=videochip\nindex=allcards\ntype=gpu\nthreshold.high=88") + Zone("chip=a", 2) +
                 "test.tempzones.group.1.name=G\ntest.tempzones.group.1.zones=2,1\n");
  bench["videochip"].threshold = 95;
  bench["videochip"].lowLimit = 7;
  ZoneSet zones = Loaded(bench);
  ASSERT_EQ(zones.Count(), 3);
  EXPECT_EQ(zones.Find(2)->name + zones.Find(3)->name, "Z1 2Z2");
  EXPECT_EQ(zones.Find(2)->index, 1);
  EXPECT_EQ(zones.GetHigh(2), 88);
  EXPECT_TRUE(zones.LoadGroups());
  EXPECT_THAT(zones.Groups().at(0).zones, ElementsAre(3, 1, 2));
  zones.Load();
  EXPECT_TRUE(zones.Groups().empty());
  for (const char* bad : {"", "3", "0", "1,x", "-1"}) {
    SetBench broken(Zone("chip=a") +
                    "test.tempzones.group.1.name=Good\ntest.tempzones.group.1.zones=1\n"
                    "test.tempzones.group.2.name=G\ntest.tempzones.group.2.zones=" +
                    bad + "\n");
    ZoneSet none = Loaded(broken);
    try {
      none.LoadGroups();
      ADD_FAILURE() << bad;
    } catch (const mblib_exception& refused) {
      EXPECT_STREQ(refused.what(), "Missing or invalid Zone Group information");
    }
    EXPECT_TRUE(none.Groups().empty());
  }
}

TEST(ZoneReport, SaysHowEachZoneStands) {
  struct Case {
    const char* keys;
    int reading;  // -1: it fails
    const char* status;
  };
  const Case kCases[] = {{"chip=a\nthreshold.high=60", 60, "NoErr"},
                         {"chip=a\nthreshold.high=60", 61, "OverTempErr"},
                         {"chip=a\nthreshold.low=9", 8, "UnderTempErr"},
                         {"chip=a", -1, "SIOErr"},
                         {"chip=a\nindex=-2", -1, "IniIndexErr"},
                         {"chip=a", 255, "InvalidTempErr"},
                         {"chip=acpi", -1, "ProcessorInfoMissingErr"},
                         {"chip=acpi\nthreshold.tjmax.delta=1", -1, "ProcessorNotInstalledErr"},
                         {"chip=casl", -1, "InvalidData"}};
  for (const Case& c : kCases) {
    SetBench bench(Zone(c.keys));
    bench["acpi"].threshold = 100;
    ZoneSet zones = Loaded(bench);
    EXPECT_EQ(ZoneStatus(*zones.Find(1), zones.Probe()), "NotTested");
    bench[zones.Find(1)->chip].readings = c.reading == -1 ? std::vector<int>{} : std::vector{c.reading};
    ZoneCheck check;
    zones.Check(1, check);
    EXPECT_EQ(ZoneStatus(*zones.Find(1), zones.Probe()), c.status);
    ProbeSettings patient;
    patient.consecutiveHigh = patient.consecutiveLow = 2;
    EXPECT_THAT(ZoneStatus(*zones.Find(1), patient), Not(HasSubstr("rTempErr")));
    bench[zones.Find(1)->chip].breaks = true;
    EXPECT_THROW(zones.Check(1, check), mblib_exception);
    EXPECT_THAT(ZoneStatus(*zones.Find(1), patient), AnyOf("SIOErr", "IniIndexErr"));  // not the one before
    zones.SetSkipped(1, true);
    EXPECT_EQ(ZoneStatus(*zones.Find(1), zones.Probe()), "NotTested");
  }
}

TEST(ZoneReport, WritesTextAndXml) {
  SetBench bench(Zone("chip=acpi\ncpu.core=true\nthreshold.tjmax.delta=8") + Zone("chip=a\nthreshold.delta=1", 2) +
                 "test.tempcaution.proberate=7\ntest.tempcaution.retriesoninvalidtemp=4\n");
  bench["acpi"].threshold = 100;
  ZoneSet zones = Loaded(bench);
  bench["acpi"].readings = {40};
  bench["acpi"].cores = {38, 42};
  ZoneCheck check;
  zones.Check(1, check);
  bench["a"].threshold = 50;  // not asked for a log
  std::string text;
  WriteZoneLog([&](const std::string& line) { text += line + "\n"; }, zones);
  EXPECT_THAT(text, ::testing::StartsWith(std::string(59, '*') + "\nHalcyon Temp Caution Test started:2024"));
  EXPECT_THAT(text, HasSubstr("\nNumberOfZones=2\nZoneName=Z1\nMinReading=40\nMaxReading=40\nThreshold=92\n"
                              "ProbeRate=7\nConsecutiveHighReadings=1\nConsecutiveLowReadings=1\n"
                              "RetriesOnInvalidTemp=4\nStatus=NoErr\nProchotStatus=0\nZoneName=Z2\n"));
  EXPECT_THAT(text, HasSubstr("Status=NotTested\nProchotStatus=0\nTest ended:2024"));
  XmlObject parent;
  WriteZoneResults(parent, zones);
  EXPECT_EQ(parent.GetValue("tempcautiontestresults/tempcautiontestresult/zone", ""), "40");
  const std::string xml = parent.ToString(true);
  EXPECT_THAT(xml,
              HasSubstr("<zone name=\"Z1\" number=\"1\" threshold=\"92\" TJMax=\"100\">40<core number=\"0\">38"));
  EXPECT_THAT(xml, HasSubstr("threshold=\"-9999\" TJMax=\"-9999\">InvalidData</zone>"));
}

}  // namespace
}  // namespace panelglow
