// The libraries that are installed on a simulated machine.
#pragma once

#include <algorithm>
#include <string>
#include <vector>

#include "platform/Modules.h"
#include "platform/sim/base/AsciiCase.h"
#include "platform/sim/base/Scheduler.h"

namespace panelglow::platform::sim {

class SimModules : public Modules {
 public:
  SimModules(const std::vector<std::string>& libraries, Scheduler& scheduler)
      : libraries_(libraries), scheduler_(scheduler) {}

  bool CanLoad(std::string_view file) override {
    constexpr Microseconds kLoadCost_us = 500;
    scheduler_.Spend(kLoadCost_us);
    return std::any_of(libraries_.begin(), libraries_.end(),
                       [file](const std::string& library) { return EqualNames(library, file); });
  }

 private:
  const std::vector<std::string>& libraries_;
  Scheduler& scheduler_;
};

}  // namespace panelglow::platform::sim
