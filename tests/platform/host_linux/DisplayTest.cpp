// The real desktop without a display, and on one: messages, clicks and threads that end.
#include <gtest/gtest.h>

#include <cstdlib>

#include "platform/Host.h"
#include "platform/host_linux/LinuxDesktop.h"

namespace panelglow::platform::host_linux {
namespace {

TEST(DisplayTest, WithoutADisplayEveryWindowFailsAndNoLoopWaits) {
  ::setenv("DISPLAY", "", 1);
  posix::LazyDrawing drawing;
  LinuxDesktop desktop(drawing);
  ::testing::internal::CaptureStderr();
  EXPECT_TRUE(desktop.RegisterWindowClass({"Window", 0, 0, 0, {}}));
  WindowRequest request;
  request.className = "Window";
  EXPECT_EQ(desktop.CreateWindow(request), 0U);
  EXPECT_EQ(desktop.CreateWindow(request), 0U);
  Message message;
  EXPECT_FALSE(desktop.GetMessage(message));
  EXPECT_EQ(::testing::internal::GetCapturedStderr(),
            "panelglow-diags: windows cannot be shown: the environment variable DISPLAY names no display\n");
}

}  // namespace
}  // namespace panelglow::platform::host_linux
