#include "platform/posix/TellPeople.h"

#include <unistd.h>

#include <cerrno>
#include <string>

namespace panelglow::platform::posix {

void TellPeople(std::string_view sentence) {
  const std::string line = std::string(program_invocation_short_name) + ": " + std::string(sentence) + "\n";
  // One write, so that lines of several processes stay whole; who closed standard error wants to hear nothing.
  [[maybe_unused]] const ssize_t written = ::write(STDERR_FILENO, line.data(), line.size());
}

void OnceTeller::Tell(const std::string& sentence) {
  const std::lock_guard<std::mutex> lock(guard_);
  if (told_.insert(sentence).second) {
    TellPeople(sentence);
  }
}

}  // namespace panelglow::platform::posix
