#include "platform/host_linux/EmptyManagement.h"

namespace panelglow::platform::host_linux {

namespace {

class EmptyConnection : public ManagementConnection {
 public:
  std::optional<std::vector<ManagementRow>> Query(std::u16string_view /*query*/) override { return std::nullopt; }
  ManagementCallResult Call(const ManagementCall& /*call*/) override { return {ManagementCallStep::kGetClass, {}}; }
};

}  // namespace

std::unique_ptr<ManagementConnection> EmptyManagement::Connect(std::string_view /*nameSpace*/,
                                                               ManagementError& /*error*/) {
  return std::make_unique<EmptyConnection>();
}

}  // namespace panelglow::platform::host_linux
