// Prompts of several processes on one display: the machine shows one at a time.
#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>
#include <fstream>
#include <thread>

#include "platform/host_linux/ChildProcess.h"
#include "prompts/PlainPrompt.h"

// Behind the test framework's headers, whose names its macros would replace.
#include "display/VirtualDisplay.h"

namespace panelglow::systemtest {
namespace {

using namespace std::chrono_literals;
using platform::ChildProcess;

constexpr unsigned long kPromptGray = 0xF0F0F0;
constexpr unsigned long kNothing = 0;
constexpr std::chrono::seconds kLimit{20};

// Inside both prompts, and inside the wide one alone.
constexpr int kMiddleX = 640;
constexpr int kMiddleY = 640;
constexpr int kOutsideX = 100;

// 1,200 pixels of picture make a window of 1,250.
class WidePicture {
 public:
  WidePicture() { std::ofstream(path_, std::ios::binary) << "P5\n1200 300\n255\n" << std::string(360'000, '\x80'); }
  ~WidePicture() { std::filesystem::remove(path_); }
  [[nodiscard]] wstring Path() const { return platform::WideFromUtf8(path_.string()); }

 private:
  std::filesystem::path path_ =
      std::filesystem::temp_directory_path() / ("panelglow-wide-" + std::to_string(::getpid()));
};

int ShowNarrow(int pipe) {
  platform::Tell(pipe, 'n');
  return TextPrompt(u"narrow", u"title", 0, nullptr, 0);
}

TEST(Display, TheSecondProcessPromptsWhenTheFirstHasAnsweredOrDied) {
  const VirtualDisplay display;
  ASSERT_TRUE(display.IsOpen()) << "Xvfb does not start";
  ::setenv("DISPLAY", display.Name().c_str(), 1);
  const WidePicture picture;
  for (const bool dies : {false, true}) {
    ChildProcess first(ShowNarrow);
    ASSERT_TRUE(display.AwaitPixel(kMiddleX, kMiddleY - 60, kPromptGray, kLimit));
    ChildProcess second([&](int pipe) {
      platform::Tell(pipe, 'w');
      return ImagePrompt(u"wide", u"title", 0, picture.Path(), nullptr, 0);
    });
    ASSERT_EQ(second.Read(1), "w");
    std::this_thread::sleep_for(300ms);  // long enough for it to come, if it did not wait
    EXPECT_EQ(display.PixelAt(kOutsideX, kMiddleY), kNothing);
    if (dies) {
      first.Signal(SIGKILL);
      EXPECT_EQ(first.Wait(), -SIGKILL);
    } else {
      display.Do("key Return");
      EXPECT_EQ(first.Wait(), prompt_result::kOk);
    }
    EXPECT_TRUE(display.AwaitPixel(kOutsideX, kMiddleY, kPromptGray, kLimit));
    display.Do("key Return");
    EXPECT_EQ(second.Wait(), prompt_result::kOk);
    EXPECT_TRUE(display.AwaitPixel(kOutsideX, kMiddleY, kNothing, kLimit));
  }
}

}  // namespace
}  // namespace panelglow::systemtest
