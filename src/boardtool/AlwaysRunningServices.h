// A service manager where the driver's service runs already.
#pragma once

#include "platform/ServiceManager.h"

namespace panelglow::boardtool {

class AlwaysRunningServices : public platform::ServiceManager {
 public:
  platform::ServiceHandle OpenManager(std::uint32_t /*access*/, std::uint32_t& error) override {
    return Opened(error);
  }
  platform::ServiceHandle OpenService(platform::ServiceHandle /*manager*/, std::string_view /*name*/,
                                      std::uint32_t /*access*/, std::uint32_t& error) override {
    return Opened(error);
  }
  platform::ServiceHandle CreateService(platform::ServiceHandle /*manager*/,
                                        const platform::ServiceDefinition& /*definition*/,
                                        std::uint32_t& error) override {
    return Opened(error);
  }
  std::uint32_t Start(platform::ServiceHandle /*service*/) override { return 0; }
  std::uint32_t Delete(platform::ServiceHandle /*service*/) override { return 0; }
  void Close(platform::ServiceHandle /*handle*/) override {}

 private:
  static platform::ServiceHandle Opened(std::uint32_t& error) {
    error = 0;
    return 1;
  }
};

}  // namespace panelglow::boardtool
