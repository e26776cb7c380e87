#include "board/sets/HoodSwitch.h"

#include "board/base/IniReader.h"
#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {

const std::string kDetect = "detect.hoodswitch";
const std::string kTest = "test.hoodswitch";

}  // namespace

bool HoodSwitch::Load() {
  line = {.chip = {},
          .gpio = ReadLineNumber(kDetect + ".gpio"),
          .bit = CDMUtil::Trim(ReadIniValue(kDetect + ".gpio.bit", "")),
          .clearBit = CDMUtil::Trim(ReadIniValue(kDetect + ".gpio.clearbit", "")),
          .reversed = ReadYesNo(kDetect + ".reversedlogic", false)};
  const Setting offset = IniReader::Instance().ReadIniSetting(kDetect + ".gpio.offset", "");
  line.useOffset = !offset.text.empty() && !line.bit.empty();
  if (offset.text.empty() != line.bit.empty()) {
    const bool hasOffset = !offset.text.empty();
    TellOf(hasOffset ? offset : IniReader::Instance().ReadIniSetting(kDetect + ".gpio.bit", ""),
           "it counts only with \"" + kDetect + (hasOffset ? ".gpio.bit\"" : ".gpio.offset\""));
  }
  line.offset = line.useOffset ? WideNumberIn(CDMUtil::Trim(offset.text), offset) : 0;
  line.chip = ReadChipName(kDetect + ".chip", "ich", chipOf, line.useOffset || line.gpio.isSet);
  latch = {.chip = {},
           .isConfigBit = !ReadIniValue(kTest + ".ldn", "").empty(),
           .ldn = ReadIniByte(kTest + ".ldn", 0),
           .reg = ReadIniByte(kTest + ".reg", 0),
           .bit = ReadIniInt(kTest + ".bit", 0),
           .gpio = ReadLineNumber(kTest + ".gpio"),
           .reversed = ReadYesNo(kTest + ".reversedlogic", false)};
  latch.chip = ReadChipName(kTest + ".chip", line.chip, chipOf, latch.isConfigBit || latch.gpio.isSet);
  return true;
}

bool HoodSwitch::Read(bool& value) {
  if (!line.useOffset && !line.gpio.isSet) {
    return false;
  }
  Chip& chip = chipOf(line.chip);
  const int state =
      line.useOffset ? chip.ReadLineByNames(line.offset, line.bit, line.clearBit) : chip.ReadLine(line.gpio.line);
  if (state == Chip::kNoSuchLine) {
    return false;
  }
  value = (state == Chip::kAsserted) != line.reversed;
  return true;
}

// A chip's configuration bit has nothing that could be cleared.
bool HoodSwitch::ReadLatch(bool clearFirst, bool& value) {
  if (!latch.isConfigBit && !latch.gpio.isSet) {
    return false;
  }
  Chip& chip = chipOf(latch.chip);
  bool read = false;
  const bool done = latch.isConfigBit ? chip.ReadConfigBit(latch.ldn, latch.reg, latch.bit, read)
                                      : chip.ReadIntrusionLatch(latch.gpio.line, clearFirst, read);
  value = done ? read != latch.reversed : value;
  return done;
}

}  // namespace panelglow
