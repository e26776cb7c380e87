// What the mass-storage INI file calls the controllers of this machine, for one discovery.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include "storage/CtrlInfo.h"

namespace panelglow {

class ControllerNames {
 public:
  /// Without a file no controller has a name.
  explicit ControllerNames(std::string iniFile) : iniFile_(std::move(iniFile)) {}

  /// Empty when the file does not name the controller. Reads the file at the first question; at each further one only
  /// the log lines of that reading are written again. Throws what MSUtils::LoadInfoForControllersInSystem throws.
  std::string Find(const ControllerIds& ids);

 private:
  void Load();

  std::string iniFile_;
  bool loaded_ = false;
  std::map<ControllerIds, std::string> names_;
  std::vector<std::string> warnings_;
};

}  // namespace panelglow
