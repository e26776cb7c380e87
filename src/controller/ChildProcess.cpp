#include "controller/ChildProcess.h"

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <stdexcept>

namespace panelglow::controller {

namespace {

volatile std::sig_atomic_t g_childPid = 0;

constexpr int kPassedOn[] = {SIGINT, SIGTERM, SIGHUP, SIGQUIT};

// The child has a process group of its own, so that what a terminal sends reaches this process alone, and the child
// gets it once.
extern "C" void PassOn(int number) {
  if (g_childPid > 0) {
    ::kill(g_childPid, number);
  }
}

void PassSignalsOn() {
  struct sigaction action {};
  action.sa_handler = PassOn;
  action.sa_flags = SA_RESTART;
  for (const int number : kPassedOn) {
    ::sigaction(number, &action, nullptr);
  }
}

std::vector<char*> Pointers(std::vector<std::string>& texts) {
  std::vector<char*> pointers;
  pointers.reserve(texts.size() + 1);
  for (std::string& text : texts) {
    pointers.push_back(text.data());
  }
  pointers.push_back(nullptr);
  return pointers;
}

}  // namespace

ChildProcess::ChildProcess(const Command& command) {
  std::array<int, 2> pipe{};
  if (::pipe2(pipe.data(), O_CLOEXEC) != 0) {
    throw std::runtime_error(std::string("no pipe: ") + std::strerror(errno));
  }
  std::vector<std::string> arguments = command.arguments;
  std::vector<std::string> environment;
  for (char** variable = environ; *variable != nullptr; ++variable) {
    const std::string text = *variable;
    if (command.environment.find(text.substr(0, text.find('='))) == command.environment.end()) {
      environment.push_back(text);
    }
  }
  for (const auto& [name, value] : command.environment) {
    environment.push_back(name + "=" + value);
  }
  posix_spawn_file_actions_t actions;
  ::posix_spawn_file_actions_init(&actions);
  ::posix_spawn_file_actions_adddup2(&actions, pipe[1], STDOUT_FILENO);
  posix_spawnattr_t attributes;
  ::posix_spawnattr_init(&attributes);
  ::posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETPGROUP);
  ::posix_spawnattr_setpgroup(&attributes, 0);
  const int error = ::posix_spawn(&pid_, command.program.c_str(), &actions, &attributes, Pointers(arguments).data(),
                                  Pointers(environment).data());
  ::posix_spawnattr_destroy(&attributes);
  ::posix_spawn_file_actions_destroy(&actions);
  ::close(pipe[1]);
  output_ = pipe[0];
  if (error != 0) {
    ::close(output_);
    throw std::runtime_error(command.program + " does not start: " + std::strerror(error));
  }
  g_childPid = pid_;
  PassSignalsOn();
}

ChildProcess::~ChildProcess() {
  ::close(output_);
  if (pid_ > 0) {
    ::kill(pid_, SIGKILL);
    Wait();
  }
}

std::optional<std::string> ChildProcess::Read() {
  std::array<char, 4096> bytes{};
  for (;;) {
    const ssize_t got = ::read(output_, bytes.data(), bytes.size());
    if (got > 0) {
      return std::string(bytes.data(), static_cast<std::size_t>(got));
    }
    if (got == 0 || errno != EINTR) {
      return std::nullopt;
    }
  }
}

ChildProcess::End ChildProcess::Wait() {
  int status = 0;
  while (::waitpid(pid_, &status, 0) < 0 && errno == EINTR) {
  }
  pid_ = -1;
  g_childPid = 0;
  return WIFSIGNALED(status) ? End{true, WTERMSIG(status)} : End{false, WEXITSTATUS(status)};
}

}  // namespace panelglow::controller
