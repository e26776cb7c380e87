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
      TheHost().console.SetControlHandler([&](std::uint32_t type) {
        Tell(pipe, static_cast<char>('0' + type));
        ++events;
        return answer;
      });
      ::kill(::getpid(), SIGINT);  // nobody listens yet
      Tell(pipe, 'r');
      while (events < 3) {
        TheHost().clock.Sleep(1);
      }
      TheHost().console.SetControlHandler(nullptr);
      ::kill(::getpid(), SIGINT);  // passes unnoticed
      TheHost().clock.Sleep(1);
      return 7;
    });
    EXPECT_EQ(child.Read(2), "r0");
    child.Signal(SIGTERM);
    EXPECT_EQ(child.Read(1), "1");
    child.Signal(SIGINT);
    EXPECT_EQ(child.Read(1), "0");
    EXPECT_EQ(child.Wait(), 7);
  }
}

TEST(ConsoleTest, AReaderThatHasGoneIsNoError) {
  ChildProcess child([](int pipe) {
    ::dup2(pipe, STDOUT_FILENO);
    ::close(pipe);
    pollfd gone{STDOUT_FILENO, 0, 0};
    ::poll(&gone, 1, -1);
    TheHost().console.Write("nobody reads this");
    return 7;
  });
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
