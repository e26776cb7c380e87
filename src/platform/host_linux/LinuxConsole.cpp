#include "platform/host_linux/LinuxConsole.h"

#include <poll.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <system_error>
#include <thread>
#include <utility>

#include "platform/host_linux/CurrentThread.h"
#include "platform/posix/TellPeople.h"

namespace panelglow::platform::host_linux {

namespace {

// The error of the write that failed, 0 for none.
int WriteAll(int fd, std::string_view bytes) {
  while (!bytes.empty()) {
    const ssize_t written = ::write(fd, bytes.data(), bytes.size());
    if (written >= 0) {
      bytes.remove_prefix(static_cast<std::size_t>(written));
    } else if (errno == EAGAIN) {
      // Whoever shares the descriptor made it non-blocking.
      pollfd ready{fd, POLLOUT, 0};
      ::poll(&ready, 1, -1);
    } else if (errno != EINTR) {
      return errno;
    }
  }
  return 0;
}

sigset_t ControlSignals() {
  sigset_t signals;
  ::sigemptyset(&signals);
  ::sigaddset(&signals, SIGINT);
  ::sigaddset(&signals, SIGTERM);
  ::sigaddset(&signals, SIGQUIT);
  struct sigaction hangUp {};
  if (::sigaction(SIGHUP, nullptr, &hangUp) != 0 || hangUp.sa_handler != SIG_IGN) {
    ::sigaddset(&signals, SIGHUP);
  }
  return signals;
}

}  // namespace

LinuxConsole::LinuxConsole() {
  std::signal(SIGPIPE, SIG_IGN);
  const sigset_t signals = ControlSignals();
  ::pthread_sigmask(SIG_BLOCK, &signals, nullptr);
}

void LinuxConsole::Write(std::string_view bytes) {
  CurrentThread::CheckEndRequest();
  const std::lock_guard<std::mutex> lock(output_);
  const int error = WriteAll(STDOUT_FILENO, bytes);
  outputError_ = outputError_ == 0 ? error : outputError_;
}

std::string LinuxConsole::OutputProblem() {
  const std::lock_guard<std::mutex> lock(output_);
  return outputError_ == 0 ? std::string() : std::generic_category().message(outputError_);
}

void LinuxConsole::WriteError(std::string_view bytes) { WriteAll(STDERR_FILENO, bytes); }

void LinuxConsole::SetControlHandler(std::function<bool(std::uint32_t)> handler) {
  const std::lock_guard<std::mutex> lock(handlerGuard_);
  handler_ = std::move(handler);
  if (std::exchange(isArmed_, true)) {
    return;
  }
  // The signals that have come so far are still there. The listening thread is made when the program first waits for
  // something: a start that only prints a text and ends does without.
  CurrentThread::BeforeNextBlock([this] { StartListening(); });
}

void LinuxConsole::StartListening() {
  try {
    std::thread([this] { Listen(); }).detach();
  } catch (const std::system_error& failure) {
    posix::TellPeople(std::string("An interrupt will not be noticed, as no thread can be started: ") +
                      failure.what() + ".");
  }
}

void LinuxConsole::Listen() {
  ::pthread_setname_np(::pthread_self(), "console control");
  const sigset_t signals = ControlSignals();
  for (;;) {
    int number = 0;
    if (::sigwait(&signals, &number) != 0) {
      continue;
    }
    const std::lock_guard<std::mutex> lock(handlerGuard_);
    if (handler_) {
      handler_(number == SIGINT ? kControlC : kControlBreak);
    }
  }
}

}  // namespace panelglow::platform::host_linux
