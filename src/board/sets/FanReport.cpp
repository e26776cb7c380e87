#include "board/sets/FanReport.h"

#include <array>

#include "board/sets/ReadSettings.h"
#include "config/XmlObject.h"

namespace panelglow {

namespace {

constexpr std::size_t kStars = 52;

enum Verdict : std::size_t { kNoError, kLessThanMin, kGreaterThanMax, kNotTested };
using Words = std::array<const char*, 4>;  // by Verdict

constexpr Words kWords{"NoErr", "LessThanMin", "GreaterThanMax", "NotTested"};
constexpr Words kExtendedWords{"NoErr", "Less_Than_MinimumLimit", "Higher_Than_MaximumLimit", "NotTested"};

// One of the three tests of a fan.
struct FanTest {
  FanReading column;
  bool Fan::*tested;
  FanLimits Fan::*limits;
  const char* element;                // in the XML results
  std::array<const char*, 4> labels;  // lower limit, upper limit, reading, verdict
};

constexpr std::array<FanTest, 3> kTests{{{FanReading::kNominal,
                                          &Fan::nominalTest,
                                          &Fan::nominal,
                                          "nominal",
                                          {"NominalMin=", "NominalMax=", "NominalAct=", "NominalErr="}},
                                         {FanReading::kFull,
                                          &Fan::fullTest,
                                          &Fan::full,
                                          "full",
                                          {"FullMinLimit=", "FullMaxLimit=", "FullMinAct=", "FullMinErr="}},
                                         {FanReading::kPwm,
                                          &Fan::pwmTest,
                                          &Fan::pwm,
                                          "pwm",
                                          {"PWMSpeedMin=", "PWMSpeedMax=", "PWMSpeedAct=", "PWMSpeedErr="}}}};

int ReadingOf(const Fan& fan, const FanTest& test) { return fan.readings[static_cast<std::size_t>(test.column)]; }

Verdict Judge(const Fan& fan, const FanTest& test) {
  const int rpm = ReadingOf(fan, test);
  if (!fan.present || !fan.tested || !(fan.*test.tested) || rpm == kNotRead) {
    return kNotTested;
  }
  const FanLimits& limits = fan.*test.limits;
  return rpm < limits.min ? kLessThanMin : rpm > limits.max ? kGreaterThanMax : kNoError;
}

}  // namespace

void WriteFanLog(const LineSink& write, const std::vector<Fan>& fans, const std::string& group, FanLogForm form) {
  const bool isExtended = form == FanLogForm::kExtended;
  write(std::string(kStars, '*'));
  write((isExtended ? "HALCYON Fan Speed Test " : "Halcyon Fan Speed Test ") + TimeStamp());
  write("TestGroup=" + group);
  write("NumberOfFans=" + std::to_string(fans.size()));
  for (const Fan& fan : fans) {
    write("fanName=" + fan.name);
    for (const FanTest& test : kTests) {
      const Words& words = isExtended && test.column == FanReading::kFull ? kExtendedWords : kWords;
      const FanLimits& limits = fan.*test.limits;
      write(test.labels[0] + std::to_string(limits.min));
      write(test.labels[1] + std::to_string(limits.max));
      write(test.labels[2] + std::to_string(ReadingOf(fan, test)));
      write(test.labels[3] + std::string(words[Judge(fan, test)]));
    }
  }
  write(std::string(kStars, '*'));
}

void WriteFanResults(XmlObject& parent, const std::vector<Fan>& fans) {
  XmlObject results;
  results.name = "fantestresults";
  for (const Fan& fan : fans) {
    XmlObject entry;
    entry.name = "fantestresult";
    entry.SetAttribute("timestamp", fan.readingTime);
    XmlObject element;
    element.name = "fan";
    element.SetAttribute("name", fan.name);
    for (const FanTest& test : kTests) {
      XmlObject result;
      result.name = test.element;
      result.SetAttribute("test", kWords[Judge(fan, test)]);
      result.SetAttribute("actual", ReadingOf(fan, test));
      element.AddChild(std::move(result));
    }
    entry.AddChild(std::move(element));
    results.AddChild(std::move(entry));
  }
  parent.AddChild(std::move(results));
}

}  // namespace panelglow
