// An operator test's dialog and its workers on threads that really run at once, on a real display: for the thread
// sanitizer, above all.
#include <gmock/gmock.h>

#include <chrono>
#include <cstdlib>
#include <thread>

#include "harness/CmdLineParser.h"
#include "ledtests/FrontPanelTest.h"
#include "ledtests/LedKind.h"

// Behind the test framework's headers, whose names its macros would replace.
#include "display/VirtualDisplay.h"

namespace panelglow::systemtest {
namespace {

struct Place {
  const char* function;
  int x;  // of its button, on the screen
  int y;
};

constexpr int kFirstRow = 373;
constexpr Place kOrder[] = {{"noled", 455, kFirstRow}, {"numlock", 657, kFirstRow}, {"network", 859, kFirstRow}};
constexpr unsigned long kDialogGray = 0xC0C0C0;

// LEDs of this machine's host, where no key has a LED and no adapter a link: their workers run, and light nothing.
class Probe : public FrontPanelTest {
 public:
  explicit Probe(CDevio& driverClient) : FrontPanelTest(driverClient) {}

  bool Run() override {
    PrepareAttempt();
    return RunSuperLEDTest();
  }

 protected:
  void PrepareAttempt() override {
    BeginArray();
    rules = {};
    for (const Place& place : kOrder) {
      const LedKind& kind = *FindLedKindByFunction(place.function);
      AddDevice(kind.deviceId, 0, "");
      rules.buttons.push_back({"", u"button", static_cast<int>(kind.buttonCommand)});
      rules.answers.push_back({kind.buttonCommand, {kind.deviceId}});
    }
  }
};

TEST(DialogThreads, WorkersAndDialogShareOnlyWhatTheyMay) {
  const VirtualDisplay display;
  ASSERT_TRUE(display.IsOpen()) << "Xvfb does not start";
  ::setenv("DISPLAY", display.Name().c_str(), 1);
  const char* arguments[] = {"panelglow-diags"};
  CmdLineParser::GetInstance(1, arguments);
  std::thread person([&display] {
    EXPECT_TRUE(display.AwaitPixel(640, 780, kDialogGray, std::chrono::seconds(20)));
    for (const Place& place : kOrder) {  // answers once the LED has had its time to begin
      display.Do("sleep 1.5 mousemove " + std::to_string(place.x) + " " + std::to_string(place.y) + " click 1");
    }
  });
  CDevio driver;
  Probe test(driver);
  EXPECT_TRUE(test.Run());
  EXPECT_EQ(test.testResult, FrontPanelTest::kRightAnswer);
  person.join();
}

}  // namespace
}  // namespace panelglow::systemtest
