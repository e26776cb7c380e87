// On a real display: the program's windows under Xvfb, answered by real mouse clicks and keys.
#include <gmock/gmock.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <cstdlib>
#include <thread>

#include "system/SystemRun.h"

// Behind the test framework's headers, whose names its macros would replace.
#include <X11/Xlib.h>
#include <X11/Xutil.h>

namespace panelglow::systemtest {
namespace {

using ::testing::HasSubstr;
using namespace std::chrono_literals;

// An Xvfb of the test's own on a free display number, ended with the object.
class VirtualDisplay {
 public:
  VirtualDisplay() {
    std::array<int, 2> pipe{};
    if (::pipe(pipe.data()) != 0) {
      return;
    }
    pid_ = ::fork();
    if (pid_ == 0) {
      ::close(pipe[0]);
      const std::string descriptor = std::to_string(pipe[1]);
      ::execlp("Xvfb", "Xvfb", "-displayfd", descriptor.c_str(), "-screen", "0", "1280x1024x24", "-nolisten", "tcp",
               nullptr);
      ::_exit(127);
    }
    ::close(pipe[1]);
    // The number and a line end, in as many pieces as the server likes.
    std::string number;
    for (char c = 0; ::read(pipe[0], &c, 1) == 1 && c != '\n';) {
      number += c;
    }
    ::close(pipe[0]);
    if (!number.empty()) {
      name_ = ":" + number;
      display_ = ::XOpenDisplay(name_.c_str());
    }
  }
  ~VirtualDisplay() {
    if (display_ != nullptr) {
      ::XCloseDisplay(display_);
    }
    if (pid_ > 0) {
      ::kill(pid_, SIGTERM);
      ::waitpid(pid_, nullptr, 0);
    }
  }
  VirtualDisplay(const VirtualDisplay&) = delete;
  VirtualDisplay& operator=(const VirtualDisplay&) = delete;

  [[nodiscard]] bool IsOpen() const { return display_ != nullptr; }
  [[nodiscard]] const std::string& Name() const { return name_; }

  // Colour of a pixel, red in the highest byte of three.
  [[nodiscard]] unsigned long PixelAt(int x, int y) const {
    XImage* image = ::XGetImage(display_, DefaultRootWindow(display_), x, y, 1, 1, AllPlanes, ZPixmap);
    const unsigned long pixel = image == nullptr ? 0 : XGetPixel(image, 0, 0) & 0xFFFFFFU;
    if (image != nullptr) {
      XDestroyImage(image);
    }
    return pixel;
  }

  void Do(const std::string& xdotool) const {
    const std::string command = "DISPLAY=" + name_ + " xdotool " + xdotool;
    EXPECT_EQ(std::system(command.c_str()), 0) << command;
  }
  void Click(int x, int y) const { Do("mousemove " + std::to_string(x) + " " + std::to_string(y) + " click 1"); }

  // Waits until the pixel is of the colour; false after `limit`.
  [[nodiscard]] bool AwaitPixel(int x, int y, unsigned long color, std::chrono::milliseconds limit) const {
    const auto end = std::chrono::steady_clock::now() + limit;
    while (PixelAt(x, y) != color) {
      if (std::chrono::steady_clock::now() > end) {
        return false;
      }
      std::this_thread::sleep_for(10ms);  // the other process draws in its own time
    }
    return true;
  }

 private:
  pid_t pid_ = -1;
  std::string name_;
  ::Display* display_ = nullptr;
};

constexpr unsigned long kDialogGray = 0xC0C0C0;
constexpr unsigned long kPromptGray = 0xF0F0F0;
constexpr unsigned long kLitGreen = 0x20E040;

// Two lock keys, so that a run in real time is a matter of seconds.
constexpr const char* kTwoKeys =
    "<UI><Section ID=\"Default\"><Button ID=\"NumLock\"/><Button ID=\"CapsLock\"/></Section></UI>";

TEST(SystemDisplay, APersonTakesTheTestWithMouseAndKeyboard) {
  const VirtualDisplay display;
  ASSERT_TRUE(display.IsOpen()) << "Xvfb does not start";
  const Installation installation;
  installation.Write("ui.xml", kTwoKeys);
  Outcome outcome;
  std::thread run([&] {
    outcome = RunProgram("panelglow-sim",
                         {"--machine", installation.Machine("desktop.toml"), "--window", "--raw", "--",
                          "-subtest=CustomLEDTest", "-OperatorCheating=false", "-Retries=0"},
                         installation.Path(""), {{"DISPLAY", display.Name()}});
  });
  // The prompt: 540 by 300 in the middle of the screen. Enter presses its OK button.
  EXPECT_TRUE(display.AwaitPixel(640, 600, kPromptGray, 20s));
  display.Do("key Return");
  // The dialog: 615 by 608 in the middle. Of the panel, the fourth and fifth LED are the lock keys.
  EXPECT_TRUE(display.AwaitPixel(640, 500, kDialogGray, 20s));
  constexpr int kLedX = 47;
  constexpr int kNumLockY = 183;
  constexpr int kCapsLockY = 217;
  for (int answers = 0; answers < 2; ++answers) {
    const auto end = std::chrono::steady_clock::now() + 10s;
    bool numLock = false;
    bool capsLock = false;
    while (!numLock && !capsLock && std::chrono::steady_clock::now() < end) {
      numLock = display.PixelAt(kLedX, kNumLockY) == kLitGreen;
      capsLock = display.PixelAt(kLedX, kCapsLockY) == kLitGreen;
      std::this_thread::sleep_for(5ms);
    }
    ASSERT_TRUE(numLock || capsLock) << "no LED blinks on the panel";
    // Client origin (335, 211); buttons at 58 and 260, both in the first row at 150, 130 by 30.
    display.Click(335 + (numLock ? 58 : 260) + 65, 211 + 150 + 15);
    std::this_thread::sleep_for(1500ms);  // the worker's last blink is over
  }
  run.join();
  EXPECT_EQ(outcome.exitCode, 0) << outcome.output << outcome.errors;
  EXPECT_TRUE(outcome.IsOrderly());
}

TEST(SystemDisplay, WithoutADisplayTheCallIsRefusedAtOnce) {
  const Installation installation;
  for (const char* name : {"", ":4711"}) {
    const Outcome outcome =
        RunProgram("panelglow-sim",
                   {"--machine", installation.Machine("desktop.toml"), "--window", "--", "-subtest=CustomLEDTest"},
                   installation.Path(""), {{"DISPLAY", name}});
    EXPECT_EQ(outcome.exitCode, 3);
    EXPECT_THAT(outcome.errors, HasSubstr("the windows cannot be shown"));
  }
}

}  // namespace
}  // namespace panelglow::systemtest
