// The program's windows among others on a real display: names, keys, who is in front, and a display that dies.
#include <gmock/gmock.h>
#include <sys/resource.h>

#include <chrono>
#include <cstdlib>
#include <functional>
#include <string>
#include <thread>
#include <tuple>

#include "platform/host_linux/ChildProcess.h"
#include "prompts/PlainPrompt.h"
#include "prompts/TextWindow.h"

// Behind the test framework's headers, whose names its macros would replace.
#include <X11/Xatom.h>

#include "display/VirtualDisplay.h"
#include "platform/desktop/Keys.h"
#include "platform/drawingmodule/X11Keys.h"

namespace panelglow::systemtest {
namespace {

using namespace std::chrono_literals;
using platform::ChildProcess;
using ::testing::HasSubstr;

constexpr unsigned long kPromptGray = 0xF0F0F0;
constexpr unsigned long kRed = 0xFF0000;
constexpr std::chrono::seconds kLimit{20};

// Inside a text prompt of 540 by 290 in the middle of the screen, beside its controls.
constexpr int kInsideX = 640 + 200;
constexpr int kInsideY = 512 + 100;

// Inside an image prompt, which is 300 high, alone.
constexpr int kOnlyInsideSecondY = 512 - 147;

class ScreenTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_TRUE(display_.IsOpen()) << "Xvfb does not start";
    ::setenv("DISPLAY", display_.Name().c_str(), 1);
  }
  [[nodiscard]] bool AwaitPrompt() const { return display_.AwaitPixel(kInsideX, kInsideY, kPromptGray, kLimit); }

  // A window of another program, above all others and with the keyboard.
  [[nodiscard]] ::Window ShowOther(int width, int height, const char* title = "") const {
    ::Display* display = display_.Connection();
    XSetWindowAttributes attributes{};
    attributes.override_redirect = True;
    attributes.background_pixel = kRed;
    const ::Window window = XCreateWindow(display, DefaultRootWindow(display), 0, 0, static_cast<unsigned>(width),
                                          static_cast<unsigned>(height), 0, CopyFromParent, InputOutput,
                                          CopyFromParent, CWOverrideRedirect | CWBackPixel, &attributes);
    XStoreName(display, window, title);
    XMapRaised(display, window);
    XSetInputFocus(display, window, RevertToParent, CurrentTime);
    XSync(display, False);
    return window;
  }

  // True when the keyboard is no longer the window's.
  [[nodiscard]] bool AwaitLossOfKeyboard(::Window window) const {
    const auto end = std::chrono::steady_clock::now() + kLimit;
    ::Window focused = window;
    for (int revert = 0; focused == window && std::chrono::steady_clock::now() < end;) {
      XGetInputFocus(display_.Connection(), &focused, &revert);
    }
    return focused != window;
  }

  // Another program has put a text into the clipboard, and gives it to the first who asks. False when nobody does.
  [[nodiscard]] bool GiveClipboardTo(const std::function<void()>& ask, const std::string& text) const {
    ::Display* display = display_.Connection();
    const ::Window owner = XCreateSimpleWindow(display, DefaultRootWindow(display), 0, 0, 1, 1, 0, 0, 0);
    XSetSelectionOwner(display, XInternAtom(display, "CLIPBOARD", False), owner, CurrentTime);
    XSync(display, False);
    ask();
    XEvent event{};
    const auto end = std::chrono::steady_clock::now() + kLimit;
    while (XCheckTypedWindowEvent(display, owner, SelectionRequest, &event) == 0) {
      if (std::chrono::steady_clock::now() > end) {
        return false;
      }
      std::this_thread::sleep_for(10ms);  // the other process reads its keys in its own time
    }
    const XSelectionRequestEvent request = event.xselectionrequest;
    XChangeProperty(display, request.requestor, request.property, request.target, 8, PropModeReplace,
                    reinterpret_cast<const unsigned char*>(text.data()), static_cast<int>(text.size()));
    XEvent answer{};
    answer.xselection = {
        SelectionNotify,  0,           False, display, request.requestor, request.selection, request.target,
        request.property, request.time};
    XSendEvent(display, request.requestor, False, 0, &answer);
    XSync(display, False);
    return true;
  }

