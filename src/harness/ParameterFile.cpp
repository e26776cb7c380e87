#include "harness/ParameterFile.h"

#include <exception>
#include <optional>
#include <utility>

#include "config/OrgFileParser.h"
#include "harness/base/CDMException.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"

namespace panelglow {

namespace {

constexpr const char* kSetKey = "ParamSet";

void Log(const std::string& text) { CDMout::LogMessage(LogOptions::Debug, kNote, text); }

bool Exists(OrgFileParser& parser, const std::string& section) {
  Log("Checking section: " + section);
  if (parser.HasSection(section)) {
    return true;
  }
  Log("Section does not exist: " + section);
  return false;
}

// The first of the two sections that exists.
std::optional<std::string> ChooseSection(OrgFileParser& parser, const std::string& ofModel,
                                         const std::string& general) {
  for (const std::string& section : {ofModel, general}) {
    if (Exists(parser, section)) {
      return section;
    }
  }
  Log("ERROR! Sections not found: " + ofModel + ", " + general);
  return std::nullopt;
}

int CountEntries(OrgFileParser& parser, const std::string& section) {
  parser.Reset();
  return parser.ReadSection(section);
}

// The section that holds the parameters: the chosen one, or the one that its only line names.
std::optional<std::string> SectionOfSet(OrgFileParser& parser, const std::string& chosen) {
  const std::string set = parser.ReadValue(chosen, kSetKey) ? parser.GetCurrentValue() : std::string();
  if (set.empty()) {
    return chosen;
  }
  if (CountEntries(parser, chosen) > 1) {
    Log("ParamSet is provided: " + set);
    Log("ERROR! Only one entry is expected in this section when ParamSet key has a value: " + chosen);
    return std::nullopt;
  }
  return set;
}

// What the readers below throw, as text.
std::string ReasonOf(const CDMException& failure) {
  std::string reason = CDMUtil::ToString(failure.code);
  for (const auto& message : failure.GetMessages()) {
    reason += " " + message->GetText();
  }
  return reason;
}

}  // namespace

ParameterFile::ParameterFile(std::string file, std::string wantedSection, std::function<std::string()> modelName)
    : path(std::move(file)), section(std::move(wantedSection)), model(std::move(modelName)) {}

bool ParameterFile::Read(const std::function<void(const std::string&)>& take) const {
  if (!CDMUtil::FileExists(path)) {
    Log("ERROR! Parameter file does not exist: " + path);
    return false;
  }
  std::string reason;
  try {
    return ReadSet(take);
  } catch (int code) {
    reason = CDMUtil::ToString(code);  // of the list file's reader
  } catch (const std::string& text) {
    reason = text;  // of the management service
  } catch (const CDMException& failure) {
    reason = ReasonOf(failure);  // of the firmware's tables
  } catch (const std::exception& failure) {
    reason = failure.what();
  }
  // This happens before anybody could catch it: the run that names the file is refused later.
  Log("ERROR! Parameter file cannot be read: " + CDMUtil::Trim(reason));
  Log("Failed to process parameter file: " + path);
  return false;
}

bool ParameterFile::ReadSet(const std::function<void(const std::string&)>& take) const {
  const std::string ofModel = model() + "_" + section;
  OrgFileParser parser(path);
  const std::optional<std::string> chosen = ChooseSection(parser, ofModel, section);
  if (!chosen) {
    return false;
  }
  const std::optional<std::string> set = SectionOfSet(parser, *chosen);
  if (!set) {
    Log("Failed to process parameter file: " + path);
    return false;
  }
  Log("Reading parameters from section: " + *set);
  if (!parser.HasSection(*set)) {
    Log("ERROR! Section does not exist: " + *set);
    return false;
  }
  if (CountEntries(parser, *set) == 0) {
    Log("WARNING: Section has no parameter listed: " + *set);
  }
  for (const std::string& line : parser.GetLines()) {
    Log("Read from INI file: " + line);
    take(line);
  }
  return true;
}

}  // namespace panelglow
