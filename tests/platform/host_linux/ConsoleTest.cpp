// Control events and standard output, each in a process of its own: the tests' process keeps its signals.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>

#include <atomic>
#include <string>

#include "platform/Host.h"
#include "platform/host_linux/ChildProcess.h"

namespace panelglow::platform {
namespace {

TEST(ConsoleTest, InterruptsArriveByTypeAndNeverEndTheProcess) {
  for (const bool answer : {true, false}) {
    ChildProcess child([answer](int pipe) {
      std::atomic<int> events{0};
      Console& console = TheHost().console;
      ::kill(::getpid(), SIGTERM);  // there is no handler yet
      console.SetControlHandler([&](std::uint32_t type) {
        Tell(pipe, static_cast<char>('0' + type));
        ++events;
        return answer;
      });
      ::kill(::getpid(), SIGINT);  // nobody listens yet
      Tell(pipe, 'r');
      while (events < 6) {
        TheHost().clock.Sleep(1);
      }
      TheHost().console.SetControlHandler(nullptr);
      ::kill(::getpid(), SIGINT);  // passes unnoticed
      TheHost().clock.Sleep(1);
      return 7;
    });
    EXPECT_EQ(child.Read(3), "r01");
    for (const int breaking : {SIGTERM, SIGQUIT, SIGHUP}) {
      child.Signal(breaking);
      EXPECT_EQ(child.Read(1), "1") << breaking;
    }
    child.Signal(SIGINT);
    EXPECT_EQ(child.Read(1), "0");
    EXPECT_EQ(child.Wait(), 7);
  }
}

TEST(ConsoleTest, AHangUpThatWasToBeIgnoredStaysIgnored) {
  ChildProcess child([](int pipe) {
    std::signal(SIGHUP, SIG_IGN);  // as nohup does
    std::atomic<bool> ended{false};
    TheHost().console.SetControlHandler([&](std::uint32_t type) {
      Tell(pipe, static_cast<char>('0' + type));
      ended = type == 0;
      return true;
    });
    ::kill(::getpid(), SIGHUP);
    ::kill(::getpid(), SIGINT);
    while (!ended) {
      TheHost().clock.Sleep(1);
    }
    return 7;
  });
  EXPECT_EQ(child.Wait(), 7);
  EXPECT_EQ(child.Read(2), "0");
}

TEST(ConsoleTest, AReaderThatHasGoneStopsNobodyAndIsRemembered) {
  ChildProcess child([](int pipe) {
    ::dup2(pipe, STDOUT_FILENO);
    ::close(pipe);
    TheHost().console.Write("read");
    const bool wasWhole = TheHost().console.OutputProblem().empty();
    pollfd gone{STDOUT_FILENO, 0, 0};
    ::poll(&gone, 1, -1);
    TheHost().console.Write("nobody reads this");
    ::dup2(::open("/dev/null", O_WRONLY), STDOUT_FILENO);
    TheHost().console.Write("what came before is lost all the same");
    return wasWhole && TheHost().console.OutputProblem() == "Broken pipe" ? 7 : 8;
  });
  EXPECT_EQ(child.Read(4), "read");
  child.ClosePipe();
  EXPECT_EQ(child.Wait(), 7);
}

TEST(ConsoleTest, LinesStayWholeOnAPipeThatTakesThemInPieces) {
  constexpr std::size_t kLength = 300'000;  // more than a pipe holds
  ChildProcess child([](int pipe) {
    ::dup2(pipe, STDOUT_FILENO);
    ::fcntl(STDOUT_FILENO, F_SETFL, O_NONBLOCK);
    const auto write = [](char c) { TheHost().console.Write(std::string(kLength, c)); };
    const ThreadHandle other = TheHost().threads.Start("writer", [&] { write('b'); });
    write('a');
    TheHost().threads.Wait(other, Threads::kNoLimit);
    return 7;
  });
  const std::string output = child.Read(2 * kLength);
  const char first = output.at(0);
  EXPECT_EQ(output, std::string(kLength, first) + std::string(kLength, first == 'a' ? 'b' : 'a'));
  EXPECT_EQ(child.Wait(), 7);
}

}  // namespace
}  // namespace panelglow::platform
