// Management instrumentation that knows nothing of the machine.
#pragma once

#include "platform/Management.h"

namespace panelglow::platform::host_linux {

/// Every namespace connects, and every query fails, which its callers take for an answer without rows: a machine that
/// tells nothing about itself. A connection that failed instead would be an exception of whoever needs a table, also
/// in the constructors that run before the program can report anything; an empty answer ends in the caller's own
/// result, as "the board is not known".
class EmptyManagement : public Management {
 public:
  std::unique_ptr<ManagementConnection> Connect(std::string_view nameSpace, ManagementError& error) override;
};

}  // namespace panelglow::platform::host_linux
