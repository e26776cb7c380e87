// Standard input as a person uses it.
#include <poll.h>
#include <unistd.h>

#include <cerrno>

#include "boardtool/Machine.h"

namespace panelglow::boardtool {

namespace {

bool HasInput(int timeout_ms) {
  pollfd input{STDIN_FILENO, POLLIN, 0};
  return ::poll(&input, 1, timeout_ms) > 0;
}

// One byte; nothing at the end of the input.
std::optional<char> ReadByte() {
  char byte = 0;
  for (;;) {
    const ssize_t got = ::read(STDIN_FILENO, &byte, 1);
    if (got > 0) {
      return byte;
    }
    if (got == 0 || errno != EINTR) {
      return std::nullopt;
    }
  }
}

// A line. The wait for it ends when the run is to end.
std::optional<std::string> ReadLine() {
  constexpr int kLook_ms = 50;
  std::string line;
  while (!StopRequest::IsMade()) {
    if (!HasInput(kLook_ms)) {
      LetMachineNotice();
      continue;
    }
    const std::optional<char> byte = ReadByte();
    if (!byte) {
      return line.empty() ? std::nullopt : std::optional(line);
    }
    if (*byte == '\n') {
      return line;
    }
    line += *byte;
  }
  return std::nullopt;
}

}  // namespace

Person PersonAtTerminal() {
  Person person;
  person.isThere = ::isatty(STDIN_FILENO) != 0;
  person.hasPressedKey = [] { return HasInput(0) && (ReadByte(), true); };
  person.answer = ReadLine;
  return person;
}

}  // namespace panelglow::boardtool
