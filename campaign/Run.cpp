#include "Run.h"

#include <poll.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <cstring>
#include <optional>
#include <sstream>
#include <string>

#include "Checks.h"
#include "Version.h"
#include "harness/DiagnosticManager.h"
#include "ledtests/CustomLEDTest.h"
#include "ledtests/LEDStatusIndicator.h"
#include "ledtests/LEDTest.h"
#include "platform/Host.h"
#include "platform/sim/Simulation.h"

namespace panelglow::campaign {

namespace {

namespace sim = platform::sim;

constexpr const char* kLogFile = "log.xml";
constexpr const char* kLocks[] = {"_HalcyonPromptLock", "_HalcyonMotherBoardLib"};
constexpr int kPatience_ms = 120'000;  // of wall clock; a run takes some milliseconds

// The end of the child, with what is wrong.
[[noreturn]] void Tell(int pipe, const std::vector<std::string>& broken) {
  std::string text;
  for (const std::string& line : broken) {
    text += line + "\n";
  }
  text += ".";
  const char* at = text.data();
  for (std::size_t left = text.size(); left > 0;) {
    const ssize_t written = ::write(pipe, at, left);
    if (written <= 0) {
      break;
    }
    at += written;
    left -= static_cast<std::size_t>(written);
  }
  ::_exit(0);
}

// One run, in the child.
class OneRun {
 public:
  OneRun(const Case& drawn, const Files& installation, std::string sabotage, int pipe)
      : case_(drawn), sabotage_(std::move(sabotage)), pipe_(pipe), machine_(drawn.machine, Options(drawn)) {
    for (const auto& [name, content] : installation) {
      machine_.DiskFiles().Put(name, content);
    }
    for (const auto& [name, content] : case_.files) {
      machine_.DiskFiles().Put(name, content);
    }
    for (const std::string& name : case_.missing) {
      machine_.DiskFiles().Hide(name);
    }
    if (const auto log = case_.files.find(kLogFile); log != case_.files.end()) {
      seen_.logBefore = log->second;
    }
    const std::string fault = sabotage_ == "ill-panel"      ? case_.fault + "num-lock=dead"
                              : sabotage_ == "healed-panel" ? ""
                                                            : case_.fault;
    if (!fault.empty()) {
      machine_.Break(fault.substr(0, fault.find('=')), fault.substr(fault.find('=') + 1));
    }
    machine_.Time().OnStuck(
        [this](const std::string& why) { Tell(pipe_, {"deadlock: " + why.substr(0, why.find('\n'))}); });
    if (case_.kill_us) {
      machine_.Time().At(*case_.kill_us, [this] { EndKilled(); });
    }
  }

  [[noreturn]] void Go() {
    std::vector<const char*> words{"panelglow-diags"};
    for (const std::string& argument : case_.arguments) {
      words.push_back(argument.c_str());
    }
    DiagnosticManager manager(static_cast<int>(words.size()), words.data(), kVersion, "Panelglow-diags");
    LEDTest ledTest;
    CustomLEDTest customLedTest;
    LEDStatusIndicator status;
    manager.RegisterSubtest("LEDTest", &ledTest);
    manager.RegisterSubtest("CustomLEDTest", &customLedTest);
    manager.RegisterSubtest("LEDStatusIndicator", &status);
    seen_.exitCode = manager.Run();
    Break();
    Look();
    Tell(pipe_, Check(case_, seen_));
  }

 private:
  static sim::SimulationOptions Options(const Case& drawn) {
    sim::SimulationOptions options;
    options.seed = drawn.seed;
    options.operatorPolicy = drawn.person;
    return options;
  }

  [[noreturn]] void EndKilled() {
    seen_.wasKilled = true;
    seen_.log = machine_.DiskFiles().Read(kLogFile).value_or("");
    if (sabotage_ == "half-log") {
      seen_.log = "<DiagnosticsData><Diag";
    }
    Tell(pipe_, Check(case_, seen_));
  }

