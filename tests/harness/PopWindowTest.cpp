// Which window each form of a prompt shows, and with what.
#include <gtest/gtest.h>

#include "harness/CDMDiag.h"
#include "platform/sim/Simulation.h"

namespace panelglow {
namespace {

using platform::WindowHandle;

// What stands in front: class of the text's control, title, text, and captions of the buttons.
std::string InFront(platform::desktop::WindowSystem& windows) {
  std::string text;
  for (const platform::desktop::SceneWindow& window : windows.MakeScene().windows) {
    using Kind = platform::desktop::WindowKind;
    const bool isPane = window.kind == Kind::kPlain && window.topLevel != window.handle;
    text += (text.empty() ? "" : "|") + std::string(isPane ? "marked:" : "") + platform::Utf8FromWide(window.text);
    text += window.topLevel == window.handle && window.background == 0xFF ? " on red" : "";
  }
  return text;
}

TEST(PopWindow, EachFormShowsItsTextsInThePlainOrTheConfiguredFamily) {
  struct Case {
    std::function<int()> show;
    const char* texts;
    int result;  // of the last button
  };
  const std::string kNarrow = "gr\xFC\xDF";  // in the system's code page
  const Case kCases[] = {
      {[&] { return CDMDiag::PopWindow(kNarrow, "t\xEFtle", 4); }, "t\u00EFtle%|&Yes|&No|gr\u00FC\u00DF", 4},
      {[] { return CDMDiag::PopWindow(u"\u6F22", "t\xEFtle", 1); }, "t\u00EFtle%|&OK|&Cancel|\u6F22", 2},
      {[] { return CDMDiag::PopWindow(u"go or no", "t\xEFtle", 5, u"go", u"no"); },
       "t\u00EFtle%|&Retry|&Cancel|marked:go or no", 2},
      {[] { return CDMDiag::PopWindow(u"\u6F22", u"title", 3, nullptr, 0); }, "title%|&Yes|&No|&Cancel|\u6F22", 2},
      {[] { return CDMDiag::PopWindow(u"", u"title", 2, u"", nullptr, 0); }, "title%|&Abort|&Retry|&Ignore", 3},
  };
  for (const bool configured : {false, true}) {
    for (const Case& c : kCases) {
      SCOPED_TRACE(c.texts);
      platform::sim::Simulation machine("");
      if (configured) {
        machine.DiskFiles().Put(".\\diagconf.ini", "[WindowSettings]\nBackgroundColor=255\n");
      }
      std::string wanted = c.texts;
      wanted.replace(wanted.find('%'), 1, configured ? " on red" : "");
      platform::desktop::WindowSystem& windows = machine.Windows();
      machine.Time().At(100'000, [&] {
        EXPECT_EQ(InFront(windows), wanted);
        const WindowHandle button = windows.FindControl(windows.TopLevelWindows().back(), 1000 + c.result);
        const platform::Rectangle place = windows.ScreenRectangle(button);
        windows.Click(place.left + 5, place.top + 5);
      });
      EXPECT_EQ(c.show(), c.result);
    }
  }
}

}  // namespace
}  // namespace panelglow
