#include "board/base/IniReader.h"

#include <limits>
#include <set>
#include <type_traits>
#include <utility>

#include "harness/base/CDMUtil.h"
#include "harness/base/Notices.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr const char* kCommonSection = "Common";
constexpr const char* kUndef = "undef";
constexpr const char* kBaseKey = "base";

std::string PlaceOf(const std::string& file, const std::string& section, const std::string& key) {
  return file + ", section [" + section + "], key \"" + key + "\"";
}

// The system's section, then the common one. IniFile's fallback to "en_US" holds for both: a section of that name is
// no section of a board, and no file has one.
Setting ValueIn(const std::string& path, const std::string& section, const std::string& key) {
  const IniFile file(path);
  for (const std::string& place : {section, std::string(kCommonSection)}) {
    if (std::string value = file.GetValue(place, key); !value.empty()) {
      return {std::move(value), PlaceOf(path, place, key)};
    }
  }
  return {};
}

bool HasSection(const std::string& path, const std::string& section) {
  return !IniFile(path).GetSection(section, "").empty();
}

}  // namespace

// Making the reader touches no file: nothing that can wait may happen while a static object is being built.
IniReader& IniReader::Instance() {
  static IniReader reader;
  return reader;
}

IniReader& IniReader::Instance(const std::string& systemId, const std::string& detectIni, const std::string& testIni,
                               const std::string& chipIni) {
  IniReader& reader = Instance();
  Sources sources = WithPresence({detectIni, systemId, testIni, chipIni});
  const std::lock_guard<std::mutex> lock(reader.guard);
  reader.sources = std::move(sources);
  return reader;
}

IniReader::IniReader(const std::string& systemId, const std::string& detectIni, const std::string& testIni,
                     const std::string& chipIni)
    : sources(WithPresence({detectIni, systemId, testIni, chipIni})) {}

IniReader::Sources IniReader::WithPresence(Sources from) {
  from.testIniPresent = CDMUtil::FileExists(from.testIniPath);
  from.chipIniPresent = CDMUtil::FileExists(from.chipIniPath);
  return from;
}

IniReader::Sources IniReader::GetSources() {
  {
    const std::lock_guard<std::mutex> lock(guard);
    if (sources) {
      return *sources;
    }
  }
  const Sources defaults = WithPresence({});
  const std::lock_guard<std::mutex> lock(guard);
  return sources ? *sources : sources.emplace(defaults);
}

IniReader::Result IniReader::Judge(const std::string& raw, std::string place) {
  if (raw.empty()) {
    return {};
  }
  std::string text = raw.substr(0, raw.find(';'));
  return text == kUndef ? Result{kUndefined, "", std::move(place)}
                        : Result{kFound, std::move(text), std::move(place)};
}

// File order comes before section order: a value in the test file's common section wins over one in the detection
// file's system section.
IniReader::Result IniReader::LookUp(const Sources& from, const std::string& key) {
  Setting value;
  if (from.testIniPresent) {
    value = ValueIn(from.testIniPath, from.section, key);
  }
  if (value.text.empty()) {
    value = ValueIn(from.detectIniPath, from.section, key);
  }
  return Judge(value.text, std::move(value.place));
}

IniReader::Result IniReader::LookUpChip(const std::string& chipSection, const std::string& key) {
  const Sources from = GetSources();
  Result layered = LookUp(from, "chip." + chipSection + "." + key);
  if (layered.status != kNotFound || !from.chipIniPresent) {
    return layered;
  }
  const IniFile file = GetChipFile(from.chipIniPath);
  std::set<std::string> visited;
  std::string at = chipSection;
  std::string before;
  // A chain that comes back to a section it has been in would never end: it ends there without a value.
  while (!at.empty() && visited.insert(CDMUtil::ToLower(at)).second) {
    const std::string value = file.GetValue(at, key);
    if (!value.empty()) {
      return Judge(value, PlaceOf(from.chipIniPath, at, key));
    }
    std::string base = file.GetValue(at, kBaseKey);
    if (base.empty() && !before.empty()) {
      TellOfMissingBase(file, before, from.chipIniPath, at);
    }
    before = std::exchange(at, std::move(base));
  }
  return {};
}

void IniReader::TellOfMissingBase(const IniFile& file, const std::string& from, const std::string& path,
                                  const std::string& base) const {
  if (IniFile(file).GetSection(base, "").empty()) {
    Notices::Tell(PlaceOf(path, from, kBaseKey) + ": there is no section [" + base + "].");
  }
}

