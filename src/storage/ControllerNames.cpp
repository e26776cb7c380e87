#include "storage/ControllerNames.h"

#include <list>

#include "harness/base/CDMout.h"
#include "storage/ControllerSection.h"
#include "storage/MSUtils.h"

namespace panelglow {

std::string ControllerNames::Find(const ControllerIds& ids) {
  if (iniFile_.empty()) {
    return {};
  }
  if (!loaded_) {
    Load();
  } else {
    for (const std::string& warning : warnings_) {
      CDMout::LogMessage(LogOptions::Debug, kFreeText, warning);
    }
  }
  const auto found = names_.find(ids);
  return found == names_.end() ? std::string() : found->second;
}

void ControllerNames::Load() {
  std::list<CTRL_INFO> records;
  MSUtils::LoadInfoForControllersInSystem(records, iniFile_, kSataSection, true, &warnings_);
  MSUtils::LoadInfoForControllersInSystem(records, iniFile_, kSasSection, false, &warnings_);
  MSUtils::CopyControllerListInfo(records);
  for (const CTRL_INFO& record : records) {
    names_.emplace(record.Ids(), record.name);  // the first of equal ones counts
  }
  loaded_ = true;
}

}  // namespace panelglow
