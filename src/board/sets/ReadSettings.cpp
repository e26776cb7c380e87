#include "board/sets/ReadSettings.h"

#include <algorithm>
#include <array>
#include <ctime>
#include <limits>

#include "board/base/IniReader.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/Notices.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

// Lines with a name.
constexpr int kCaseOpenLine = 238;
constexpr int kIntruderLine = 237;

constexpr const char* kPlainChip = "chip";  // what an unknown name leads to
constexpr const char* kNoChip = "none";     // what a chip is that the board does not have

Setting Read(const std::string& key, const std::string& defaultValue = "") {
  return IniReader::Instance().ReadIniSetting(key, defaultValue);
}

void TellOfWord(const Setting& setting, const char* one, const char* other, const char* counted) {
  if (!setting.text.empty()) {
    TellOf(setting, "\"" + setting.text + "\" is neither " + one + " nor " + other + counted);
  }
}

}  // namespace

bool ReadWord(const std::string& key, const char* word, const char* opposite) {
  const Setting setting = Read(key);
  if (setting.text != word && setting.text != opposite) {
    TellOfWord(setting, word, opposite, (std::string(" and counts as ") + opposite).c_str());
  }
  return setting.text == word;
}

bool ReadYesNo(const std::string& key, bool otherwise) {
  const Setting setting = Read(key);
  if (setting.text == "yes" || setting.text == "no") {
    return setting.text == "yes";
  }
  TellOfWord(setting, "yes", "no", otherwise ? " and counts as yes" : " and counts as no");
  return otherwise;
}

bool SaysNo(const std::string& key) { return !ReadYesNo(key, true); }

bool IsThere(const Chip& chip) { return chip.GetName() != kPlainChip && chip.GetName() != kNoChip; }

std::string ReadChipName(const std::string& key, const std::string& defaultName, const ChipFinder& chipOf,
                         bool isNeeded) {
  const Setting setting = Read(key, defaultName);
  if (!setting.text.empty() && setting.text != kNoChip && !IsThere(chipOf(setting.text))) {
    TellOf(setting, "the board has no chip \"" + setting.text + "\"");
    if (setting.place.empty() && isNeeded) {
      Notices::Tell("The board has no chip \"" + setting.text + "\", which counts without the key \"" + key + "\".");
    }
  }
  return setting.text;
}

int ReadPercent(const std::string& key, int defaultValue) {
  const int percent = ReadIniInt(key, defaultValue);
  const int limited = std::clamp(percent, 0, 100);
  if (limited != percent) {
    TellOf(Read(key), std::to_string(percent) + " percent is no duty and counts as " + std::to_string(limited));
  }
  return limited;
}

std::uint32_t MillisecondsIn(std::int64_t seconds, const Setting& setting) {
  constexpr std::int64_t kLongest_s = std::numeric_limits<std::uint32_t>::max() / 1000;
  const std::int64_t limited = std::clamp<std::int64_t>(seconds, 0, kLongest_s);
  if (limited != seconds) {
    TellOf(setting, std::to_string(seconds) + " seconds are no wait and count as " + std::to_string(limited));
  }
  return static_cast<std::uint32_t>(limited * 1000);
}

LineSetting ReadLineNumber(const std::string& key) {
  const Setting setting = Read(key);
  const std::string text = CDMUtil::Trim(setting.text);
  if (text.empty()) {
    return {};
  }
  if (text == "caseopen" || text == "intruder") {
    return {.line = text == "caseopen" ? kCaseOpenLine : kIntruderLine, .isSet = true, .isSpecial = true};
  }
  const int line = CDMUtil::ToInt(text);
  CheckNumber(text, kIntBits, static_cast<std::uint32_t>(line), setting);
  return {.line = line, .isSet = line != LineSetting::kNone};
}

std::vector<int> NumbersIn(const Setting& list) {
  std::vector<std::string> tokens;
  CDMUtil::Split(list.text, tokens, ", ");
  std::vector<int> numbers;
  for (const std::string& token : tokens) {
    numbers.push_back(CDMUtil::ToInt(token));
    CheckNumber(token, kIntBits, static_cast<std::uint32_t>(numbers.back()), list);
  }
  return numbers;
}

std::string TimeStamp() {
  platform::Clock& clock = platform::TheHost().clock;
  const std::tm now = clock.LocalTime(clock.WallTime());
  std::array<char, 32> text{};
  return {text.data(), std::strftime(text.data(), text.size(), "%Y%m%d %H%M%S", &now)};
}

}  // namespace panelglow