  VirtualDisplay display_;
};

TEST(X11Keys, OnlyLettersAndDigitsHaveTheirCharacterAsCode) {
  namespace key = platform::desktop::key;
  const std::pair<const char*, std::uint32_t> kCases[] = {{"a", 'A'},
                                                          {"Z", 'Z'},
                                                          {"7", '7'},
                                                          {"dollar", 0},
                                                          {"percent", 0},
                                                          {"ampersand", 0},
                                                          {"apostrophe", 0},
                                                          {"parenleft", 0},
                                                          {"period", 0},
                                                          {"numbersign", 0},
                                                          {"Home", key::kHome},
                                                          {"Left", key::kLeft},
                                                          {"Delete", key::kDelete},
                                                          {"KP_Enter", key::kEnter},
                                                          {"KP_Home", key::kHome},
                                                          {"KP_Left", key::kLeft},
                                                          {"KP_Delete", key::kDelete},
                                                          {"KP_4", 0},
                                                          {"F1", 0}};
  for (const auto& [name, code] : kCases) {
    EXPECT_EQ(platform::desktop::VirtualKeyOf(XStringToKeysym(name)), code) << name;
  }
}

TEST_F(ScreenTest, AHeldSpaceAnswersOnePrompt) {
  ChildProcess child([](int) {
    const int first = TextPrompt(u"first", u"title", 4, nullptr, 0);
    return 10 * first + ImagePrompt(u"second", u"title", 4, u"", nullptr, 0);
  });
  ASSERT_TRUE(AwaitPrompt());
  display_.Do("keydown space sleep 1.5 keyup space");  // repeated 25 times a second after 0.7 s
  ASSERT_TRUE(display_.AwaitPixel(kInsideX, kOnlyInsideSecondY, kPromptGray, kLimit));
  display_.Do("key n");
  EXPECT_EQ(child.Wait(), 10 * prompt_result::kYes + prompt_result::kNo);
}

TEST_F(ScreenTest, ATopmostPromptGetsPlaceAndKeyboardBack) {
  ChildProcess child([](int) { return TextPrompt(u"text", u"title", kPromptTopmost | 1, nullptr, 0); });
  ASSERT_TRUE(AwaitPrompt());
  for (const char* title : {"", "another", "a third"}) {
    const ::Window other = ShowOther(1280, 1024, title);
    ASSERT_TRUE(AwaitPrompt());
    EXPECT_EQ(display_.PixelAt(10, 10), kRed);
    ASSERT_TRUE(AwaitLossOfKeyboard(other));  // or nobody ends the child
  }
  display_.Do("key c");
  EXPECT_EQ(child.Wait(), prompt_result::kCancel);
}

TEST_F(ScreenTest, AClickTakesTheKeyboardBackForAnyPrompt) {
  ChildProcess child([](int) { return TextPrompt(u"text", u"title", 1, nullptr, 0); });
  ASSERT_TRUE(AwaitPrompt());
  const ::Window other = ShowOther(50, 50);
  display_.Do("key c");  // is the other window's
  display_.Click(kInsideX, kInsideY);
  ASSERT_TRUE(AwaitLossOfKeyboard(other));  // or nobody ends the child
  display_.Do("key Return");
  EXPECT_EQ(child.Wait(), prompt_result::kOk);
}

