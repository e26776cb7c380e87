// Another machine's name in place of what the firmware tells.
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "hw/SMBIOSDiscovery.h"

namespace panelglow::boardtool {

/// As long as it exists, the firmware names this system id and no processors.
class AssumedIdentity {
 public:
  explicit AssumedIdentity(const std::string& systemId)
      : firmware_(SMBIOSDiscovery::Instance()),
        productText_(std::exchange(firmware_.productText, systemId)),
        processors_(std::exchange(firmware_.processors, {})) {}
  ~AssumedIdentity() {
    firmware_.productText = std::move(productText_);
    firmware_.processors = std::move(processors_);
  }
  AssumedIdentity(const AssumedIdentity&) = delete;
  AssumedIdentity& operator=(const AssumedIdentity&) = delete;

 private:
  SMBIOSDiscovery& firmware_;
  std::string productText_;
  std::vector<ProcessorInfo> processors_;
};

}  // namespace panelglow::boardtool