IniFile IniReader::GetChipFile(const std::string& path) {
  {
    const std::lock_guard<std::mutex> lock(guard);
    if (chipFile) {
      return *chipFile;
    }
  }
  const IniFile opened(path);
  const std::lock_guard<std::mutex> lock(guard);
  return chipFile ? *chipFile : chipFile.emplace(opened);
}

void IniReader::Record(const std::string& entry, const std::string& value) {
  const std::lock_guard<std::mutex> lock(guard);
  lookups[entry] = value;
}

std::string IniReader::ReadText(const Result& result, const std::string& entry, const std::string& defaultValue) {
  switch (result.status) {
    case kFound:
      Record(entry, result.text);
      return result.text;
    case kUndefined:
      Record(entry, "(undef)");
      return {};
    case kNotFound:
      break;
  }
  Record(entry, defaultValue + " (dflt)");
  return defaultValue;
}

template <class Number>
Number IniReader::ReadNumber(const Result& result, const std::string& entry, Number defaultValue, unsigned bits) {
  Number value = defaultValue;
  if (result.status == kFound) {
    constexpr bool kSigned = std::is_signed_v<Number>;
    const std::string trimmed = CDMUtil::Trim(result.text);
    value = kSigned ? static_cast<Number>(CDMUtil::ToInt(trimmed))
                    : static_cast<Number>(CDMUtil::ToUnsignedLong(trimmed));
    const bool limited = kSigned && bits == 32 && CDMUtil::ToInt64(trimmed) > std::numeric_limits<int>::max();
    const std::uint32_t kept = static_cast<std::uint32_t>(value) & (bits < kIntBits ? (1U << bits) - 1 : ~0U);
    CheckNumber(trimmed, limited ? kIntBits : bits, kept, {result.text, result.place});
  } else if (result.status == kUndefined) {
    Record(entry, "(undef)");
    return 0;
  }
  Record(entry, CDMUtil::ToHexString(static_cast<int>(value)) + (result.status == kNotFound ? " (dflt)" : ""));
  return value;
}

std::string IniReader::ReadIniValue(const std::string& key, status_t& status, const std::string& defaultValue) {
  const Sources from = GetSources();
  const Result result = LookUp(from, key);
  status = result.status;
  return ReadText(result, from.section + " " + key, defaultValue);
}

int IniReader::ReadIniInt(const std::string& key, status_t& status, int defaultValue) {
  const Sources from = GetSources();
  const Result result = LookUp(from, key);
  status = result.status;
  return ReadNumber(result, from.section + " " + key, defaultValue, kIntBits);
}

unsigned int IniReader::ReadIniUnsigned(const std::string& key, status_t& status, unsigned int defaultValue,
                                        unsigned bits) {
  const Sources from = GetSources();
  const Result result = LookUp(from, key);
  status = result.status;
  return ReadNumber(result, from.section + " " + key, defaultValue, bits);
}

std::string IniReader::ReadChipValue(const std::string& chipSection, const std::string& key, status_t& status,
                                     const std::string& defaultValue) {
  const Result result = LookUpChip(chipSection, key);
  status = result.status;
  return ReadText(result, chipSection + " " + key, defaultValue);
}

int IniReader::ReadChipInt(const std::string& chipSection, const std::string& key, status_t& status, int defaultValue,
                           unsigned bits) {
  const Result result = LookUpChip(chipSection, key);
  status = result.status;
  return ReadNumber(result, chipSection + " " + key, defaultValue, bits);
}

Setting IniReader::ReadIniSetting(const std::string& key, const std::string& defaultValue) {
  const Sources from = GetSources();
  Result result = LookUp(from, key);
  return {ReadText(result, from.section + " " + key, defaultValue), std::move(result.place)};
}

Setting IniReader::ReadChipSetting(const std::string& chipSection, const std::string& key,
                                   const std::string& defaultValue) {
  Result result = LookUpChip(chipSection, key);
  return {ReadText(result, chipSection + " " + key, defaultValue), std::move(result.place)};
}

// ---- for people

std::string IniReader::DescribeSections() {
  const Sources from = GetSources();
  std::string has;
  std::string lacks;
  for (const std::string& path : {from.detectIniPath, from.testIniPath}) {
    std::string& list = HasSection(path, from.section) ? has : lacks;
    list += (list.empty() ? "" : " and ") + path;
  }
  return "section [" + from.section + "] is " + (has.empty() ? "" : "in " + has) +
         (has.empty() || lacks.empty() ? "" : ", ") + (lacks.empty() ? "" : "not in " + lacks);
}

