#include "board/chips/fin/FinF71863Chip.h"

#include <optional>
#include <set>
#include <string>

#include "board/base/IniReader.h"
#include "board/parts/Sequence.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kMultiFunctionSelect2 = 0x2A;  // lights the LED of the base class

Steps ReadBlinkList(const std::string& key, const std::string& defaultList) {
  Steps steps;
  const Setting setting = IniReader::Instance().ReadIniSetting(key, defaultList);
  for (const auto& [reg, value] : ParsePairs<std::uint8_t>(setting)) {
    steps.push_back(Put({ConfigRegisters::kGlobal, reg}, value));
  }
  return steps;
}

// An empty list blinks nothing.
std::optional<Steps> UnlessEmpty(const Steps& steps) { return steps.empty() ? std::nullopt : std::optional(steps); }

}  // namespace

FinF71863Chip::FinF71863Chip() : FinChip("fin_f71863") {
  ReadSelectKeys();
  SetSelectLed();
  const Steps primary = ReadBlinkList("test.powerled.primary.data_blink", "0x2B:0x20,0x2A:0xC0");
  const Steps secondary = ReadBlinkList("test.powerled.secondary.data_blink", "0x2B:0x40,0x2A:0x30");
  led.saved.clear();
  led.prepared.clear();
  std::set<std::uint8_t> named;
  for (const Steps* list : {&primary, &secondary}) {
    for (const Step& step : *list) {
      led.saved.push_back(step.id);
      named.insert(step.id.reg);
    }
  }
  led.restored = RegistersAt(ConfigRegisters::kGlobal, {named.begin(), named.end()});
  led.blinkGreen = UnlessEmpty(primary);
  led.blinkRed = UnlessEmpty(secondary);
  if (named.count(kMultiFunctionSelect2) == 0) {
    // A register that is not saved is not changed.
    led.green = led.red = led.off = std::nullopt;
  }
}

}  // namespace panelglow
