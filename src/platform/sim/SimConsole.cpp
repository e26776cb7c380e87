#include "platform/sim/SimConsole.h"

#include <unistd.h>

#include <cerrno>

namespace panelglow::platform::sim {

void SimConsole::Write(std::string_view bytes) {
  scheduler_.Spend(1);
  if (capture_) {
    output_ += bytes;
    return;
  }
  while (!bytes.empty()) {
    const ssize_t written = ::write(STDOUT_FILENO, bytes.data(), bytes.size());
    if (written < 0 && errno == EINTR) {
      continue;
    }
    if (written <= 0) {
      outputError_ = outputError_ == 0 ? errno : outputError_;
      return;
    }
    bytes.remove_prefix(static_cast<std::size_t>(written));
  }
}

}  // namespace panelglow::platform::sim