TEST_F(ScreenTest, AnEntryFieldTakesKeysWithShiftLongCharactersAndTheClipboard) {
  const std::tuple<const char*, const char*, const char*> kCases[] = {
      {"key a b c shift+Home", "", "x"},                // keys, clipboard, line with an x typed at its end
      {"key a b c Delete Left shift+Left", "", "axc"},  // Delete behind the end neither takes nor types
      {"key a U1F600 BackSpace", "", "ax"},             // one character of two units
      {"key a ctrl+v", "PASTED\nand a second line", "aPASTEDx"},
  };
  for (const auto& [keys, clipboard, line] : kCases) {
    SCOPED_TRACE(keys);
    ChildProcess child([expected = std::string(line)](int) {
      std::string entered;
      ShowTextWindow(u"text", u"title", entered, 20'000);
      return entered == expected ? 0 : 1;
    });
    ASSERT_TRUE(AwaitPrompt());
    const auto type = [&, keys = keys] { display_.Do(keys); };
    if (*clipboard == '\0') {
      type();
    } else {
      EXPECT_TRUE(GiveClipboardTo(type, clipboard));
    }
    display_.Do("key x Return");
    EXPECT_EQ(child.Wait(), 0);
  }
}

TEST_F(ScreenTest, AWindowIsNamedByItsTitle) {
  ChildProcess child([](int) { return TextPrompt(u"text", u"Prüfung 漢", 0, nullptr, 0); });
  ASSERT_TRUE(AwaitPrompt());
  ::Display* display = display_.Connection();
  ::Window root = 0;
  ::Window parent = 0;
  ::Window* children = nullptr;
  unsigned count = 0;
  ASSERT_NE(XQueryTree(display, DefaultRootWindow(display), &root, &parent, &children, &count), 0);
  std::vector<std::string> names;
  for (unsigned i = 0; i < count; ++i) {
    for (const Atom property : {XInternAtom(display, "_NET_WM_NAME", False), Atom{XA_WM_NAME}}) {
      Atom type = 0;
      int format = 0;
      unsigned long length = 0;
      unsigned long left = 0;
      unsigned char* bytes = nullptr;
      XGetWindowProperty(display, children[i], property, 0, 100, False, AnyPropertyType, &type, &format, &length,
                         &left, &bytes);
      names.emplace_back(bytes == nullptr ? "" : reinterpret_cast<const char*>(bytes));
      XFree(bytes);
    }
  }
  XFree(children);
  EXPECT_THAT(names, ::testing::IsSupersetOf({"Prüfung 漢", "Prüfung 漢"}));
  display_.Do("key Return");
  EXPECT_EQ(child.Wait(), prompt_result::kOk);
}

TEST_F(ScreenTest, WhenTheDisplayDiesEveryPromptEndsUnanswered) {
  ChildProcess child([](int pipe) {
    ::dup2(pipe, STDERR_FILENO);
    const int first = TextPrompt(u"text", u"title", kPromptTopmost | 4, nullptr, 0);
    return 40 + 10 * first + ImagePrompt(u"text", u"title", 0, u"", nullptr, 0);
  });
  ASSERT_TRUE(AwaitPrompt());
  display_.Kill();
  EXPECT_EQ(child.Wait(), 40);
  const std::string told = child.Read(4096);
  EXPECT_THAT(told, HasSubstr("the display is gone"));
  EXPECT_EQ(std::count(told.begin(), told.end(), '\n'), 1);
}

TEST_F(ScreenTest, WhatCannotBeOpenedIsToldOnceAndIsNoDisplay) {
  const auto show = [](int pipe) {
    ::dup2(pipe, STDERR_FILENO);
    return 40 + TextPrompt(u"text", u"title", 0, nullptr, 0) + TextPrompt(u"text", u"title", 0, nullptr, 0);
  };
  const std::pair<const char*, std::function<void()>> kCases[] = {
      {"the environment variable DISPLAY names no display", [] { ::unsetenv("DISPLAY"); }},
      {"the display :4711 does not open", [] { ::setenv("DISPLAY", ":4711", 1); }},
      {"no thread for it starts",
       [] {
         const rlimit none{0, 0};
         ::setrlimit(RLIMIT_NPROC, &none);
         EXPECT_EQ(::getuid() == 0 ? ::setuid(65534) : 0, 0);  // no limit binds the superuser
       }},
  };
  for (const auto& [reason, prepare] : kCases) {
    ChildProcess child([&, prepare = prepare](int pipe) {
      prepare();
      return show(pipe);
    });
    EXPECT_EQ(child.Wait(), 40);
    const std::string told = child.Read(4096);
    EXPECT_THAT(told, HasSubstr(reason));
    EXPECT_EQ(std::count(told.begin(), told.end(), '\n'), 1) << told;
  }
}

}  // namespace
}  // namespace panelglow::systemtest