  // Does what a broken program would have done.
  void Break() {
    platform::Host& host = machine_.TheMachine();
    if (sabotage_ == "second-end") {
      host.console.Write("EndOfTest\n");
    } else if (sabotage_ == "second-result") {
      machine_.ClearOutput();
      host.console.Write("TestFailed 770100\nTestFailed 770100\nEndOfTest\n");
      seen_.exitCode = 1;
    } else if (sabotage_ == "wrong-code") {
      seen_.exitCode = 1 - seen_.exitCode;
    } else if (sabotage_ == "key-left-on") {
      constexpr std::uint8_t kCapsLock = 20;
      constexpr std::uint8_t kCapsScanCode = 0x3A;
      host.keyboard.Event(kCapsLock, kCapsScanCode, 0);
      host.keyboard.Event(kCapsLock, kCapsScanCode, platform::Keyboard::kKeyUp);
    } else if (sabotage_ == "lock-left") {
      host.mutexes.WaitFor(host.mutexes.Create(kLocks[0]));
    } else if (sabotage_ == "half-log") {
      machine_.DiskFiles().Put(kLogFile, "<DiagnosticsData><Diag");
    } else if (sabotage_ == "new-log") {
      std::string log = machine_.DiskFiles().Read(kLogFile).value_or("");
      if (const std::size_t old = log.find("<Diagnostic name=\"another\""); old != std::string::npos) {
        constexpr std::string_view kEnd = "</Diagnostic>";
        machine_.DiskFiles().Put(kLogFile, log.erase(old, log.find(kEnd, old) + kEnd.size() - old));
      }
    } else if (sabotage_ == "damaged-log") {
      if (case_.files.count(kLogFile) != 0 && !IsWellFormed(seen_.logBefore)) {
        machine_.DiskFiles().Put(kLogFile, "<DiagnosticsData/>");
      }
    } else if (sabotage_ == "narrowed") {
      host.cpu.SetAffinity(1);
    } else if (sabotage_ == "no-log") {
      machine_.DiskFiles().Put(kLogFile, seen_.logBefore);
    } else if (sabotage_ == "deadlock") {
      machine_.Time().Block(this, "nothing", std::nullopt);
    } else if (sabotage_ == "crash") {
      std::signal(SIGABRT, SIG_DFL);
      std::abort();
    }
  }

  void Look() {
    seen_.output = machine_.Output();
    seen_.log = machine_.DiskFiles().Read(kLogFile).value_or("");
    for (const auto& [before, after] : machine_.StateChanges()) {
      seen_.changed.push_back(before + " -> " + after);
    }
    for (const char* lock : kLocks) {
      if (machine_.IsMutexOwned(lock)) {
        seen_.locks.emplace_back(lock);
      }
    }
  }

  const Case& case_;
  std::string sabotage_;
  int pipe_;
  sim::Simulation machine_;
  Seen seen_;
};

// What the child says until it ends; nothing when that takes too long.
std::optional<std::string> ReadAll(int pipe) {
  std::string text;
  char buffer[4096];
  for (;;) {
    pollfd ready{pipe, POLLIN, 0};
    if (::poll(&ready, 1, kPatience_ms) == 0) {
      return std::nullopt;
    }
    const ssize_t count = ::read(pipe, buffer, sizeof buffer);
    if (count <= 0) {
      return text;
    }
    text.append(buffer, static_cast<std::size_t>(count));
  }
}

}  // namespace

const std::vector<Sabotage>& AllSabotages() {
  static const std::vector<Sabotage> kSabotages = {{"second-end", "order"},
                                                   {"second-result", "order"},
                                                   {"wrong-code", "exit code"},
                                                   {"key-left-on", "as before"},
                                                   {"lock-left", "locks"},
                                                   {"half-log", "log"},
                                                   {"no-log", "log"},
                                                   {"new-log", "log"},
                                                   {"damaged-log", "log"},
                                                   {"narrowed", "as before"},
                                                   {"ill-panel", "healthy panel"},
                                                   {"healed-panel", "ill panel"},
                                                   {"deadlock", "deadlock"},
                                                   {"crash", "crash"}};
  return kSabotages;
}

std::vector<std::string> Run(const Case& drawn, const Files& installation, const std::string& sabotage) {
  int ends[2];
  if (::pipe(ends) != 0) {
    return {std::string("campaign: no pipe (") + std::strerror(errno) + ")"};
  }
  const pid_t child = ::fork();
  if (child == 0) {
    ::close(ends[0]);
    OneRun(drawn, installation, sabotage, ends[1]).Go();
  }
  ::close(ends[1]);
  if (child < 0) {
    ::close(ends[0]);
    return {std::string("campaign: no process (") + std::strerror(errno) + ")"};
  }
  const std::optional<std::string> told = ReadAll(ends[0]);
  ::close(ends[0]);
  if (!told) {
    ::kill(child, SIGKILL);
  }
  int status = 0;
  ::waitpid(child, &status, 0);
  if (!told) {
    return {"hang: it has not ended after two minutes of the wall clock"};
  }
  if (WIFSIGNALED(status) || told->empty() || told->back() != '.') {
    return {"crash: " + (WIFSIGNALED(status) ? std::string("signal ") + std::to_string(WTERMSIG(status))
                                             : "exit code " + std::to_string(WEXITSTATUS(status)))};
  }
  std::vector<std::string> broken;
  std::istringstream lines(*told);
  for (std::string line; std::getline(lines, line) && line != ".";) {
    broken.push_back(line);
  }
  return broken;
}

}  // namespace panelglow::campaign
