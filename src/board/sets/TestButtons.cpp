#include "board/sets/TestButtons.h"

#include <algorithm>

#include "board/base/IniReader.h"
#include "board/sets/ReadSettings.h"
#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {

TestButton ReadButton(const std::string& prefix) {
  const auto port = [&](const char* key) {
    IniReader::status_t status = IniReader::kNotFound;
    return static_cast<std::uint16_t>(IniReader::Instance().ReadIniUnsigned(prefix + key, status, 0, 16));
  };
  TestButton button;
  button.address = port(".address");
  button.offset = port(".offset");
  IniReader::status_t status = IniReader::kNotFound;
  button.mask = IniReader::Instance().ReadIniUnsigned(prefix + ".mask", status, 0);
  const Setting type = IniReader::Instance().ReadIniSetting(prefix + ".data_type", "state");
  if (type.text != "state" && type.text != "status") {
    TellOf(type, "\"" + type.text + "\" is neither state nor status and counts as state");
  }
  button.dataType = type.text == "status" ? TestButton::DataType::kStatus : TestButton::DataType::kState;
  button.gpio = ReadLineNumber(prefix + ".gpio").line;
  button.stateGpio = ReadLineNumber(prefix + ".state_gpio").line;
  button.statusGpio = ReadLineNumber(prefix + ".status_gpio").line;
  button.reverseLogic = ReadYesNo(prefix + ".reverse_logic", false);
  return button;
}

int LineOf(const TestButton& button) {
  const int own = button.dataType == TestButton::DataType::kStatus ? button.statusGpio : button.stateGpio;
  return own == LineSetting::kNone ? button.gpio : own;
}

std::uint16_t PortOf(const TestButton& button) { return static_cast<std::uint16_t>(button.address + button.offset); }

}  // namespace

bool TestButtons::Load() {
  buttons.clear();
  current.reset();
  for (int n = 1;; ++n) {
    const std::string prefix = "test.button." + CDMUtil::ToString(n);
    const std::string name = ReadIniValue(prefix + ".name", "");
    if (name.empty()) {
      return true;
    }
    if (!SaysNo(prefix)) {
      TestButton button = ReadButton(prefix);
      button.name = name;
      button.chip = ReadChipName(prefix + ".chip", "", chipOf);
      buttons.push_back(std::move(button));
    }
  }
}

bool TestButtons::Select(const std::string& name) {
  const auto found =
      std::find_if(buttons.begin(), buttons.end(), [&](const TestButton& button) { return button.name == name; });
  if (found != buttons.end()) {
    current = *found;
  }
  return found != buttons.end();
}

bool TestButtons::GetState(const std::string& name, bool& pressed) {
  if (!Select(name)) {
    return false;
  }
  const bool isLatched = current->dataType == TestButton::DataType::kStatus && LineOf(*current) == LineSetting::kNone;
  return isLatched ? ReadLatch(pressed) : Read(pressed);
}

bool TestButtons::ReadDirect(bool& value) {
  if (!current) {
    return false;
  }
  Chip& chip = chipOf(current->chip);
  const int line = LineOf(*current);
  if (line == LineSetting::kNone) {
    return chip.ReadLatchedPort(PortOf(*current), current->mask, value);
  }
  const int state = chip.ReadLine(line);
  value = state == Chip::kNoSuchLine ? value : state == Chip::kAsserted;
  return state != Chip::kNoSuchLine;
}

bool TestButtons::Read(bool& pressed) {
  bool value = false;
  const bool done = ReadDirect(value);
  pressed = done ? value != current->reverseLogic : pressed;
  return done;
}

bool TestButtons::ReadLatch(bool& value) {
  return current && chipOf(current->chip).ReadLatchedPortDword(PortOf(*current), current->mask, value);
}

}  // namespace panelglow
