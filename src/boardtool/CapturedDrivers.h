// Stands in front of the machine's driver and keeps what every register was last read as.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "boardtool/HardwareAccess.h"
#include "platform/Host.h"

namespace panelglow::boardtool {

/// A register with what was read there last.
struct CapturedRegister {
  HardwareAccess access;
  unsigned reads = 0;
};

class CapturedDrivers : public platform::DriverDevices {
 public:
  explicit CapturedDrivers(platform::DriverDevices& drivers);

  std::unique_ptr<platform::DriverDevice> Open(std::string_view linkName, std::uint32_t& error) override;

  /// What was read since the last call, each place once, in the order of the first reads.
  [[nodiscard]] std::vector<CapturedRegister> Take();

  struct Log;

 private:
  platform::DriverDevices& drivers_;
  std::shared_ptr<Log> log_;
};

}  // namespace panelglow::boardtool
