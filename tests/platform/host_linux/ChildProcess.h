// A child process of a test, with a pipe from it.
#pragma once

#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <functional>
#include <string>

#include "platform/posix/Descriptor.h"

namespace panelglow::platform {

class ChildProcess {
 public:
  /// Forks; the child runs `body` with the pipe's writing end and exits with its result. The child has no other
  /// thread.
  explicit ChildProcess(const std::function<int(int pipe)>& body) {
    int ends[2] = {-1, -1};
    if (::pipe(ends) != 0) {
      return;
    }
    pid_ = ::fork();
    if (pid_ == 0) {
      ::close(ends[0]);
      ::_exit(body(ends[1]));
    }
    ::close(ends[1]);
    pipe_ = posix::Descriptor(ends[0]);
  }
  ~ChildProcess() {
    if (pid_ > 0) {
      Signal(SIGKILL);
      Wait();
    }
  }
  ChildProcess(const ChildProcess&) = delete;
  ChildProcess& operator=(const ChildProcess&) = delete;

  void Signal(int number) const { ::kill(pid_, number); }

  /// The next `count` bytes from the child; fewer when it has closed the pipe.
  std::string Read(std::size_t count) {
    std::string bytes(count, '\0');
    std::size_t length = 0;
    for (ssize_t got = 1; got > 0 && length < count; length += static_cast<std::size_t>(got)) {
      got = ::read(pipe_.Get(), bytes.data() + length, count - length);
      got = got < 0 ? 0 : got;
    }
    bytes.resize(length);
    return bytes;
  }

  void ClosePipe() { pipe_.Close(); }

  /// The exit code, or minus the signal that ended the child.
  int Wait() {
    int status = 0;
    ::waitpid(pid_, &status, 0);
    pid_ = 0;
    return WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
  }

 private:
  pid_t pid_ = 0;
  posix::Descriptor pipe_;
};

inline void Tell(int pipe, char what) {
  if (::write(pipe, &what, 1) != 1) {
    ::_exit(99);
  }
}

}  // namespace panelglow::platform
