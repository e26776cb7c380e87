// Fans: what the files make of them, whose chip is asked for what, and that one bad fan or chip stops nothing else.
#include "board/sets/FanSet.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "board/SetBench.h"
#include "board/sets/FanReport.h"
#include "config/XmlObject.h"

namespace panelglow {
namespace {

using ::testing::ElementsAre;
using ::testing::EndsWith;
using ::testing::HasSubstr;

constexpr const char* kFans =
    "detect.fan.1.name=CPU\ndetect.fan.1.tach.chip=a\ndetect.fan.1.tach.index=2\ndetect.fan.1.tach.multiplier=3\n"
    "detect.fan.1.pwm.chip=a\ndetect.fan.1.pwm.index=4\n"
    "test.fan.1.pwm.duty=70\ntest.fan.1.nominal.min=100\ntest.fan.1.nominal.max=200\n"
    "detect.fan.2.name=Gone\ndetect.fan.2=no\n"
    "detect.fan.3.name=Rear\ndetect.fan.3.tach.chip=b\ndetect.fan.3.tach.index=1\n"
    "detect.fan.3.pwm.chip=b\ndetect.fan.3.pwm.index=1\ndetect.fan.3.cfg_reg.syntheticmode=yes\n"
    "detect.fan.3.cfg_reg.index=7\ntest.fan.3.full=no\n"
    "detect.fan.4.name=Idle\ndetect.fan.4.tach.chip=c\ntest.fan.4=no\n"
    "detect.fan.5.name=Top\ndetect.fan.5.tach.chip=a\ndetect.fan.5.pwm.chip=a\ndetect.fan.5.tach.index=1\n"
    "detect.fan.7.name=Behind a gap\n";

FanSet Loaded(SetBench& bench) {
  FanSet fans(bench.Finder());
  fans.Load();
  bench.Notes();
  return fans;
}

std::string Numbers(const FanSet& fans) {
  std::string text;
  for (const Fan& fan : fans.List()) {
    text += std::to_string(fan.index) + (fan.tested ? "" : "-") + (fan.nominalTest ? "n" : "") +
            (fan.pwmTest ? "p" : "") + (fan.fullTest ? "f" : "") + " ";
  }
  return text;
}

TEST(FanSet, TheFilesSayWhichFansThereAreAndWhatIsTestedOfThem) {
  struct Case {
    const char* more;
    const char* loaded;
    const char* told;  // after SetTests(full: no, pwm: yes, nominal: no)
  };
  const Case kCases[] = {
      {"", "1npf 3np 4-npf 5npf ", "1npf 3np 4-npf 5npf "},
      {"detect.fans=no\n", "", ""},
      {"test.fans.pwm=no\ntest.fan.1.pwm=yes\n", "1npf 3n 4-nf 5nf ", "1npf 3n 4-nf 5nf "},
      {"test.fans.full=yes\ntest.fans.pwm=yes\ntest.fan.5.pwm=no\n", "1npf 3np 4-npf 5nf ", "1np 3np 4-np 5np "},
      {"test.fans.nominal=yes\n", "1npf 3np 4-npf 5npf ", "1pf 3p 4-pf 5pf "},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.more);
    SetBench bench(std::string(kFans) + c.more);
    FanSet fans = Loaded(bench);
    EXPECT_EQ(Numbers(fans), c.loaded);
    fans.SetTests(false, true, false);
    EXPECT_EQ(Numbers(fans), c.told);
  }
  SetBench bench("detect.fan.1.name=Bare\n");
  const FanSet fans = Loaded(bench);
  const Fan& fan = fans.List().at(0);
  EXPECT_EQ(std::tuple(fan.gpio, fan.tachMultiplier, fan.pwmDutyDetect, fan.pwmDuty, fan.nominal.min, fan.full.max),
            std::tuple(-1, 1, 100, 50, 9, 99999));
  EXPECT_EQ(fan.detectionStatus, "ERROR: no detection performed");
}

TEST(FanSet, EachOperationAsksTheChipsOfTheFansUnderTest) {
  SetBench bench(kFans);
  FanSet fans = Loaded(bench);
  bench["a"].speeds = {{2, 150}};
  EXPECT_FALSE(fans.ReadAll());  // all but the first stand
  EXPECT_EQ(bench.Notes(), "a:rpm 2x3 b:rpm 1x1 a:rpm 1x1 ");
  fans.SetAllFull();
  EXPECT_EQ(bench.Notes(), "a:full 4 a:full 0 ");
  fans.SetAllPwm();
  EXPECT_EQ(bench.Notes(), "a:70% 4 b:50% 1 a:50% 0 ");
  EXPECT_FALSE(fans.SetPwm(4));  // of the plain chip
  for (const auto& [walk, notes] : {std::pair{&FanSet::SaveStates, "a:save b:save "},
                                    std::pair{&FanSet::RestoreStates, "a:restore b:restore "}}) {
    (fans.*walk)();
    EXPECT_EQ(bench.Notes(), notes);
  }
  fans.SetManualMode(true);
  EXPECT_EQ(bench.Notes(), "a:manual b:manual ");
  const auto start = bench.bench.machine.Time().Now();
  fans.TakeControl();
  EXPECT_EQ(bench.bench.machine.Time().Now() - start, 750'000U);
  fans.ReleaseControl();
  EXPECT_EQ(bench.Notes(), "b:keep 7 b:take 7 b:give 7 ");
  SetBench readers("detect.fan.1.name=F\ndetect.fan.1.tach.chip=a\n");
  FanSet undriven = Loaded(readers);
  undriven.SetManualMode(true);
  EXPECT_EQ(readers.Notes(), "");
}

TEST(FanSet, ABrokenChipDoesNotKeepTheOthersFromBeingGivenBack) {
  SetBench bench(kFans);
  FanSet fans = Loaded(bench);
  bench["a"].breaks = true;
  EXPECT_THROW(fans.RestoreStates(), mblib_exception);
  EXPECT_EQ(bench.Notes(), "a:restore b:restore ");
}

TEST(FanSet, ReadingsGoIntoTheirColumn) {
  SetBench bench(kFans);
  FanSet fans = Loaded(bench);
  bench["a"].speeds = {{2, 150}, {1, 99}};
  for (const std::uint32_t wrong : {3U, 0xFFFFFFFFU}) {
    EXPECT_FALSE(fans.SetActiveReadingSet(wrong));
  }
  EXPECT_TRUE(fans.SetActiveReadingSet(2));
  fans.ReadAll();
  EXPECT_TRUE(fans.SetActiveReadingSet(0));
  for (const int none : {0, -1, 2, 6, 0x7FFFFFFF}) {
    EXPECT_FALSE(fans.ReadOne(none)) << none;
    EXPECT_FALSE(fans.SetPwm(none)) << none;
  }
  EXPECT_TRUE(fans.ReadOne(5));
  EXPECT_THAT(fans.Find(1)->readings, ElementsAre(-1, -1, 150));
  EXPECT_THAT(fans.Find(3)->readings, ElementsAre(-1, -1, 0));
  EXPECT_THAT(fans.Find(4)->readings, ElementsAre(-1, -1, -1));
  EXPECT_THAT(fans.Find(5)->readings, ElementsAre(99, -1, 99));
  EXPECT_EQ(fans.Find(1)->readingTime.size(), 15U);
  bench["a"].breaks = true;
  EXPECT_THROW(fans.ReadOne(5), mblib_exception);
  EXPECT_THAT(fans.Find(5)->readings, ElementsAre(-1, -1, 99));
}

TEST(FanSet, WaitsForAsLongAsTheFilesSay) {
  const std::tuple<const char*, std::uint64_t, const char*> kCases[] = {
      {"", 5000, ""},
      {"test.fans.stabilizationwait=3\n", 3000, ""},
      {"test.fans.stabilizationwait=0\n", 0, ""},
      {"test.fans.stabilizationwait=-4\n", 0, "wait\": -4 seconds are no wait"}};
  for (const auto& [text, wait_ms, told] : kCases) {
    SetBench bench(text);
    const FanSet fans = Loaded(bench);
    const auto start = bench.bench.machine.Time().Now();
    fans.Wait();
    EXPECT_EQ((bench.bench.machine.Time().Now() - start) / 1000, wait_ms) << text;
    EXPECT_THAT(bench.bench.machine.Errors(), HasSubstr(told));
  }
}

// By a line, turned over or not; without one by what turns, also when it needs a duty for that; one that cannot be
// asked hides nothing.
TEST(FanSet, LooksWhichFansArePluggedIn) {
  const std::pair<std::vector<const char*>, const char*> kFansAndStates[] = {
      {{"gpio=1"}, "true"},
      {{"gpio=2"}, "false"},
      {{"tach.index=4"}, "true"},
      {{"gpio=3"}, "ERROR: device detection failed"},
      {{"tach.index=0"}, "false"},
      {{"tach.index=9"}, "ERROR: device detection failed"},
      {{"gpio=1", "gpio.reversedlogic=yes"}, "false"},
      {{"tach.index=3", "pwm.apply=yes"}, "true"}};
  std::string text;
  int n = 0;
  for (const auto& [keys, unused] : kFansAndStates) {
    const std::string prefix = "detect.fan." + std::to_string(++n) + ".";
    text += prefix + "name=F\n" + prefix + "tach.chip=a\n" + prefix + "gpio.chip=a\n" + prefix + "pwm.chip=a\n";
    for (const char* const key : keys) {
      text += prefix + key + "\n";
    }
  }
  SetBench bench(text);
  FanSet fans = Loaded(bench);
  bench["a"].lines = {{1, 3}, {2, 4}};
  bench["a"].speeds = {{3, 700}, {4, 900}};
  const auto start = bench.bench.machine.Time().Now();
  EXPECT_TRUE(fans.Detect());
  EXPECT_EQ(bench.bench.machine.Time().Now() - start, 5'000'000U);
  for (int i = 0; i < n; ++i) {
    EXPECT_EQ(fans.Find(i + 1)->detectionStatus, kFansAndStates[i].second) << i;
  }
  const std::string asked = "a:100% 0 a:rpm 4x1 a:rpm 0x1 a:rpm 9x1 a:rpm 3x1 ";
  EXPECT_THAT(bench.Notes(), EndsWith("a:manual " + asked + "a:automatic "));
  fans.SetManualMode(true);
  fans.Detect();
  EXPECT_THAT(bench.Notes(), EndsWith("line 1 " + asked));  // who had the fans has them still
}

TEST(FanSet, GroupsHoldFansThatThereAre) {
  SetBench bench(std::string(kFans) +
                 "test.fans.group.1.name=Front\ntest.fans.group.1.fans=1, 2 5\ntest.fans.group.2.name=None\n");
  FanSet fans = Loaded(bench);
  EXPECT_TRUE(fans.LoadGroups());
  ASSERT_EQ(fans.Groups().size(), 2U);
  EXPECT_THAT(fans.Groups()[0].fans, ElementsAre(1, 5));
  EXPECT_THAT(bench.bench.machine.Errors(), HasSubstr("there is no fan 2"));
  fans.Load();
  EXPECT_TRUE(fans.Groups().empty());
}

TEST(FanReport, SaysOfEachTestWhetherItsLimitsHold) {
  Fan fan;
  fan.present = true;
  fan.name = "CPU";
  fan.nominal = {100, 200};
  fan.full = {300, 400};
  fan.readings = {99, 401, 50};
  fan.pwmTest = false;
  const auto text = [&](FanLogForm form) {
    SetBench bench("");
    std::string lines;
    WriteFanLog([&](const std::string& line) { lines += line + "\n"; }, {fan}, "All", form);
    return lines;
  };
  const std::string log = text(FanLogForm::kPlain);
  EXPECT_THAT(log, ::testing::StartsWith(std::string(52, '*') + "\nHalcyon Fan Speed Test 2024"));
  EXPECT_THAT(log,
              EndsWith("TestGroup=All\nNumberOfFans=1\nfanName=CPU\nNominalMin=100\nNominalMax=200\nNominalAct=99\n"
                       "NominalErr=LessThanMin\nFullMinLimit=300\nFullMaxLimit=400\nFullMinAct=401\n"
                       "FullMinErr=GreaterThanMax\nPWMSpeedMin=9\nPWMSpeedMax=99999\nPWMSpeedAct=50\n"
                       "PWMSpeedErr=NotTested\n" +
                       std::string(52, '*') + "\n"));
  const std::string extended = text(FanLogForm::kExtended);
  EXPECT_THAT(extended, HasSubstr("\nHALCYON Fan Speed Test "));
  EXPECT_THAT(extended, HasSubstr("NominalErr=LessThanMin\n"));
  EXPECT_THAT(extended, HasSubstr("FullMinErr=Higher_Than_MaximumLimit\n"));
  XmlObject parent;
  WriteFanResults(parent, {fan});
  EXPECT_EQ(parent.ToString(true),
            "<fantestresults><fantestresult timestamp=\"\"><fan name=\"CPU\"><nominal test=\"LessThanMin\" "
            "actual=\"99\"/><full test=\"GreaterThanMax\" actual=\"401\"/><pwm test=\"NotTested\" actual=\"50\"/>"
            "</fan></fantestresult></fantestresults>");
}

}  // namespace
}  // namespace panelglow