std::string IniReader::MissingKeys(const std::string& chipSection, const std::string& beginning) {
  const std::string first = chipSection + " " + beginning;
  const std::lock_guard<std::mutex> lock(guard);
  std::string keys;
  for (auto entry = lookups.lower_bound(first); entry != lookups.end() && entry->first.starts_with(first); ++entry) {
    if (entry->second.ends_with(" (dflt)") || entry->second == "(undef)") {
      keys += (keys.empty() ? "" : ", ") + entry->first.substr(chipSection.size() + 1);
    }
  }
  return keys;
}

bool IniReader::HasChipSection(const std::string& chipSection) {
  const Sources from = GetSources();
  return from.chipIniPresent && !GetChipFile(from.chipIniPath).GetSection(chipSection, "").empty();
}

void IniReader::DumpLookups() {
  std::string text = "motherboard.lib input data (chip.ini:" + std::string(IsChipIniPresent() ? "1" : "0") + "):\n";
  {
    const std::lock_guard<std::mutex> lock(guard);
    for (const auto& [entry, value] : lookups) {
      text += entry + " = " + value + "\n";
    }
  }
  platform::TheHost().console.Write(text);
}

void IniReader::ForgetLookups() {
  const std::lock_guard<std::mutex> lock(guard);
  lookups.clear();
}

// ---- free functions

std::string ReadIniValue(const std::string& key, IniReader::status_t& status, const std::string& defaultValue) {
  return IniReader::Instance().ReadIniValue(key, status, defaultValue);
}

std::string ReadIniValue(const std::string& key, const std::string& defaultValue) {
  IniReader::status_t status = IniReader::kNotFound;
  return ReadIniValue(key, status, defaultValue);
}

int ReadIniInt(const std::string& key, int defaultValue) {
  IniReader::status_t status = IniReader::kNotFound;
  return IniReader::Instance().ReadIniInt(key, status, defaultValue);
}

unsigned int ReadIniUnsigned(const std::string& key, unsigned int defaultValue) {
  IniReader::status_t status = IniReader::kNotFound;
  return IniReader::Instance().ReadIniUnsigned(key, status, defaultValue);
}

std::uint8_t ReadIniByte(const std::string& key, std::uint8_t defaultValue) {
  IniReader::status_t status = IniReader::kNotFound;
  return static_cast<std::uint8_t>(IniReader::Instance().ReadIniUnsigned(key, status, defaultValue, 8));
}

std::uint16_t ReadIniWord(const std::string& key, std::uint16_t defaultValue) {
  IniReader::status_t status = IniReader::kNotFound;
  return static_cast<std::uint16_t>(IniReader::Instance().ReadIniUnsigned(key, status, defaultValue, 16));
}

std::uint16_t ReadIniWordUnlessZero(const std::string& key, std::uint16_t defaultValue) {
  const std::uint16_t value = ReadIniWord(key, defaultValue);
  return value == 0 ? defaultValue : value;
}

std::uint32_t ReadIniUnsignedUnlessZero(const std::string& key, std::uint32_t defaultValue) {
  const std::uint32_t value = ReadIniUnsigned(key, defaultValue);
  return value == 0 ? defaultValue : value;
}

std::string ReadChipValue(const std::string& chipSection, const std::string& key, const std::string& defaultValue) {
  IniReader::status_t status = IniReader::kNotFound;
  return IniReader::Instance().ReadChipValue(chipSection, key, status, defaultValue);
}

Setting ReadChipSetting(const std::string& chipSection, const std::string& key, const std::string& defaultValue) {
  return IniReader::Instance().ReadChipSetting(chipSection, key, defaultValue);
}

int ReadChipInt(const std::string& chipSection, const std::string& key, int defaultValue) {
  IniReader::status_t status = IniReader::kNotFound;
  return IniReader::Instance().ReadChipInt(chipSection, key, status, defaultValue);
}

std::uint8_t ReadChipByte(const std::string& chipSection, const std::string& key, std::uint8_t defaultValue) {
  IniReader::status_t status = IniReader::kNotFound;
  return static_cast<std::uint8_t>(IniReader::Instance().ReadChipInt(chipSection, key, status, defaultValue, 8));
}

std::uint16_t ReadChipWord(const std::string& chipSection, const std::string& key, std::uint16_t defaultValue) {
  IniReader::status_t status = IniReader::kNotFound;
  return static_cast<std::uint16_t>(IniReader::Instance().ReadChipInt(chipSection, key, status, defaultValue, 16));
}

std::uint32_t ReadChipDword(const std::string& chipSection, const std::string& key, std::uint32_t defaultValue) {
  IniReader::status_t status = IniReader::kNotFound;
  return static_cast<std::uint32_t>(
      IniReader::Instance().ReadChipInt(chipSection, key, status, static_cast<int>(defaultValue), 32));
}

}  // namespace panelglow
