// Standard output and standard error without buffers, and the interrupt signals as control events.
#pragma once

#include <mutex>

#include "platform/Console.h"

namespace panelglow::platform::host_linux {

/// SIGINT is control type 0; SIGTERM, SIGQUIT and SIGHUP (the terminal was closed) are type 1. Once a handler is
/// installed none of them ends the process, whatever the handler answers; a SIGHUP that whoever started the program
/// had it ignore, as nohup does, stays ignored. Has to outlive the program's threads.
class LinuxConsole : public Console {
 public:
  /// To be made on the process's first thread, before there are others. From here on a control signal stays with the
  /// process until a handler listens, whenever it came; every thread that is started later inherits that. A reader
  /// that goes away is no signal any more, but an error that Write remembers.
  LinuxConsole();

  void Write(std::string_view bytes) override;
  std::string OutputProblem() override;
  void WriteError(std::string_view bytes) override;

  /// Waits for a handler that runs. An empty handler lets all later events pass unnoticed.
  void SetControlHandler(std::function<bool(std::uint32_t type)> handler) override;

 private:
  void StartListening();
  void Listen();

  std::mutex output_;    // keeps lines whole that the system takes in pieces
  int outputError_ = 0;  // of the first write that failed; by output_
  std::mutex handlerGuard_;
  std::function<bool(std::uint32_t)> handler_;  // by handlerGuard_
  bool isArmed_ = false;                        // by handlerGuard_
};

}  // namespace panelglow::platform::host_linux
