// A display of a test's own: what is on it, and real clicks and keys. To be included behind the test framework's
// headers, whose names its macros would replace.
#pragma once

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <csignal>
#include <cstdlib>
#include <string>
#include <thread>
#include <utility>

#include <X11/Xlib.h>
#include <X11/Xutil.h>

namespace panelglow::systemtest {

// An Xvfb of the test's own on a free display number, ended with the object.
class VirtualDisplay {
 public:
  explicit VirtualDisplay(const std::string& size = "1280x1024") {
    std::array<int, 2> pipe{};
    if (::pipe(pipe.data()) != 0) {
      return;
    }
    pid_ = ::fork();
    if (pid_ == 0) {
      ::close(pipe[0]);
      const std::string screen = size + "x24";
      const std::string descriptor = std::to_string(pipe[1]);
      ::execlp("Xvfb", "Xvfb", "-displayfd", descriptor.c_str(), "-screen", "0", screen.c_str(), "-nolisten", "tcp",
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
  ~VirtualDisplay() { End(SIGTERM); }
  VirtualDisplay(const VirtualDisplay&) = delete;
  VirtualDisplay& operator=(const VirtualDisplay&) = delete;

  [[nodiscard]] bool IsOpen() const { return display_ != nullptr; }
  [[nodiscard]] const std::string& Name() const { return name_; }

  // The server dies; from now on the display can only be destroyed.
  void Kill() { End(SIGKILL); }

  [[nodiscard]] ::Display* Connection() const { return display_; }

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
      std::this_thread::sleep_for(std::chrono::milliseconds(10));  // the other process draws in its own time
    }
    return true;
  }

 private:
  void End(int signal) {
    if (display_ != nullptr) {
      ::XCloseDisplay(std::exchange(display_, nullptr));
    }
    if (pid_ > 0) {
      ::kill(pid_, signal);
      ::waitpid(std::exchange(pid_, -1), nullptr, 0);
    }
  }

  pid_t pid_ = -1;
  std::string name_;
  ::Display* display_ = nullptr;
};

}  // namespace panelglow::systemtest
