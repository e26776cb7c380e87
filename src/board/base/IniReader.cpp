#include "board/base/IniReader.h"

#include <set>

#include "harness/base/CDMUtil.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr const char* kCommonSection = "Common";
constexpr const char* kUndef = "undef";
constexpr const char* kBaseKey = "base";

std::string ValueIn(const IniFile& file, const std::string& section, const std::string& key) {
  std::string value = file.GetValue(section, key);
  return value.empty() ? file.GetValue(kCommonSection, key) : value;
}

}  // namespace

IniReader& IniReader::Instance() {
  static IniReader reader;
  return reader;
}

IniReader& IniReader::Instance(const std::string& systemId, const std::string& detectIni, const std::string& testIni,
                               const std::string& chipIni) {
  IniReader& reader = Instance();
  reader.Configure(systemId, detectIni, testIni, chipIni);
  return reader;
}

IniReader::IniReader() : IniReader("common", ".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini") {}

IniReader::IniReader(const std::string& systemId, const std::string& detectIni, const std::string& testIni,
                     const std::string& chipIni) {
  Configure(systemId, detectIni, testIni, chipIni);
}

void IniReader::Configure(const std::string& systemId, const std::string& detectIni, const std::string& testIni,
                          const std::string& chipIni) {
  section = systemId;
  detectIniPath = detectIni;
  testIniPath = testIni;
  chipIniPath = chipIni;
  testIniPresent = CDMUtil::FileExists(testIniPath);
  chipIniPresent = CDMUtil::FileExists(chipIniPath);
}

IniReader::Result IniReader::Judge(const std::string& raw) {
  if (raw.empty()) {
    return {};
  }
  std::string text = raw.substr(0, raw.find(';'));
  return text == kUndef ? Result{kUndefined, ""} : Result{kFound, std::move(text)};
}

// File order comes before section order: a value in the test file's common section wins over one in the detection
// file's system section.
IniReader::Result IniReader::LookUp(const std::string& key) const {
  std::string value;
  if (testIniPresent) {
    value = ValueIn(IniFile(testIniPath), section, key);
  }
  return Judge(value.empty() ? ValueIn(IniFile(detectIniPath), section, key) : value);
}

IniReader::Result IniReader::LookUpChip(const std::string& chipSection, const std::string& key) {
  const Result layered = LookUp("chip." + chipSection + "." + key);
  if (layered.status != kNotFound || !chipIniPresent) {
    return layered;
  }
  if (!chipFile) {
    chipFile.emplace(chipIniPath);
  }
  std::set<std::string> visited;
  std::string at = chipSection;
  // A chain that comes back to a section it has been in would never end: it ends there without a value.
  while (!at.empty() && visited.insert(CDMUtil::ToLower(at)).second) {
    const std::string value = chipFile->GetValue(at, key);
    if (!value.empty()) {
      return Judge(value);
    }
    at = chipFile->GetValue(at, kBaseKey);
  }
  return {};
}

std::string IniReader::ReadText(const Result& result, const std::string& entry, const std::string& defaultValue) {
  switch (result.status) {
    case kFound:
      lookups[entry] = result.text;
      return result.text;
    case kUndefined:
      lookups[entry] = "(undef)";
      return {};
    case kNotFound:
      break;
  }
  lookups[entry] = defaultValue + " (dflt)";
  return defaultValue;
}

template <class Number>
Number IniReader::ReadNumber(const Result& result, const std::string& entry, Number defaultValue) {
  Number value = defaultValue;
  if (result.status == kFound) {
    const std::string trimmed = CDMUtil::Trim(result.text);
    value = std::is_signed_v<Number> ? static_cast<Number>(CDMUtil::ToInt(trimmed))
                                     : static_cast<Number>(CDMUtil::ToUnsignedLong(trimmed));
  } else if (result.status == kUndefined) {
    lookups[entry] = "(undef)";
    return 0;
  }
  lookups[entry] = CDMUtil::ToHexString(static_cast<int>(value)) + (result.status == kNotFound ? " (dflt)" : "");
  return value;
}

std::string IniReader::ReadIniValue(const std::string& key, status_t& status, const std::string& defaultValue) {
  const Result result = LookUp(key);
  status = result.status;
  return ReadText(result, section + " " + key, defaultValue);
}

int IniReader::ReadIniInt(const std::string& key, status_t& status, int defaultValue) {
  const Result result = LookUp(key);
  status = result.status;
  return ReadNumber(result, section + " " + key, defaultValue);
}

unsigned int IniReader::ReadIniUnsigned(const std::string& key, status_t& status, unsigned int defaultValue) {
  const Result result = LookUp(key);
  status = result.status;
  return ReadNumber(result, section + " " + key, defaultValue);
}

std::string IniReader::ReadChipValue(const std::string& chipSection, const std::string& key, status_t& status,
                                     const std::string& defaultValue) {
  const Result result = LookUpChip(chipSection, key);
  status = result.status;
  return ReadText(result, chipSection + " " + key, defaultValue);
}

int IniReader::ReadChipInt(const std::string& chipSection, const std::string& key, status_t& status,
                           int defaultValue) {
  const Result result = LookUpChip(chipSection, key);
  status = result.status;
  return ReadNumber(result, chipSection + " " + key, defaultValue);
}

void IniReader::DumpLookups() const {
  std::string text = "motherboard.lib input data (chip.ini:" + std::string(chipIniPresent ? "1" : "0") + "):\n";
  for (const auto& [entry, value] : lookups) {
    text += entry + " = " + value + "\n";
  }
  platform::TheHost().console.Write(text);
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

std::string ReadChipValue(const std::string& chipSection, const std::string& key, const std::string& defaultValue) {
  IniReader::status_t status = IniReader::kNotFound;
  return IniReader::Instance().ReadChipValue(chipSection, key, status, defaultValue);
}

int ReadChipInt(const std::string& chipSection, const std::string& key, int defaultValue) {
  IniReader::status_t status = IniReader::kNotFound;
  return IniReader::Instance().ReadChipInt(chipSection, key, status, defaultValue);
}

}  // namespace panelglow
