// A program that runs beside this one, with its standard output in a pipe.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <vector>

#include <sys/types.h>

namespace panelglow::controller {

class ChildProcess {
 public:
  struct Command {
    std::string program;                             // path of the executable
    std::vector<std::string> arguments;              // the first is the name that the program sees as its own
    std::map<std::string, std::string> environment;  // added to this process's own
  };

  /// How a child ended: by itself with a code, or by a signal.
  struct End {
    bool bySignal = false;
    int code = 0;
  };

  /// Starts the program. Throws std::runtime_error with the reason when that does not work.
  explicit ChildProcess(const Command& command);

  /// Ends a child that still runs, and waits for it.
  ~ChildProcess();
  ChildProcess(const ChildProcess&) = delete;
  ChildProcess& operator=(const ChildProcess&) = delete;

  /// The next piece of the child's standard output as soon as there is one; nothing at its end.
  std::optional<std::string> Read();

  /// Waits for the end. Interrupts, terminations and the loss of the terminal that reach this process meanwhile go to
  /// the child, which decides.
  End Wait();

 private:
  pid_t pid_ = -1;
  int output_ = -1;
};

}  // namespace panelglow::controller
