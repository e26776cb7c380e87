// The configurable windows: their colour, and what sets them apart from the plain prompts.
#include <gmock/gmock.h>

#include "prompts/Desk.h"
#include "prompts/DiagnosticWindow.h"
#include "prompts/PlainPrompt.h"

namespace panelglow::prompttest {
namespace {

namespace desktop = platform::desktop;
namespace message = platform::message;

constexpr const char* kFile = ".\\diagconf.ini";

enum class Form { kText, kImage, kMarked };
constexpr Form kForms[] = {Form::kText, Form::kImage, Form::kMarked};

int Show(Form form, unsigned style) {
  DiagnosticWindow window(kFile);
  switch (form) {
    case Form::kText:
      return window.TextForm(u"yes or no", u"title", style);
    case Form::kImage:
      return window.ImageForm(u"yes or no", u"title", style, u"none.png");
    default:
      return window.MarkedForm(u"yes or no", u"title", style, u"yes", u"no");
  }
}

TEST(DiagnosticConfiguration, TakesTheBackgroundFromTheFileOrFromTheSystem) {
  constexpr platform::Color kSystem = platform::kButtonFaceColor;
  for (const auto& [value, background] : {std::pair<const char*, platform::Color>{"255", 0x0000FF},
                                          {"0x00FF00 ; green", 0x00FF00},
                                          {"", kSystem},
                                          {"4294967295", kSystem},
                                          {"red", 0}}) {
    Desk desk;
    desk.sim.DiskFiles().Put(kFile, std::string("[WindowSettings]\nBackgroundColor=") + value + "\n");
    EXPECT_EQ(DiagnosticConfiguration(kFile).GetBackgroundBrush(), background) << value;
    EXPECT_EQ(DiagnosticConfiguration(".\\none.ini").GetBackgroundBrush(), kSystem);
  }
}

TEST(DiagnosticWindow, GivesItsColorToItsControlsAndAPlainPromptDoesNot) {
  for (const bool plain : {false, true}) {
    for (const Form form : kForms) {
      Desk desk;
      desk.sim.DiskFiles().Put(kFile, "[WindowSettings]\nBackgroundColor=255\n");
      desk.At(500, [&] {
        for (const desktop::SceneWindow& window : desk.windows.MakeScene().windows) {
          EXPECT_EQ(window.background, plain ? platform::kButtonFaceColor : 255U);
          if (window.kind == desktop::WindowKind::kButton) {
            EXPECT_EQ(window.ownBackground, plain ? std::nullopt : std::optional<platform::Color>(255));
          }
        }
      });
      desk.ClickAt(1000, 1002);
      EXPECT_EQ(plain ? TextPrompt(u"text", u"title", 1, nullptr, 0) : Show(form, 1), prompt_result::kCancel);
    }
  }
}

TEST(DiagnosticWindow, HasItsOwnTopmostFlagAndNeitherTimeOutNorDeviceEventsAndEndsWhenTheRunIsToldToStop) {
  for (const Form form : kForms) {
    Desk desk;
    ThePromptState().timeoutSeconds = 1;
    desk.PostAt(500, message::kDeviceChange, 0x8000);
    desk.At(7000, [&] { desk.stopRequested = true; });
    EXPECT_EQ(Show(form, 1 | kPromptTopmost), prompt_result::kTerminated);
    EXPECT_NEAR(desk.Now_ms(), 10'000, 10);  // it asks every five seconds
    EXPECT_FALSE(desk.sim.IsMutexOwned("_HalcyonPromptLock"));
    EXPECT_EQ(ThePromptState().promptEvents, 0U);
    EXPECT_FALSE(ThePromptState().topmost);
    EXPECT_EQ(ThePromptState().timeoutSeconds, 1U);  // still armed for the next plain one
  }
}

// A click beside the buttons: the plain window gives the focus to its first button, this one leaves it where it is.
TEST(DiagnosticWindow, LeavesTheFocusOnItsControls) {
  for (const bool plain : {false, true}) {
    Desk desk;
    desk.At(100, [&] { desk.windows.Key(0x09, 0, false); });  // Tab, to the second button
    desk.PostAt(200, message::kLeftButtonUp);
    desk.At(300, [&] { EXPECT_EQ(desk.windows.ControlId(desk.windows.Focus()), plain ? 1005 : 1002); });
    desk.At(400, [&] { desk.windows.SetFocus(0); });
    desk.PostAt(500, message::kLeftButtonUp);
    desk.At(600, [&] { EXPECT_EQ(desk.windows.ControlId(desk.windows.Focus()), 1005); });
    desk.ClickAt(700, 1002);
    EXPECT_EQ(plain ? TextPrompt(u"", u"", 1, nullptr, 0) : Show(Form::kText, 1), prompt_result::kCancel);
  }
}

TEST(DiagnosticWindow, TakesTheForegroundBackWithinFiveSecondsWhenItIsTopmost) {
  for (const bool topmost : {false, true}) {
    Desk desk;
    desk.StartOther(u"", 9000);
    WindowHandle own = 0;
    desk.At(400, [&] { own = desk.Top(); });
    desk.At(4900, [&] { EXPECT_NE(desk.windows.ForegroundWindow(), own); });
    desk.At(5100, [&] {
      EXPECT_EQ(desk.windows.ForegroundWindow() == own, topmost);
      desk.windows.Post({own, message::kCommand, 1005, 0});
    });
    EXPECT_EQ(Show(Form::kText, topmost ? kPromptTopmost : 0), prompt_result::kOk);
  }
}

}  // namespace
}  // namespace panelglow::prompttest
