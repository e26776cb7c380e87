// The windows on a real display: how long the dialog with all its buttons takes to its first painting, how long a
// change takes to be seen, and what a prompt that waits costs. To be run in the folder installation/, with DISPLAY
// naming a display that nobody else uses (tools/bench starts one).
#include <benchmark/benchmark.h>
#include <sys/resource.h>

#include <chrono>
#include <thread>
#include <utility>

#include "harness/CmdLineParser.h"
#include "ledtests/CustomLEDTest.h"
#include "ledtests/SuperDialog.h"
#include "platform/Host.h"
#include "prompts/PlainPrompt.h"
#include "prompts/PromptWindow.h"

// Behind the benchmark library, whose names its macros would replace.
#include <X11/Xlib.h>
#include <X11/Xutil.h>

namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;
using panelglow::platform::TheHost;
using panelglow::platform::WindowHandle;
namespace message = panelglow::platform::message;

// What is on the display, looked at through a connection of its own.
class Eye {
 public:
  Eye() : display_(::XOpenDisplay(nullptr)) {}
  ~Eye() {
    if (display_ != nullptr) {
      ::XCloseDisplay(display_);
    }
  }
  Eye(const Eye&) = delete;
  Eye& operator=(const Eye&) = delete;

  [[nodiscard]] bool IsOpen() const { return display_ != nullptr; }
  [[nodiscard]] unsigned long PixelAt(int x, int y) const {
    XImage* image = ::XGetImage(display_, DefaultRootWindow(display_), x, y, 1, 1, AllPlanes, ZPixmap);
    const unsigned long pixel = XGetPixel(image, 0, 0) & 0xFFFFFFU;
    XDestroyImage(image);
    return pixel;
  }

  // Looks until the pixel has the colour; false when five seconds are over.
  [[nodiscard]] bool Await(int x, int y, unsigned long color) const {
    const Clock::time_point end = Clock::now() + 5s;
    while (PixelAt(x, y) != color) {
      if (Clock::now() > end) {
        return false;
      }
      std::this_thread::sleep_for(50us);
    }
    return true;
  }

 private:
  ::Display* display_;
};

// The dialog with 24 buttons, on a thread of its own. Its one LED has no worker, so nothing blinks.
class Dialog {
 public:
  Dialog() {
    test_.ledTimeout = 1000;
    test_.deviceCount = 1;
    test_.devices[0].tested = false;
    for (std::size_t i = 0; i < panelglow::kMostButtons; ++i) {
      panelglow::ButtonDefStruct button;
      button.messageId = std::to_string(26 + i);  // of the installation's captions
      button.buttonIco = "power_green.ico";
      button.buttonLParam = std::to_string(kFirstCommand + i);
      test_.buttons.push_back(button);
    }
    test_.InitializeButtonArray();
    thread_ = std::thread([this] { panelglow::SuperDialog(test_).CreateSuperDialog(); });
  }
  ~Dialog() {
    TheHost().desktop.Post({Window(), message::kCommand, kCancel, 0});
    thread_.join();
  }
  Dialog(const Dialog&) = delete;
  Dialog& operator=(const Dialog&) = delete;

  static WindowHandle Window() { return TheHost().desktop.ForegroundWindow(); }

  static constexpr int kFirstCommand = 700;
  static constexpr std::uintptr_t kCancel = 999;

 private:
  panelglow::CustomLEDTest test_;
  std::thread thread_;
};

// The client origin of the dialog on the display, and a corner of its last button's face.
constexpr int kClientX = (1280 - 615) / 2 + 3;
constexpr int kClientY = (1024 - 608) / 2 + 3;
constexpr int kLastX = 462;
constexpr int kLastY = 472;
constexpr int kFaceX = kClientX + kLastX + 4;
constexpr int kFaceY = kClientY + kLastY + 4;

// The dialog thread waits so long before it makes the window.
constexpr std::chrono::milliseconds kBeforeWindow = 200ms;

void Count(benchmark::State& state, Clock::duration took) {
  state.SetIterationTime(std::chrono::duration<double>(took).count());
}

// The colour of a button's face; without a dialog it is the display's own, black.
constexpr unsigned long kFace = 0xE8E8E8;
constexpr unsigned long kDialogGray = 0xC0C0C0;
constexpr unsigned long kNothing = 0;

void DialogToFirstPaint(benchmark::State& state) {
  const Eye eye;
  for (auto _ : state) {
    bool seen = false;
    {
      const Clock::time_point begin = Clock::now();
      const Dialog dialog;
      seen = eye.Await(kFaceX, kFaceY, kFace);
      Count(state, Clock::now() - begin - kBeforeWindow);
    }
    if (!seen || !eye.Await(kFaceX, kFaceY, kNothing)) {
      state.SkipWithError("the dialog did not come and go");
      break;
    }
  }
}

// A window goes off its place and comes back, which is seen at the last button's corner.
template <class Move>
void AwaitMoves(benchmark::State& state, Move move) {
  const Eye eye;
  const Dialog dialog;
  if (!eye.Await(kFaceX, kFaceY, kFace)) {
    state.SkipWithError("no dialog");
    return;
  }
  bool away = false;
  for (auto _ : state) {
    away = !away;
    const Clock::time_point begin = Clock::now();
    move(away ? 10 : 0);
    const bool seen = eye.Await(kFaceX, kFaceY, away ? kDialogGray : kFace);
    Count(state, Clock::now() - begin);
    if (!seen) {
      state.SkipWithError("the change was not seen");
      break;
    }
  }
}

void MovedButton(benchmark::State& state) {
  AwaitMoves(state, [](int by) {
    const WindowHandle button =
        TheHost().desktop.FindControl(Dialog::Window(), Dialog::kFirstCommand + int{panelglow::kMostButtons} - 1);
    TheHost().desktop.MoveWindow(button, kLastX + by, kLastY, 130, 30);
  });
}

// The whole dialog is drawn again.
void MovedDialog(benchmark::State& state) {
  AwaitMoves(state, [](int by) {
    TheHost().desktop.MoveWindow(Dialog::Window(), kClientX - 3 + by, kClientY - 3, 615, 608);
  });
}

double ProcessorSeconds() {
  rusage usage{};
  ::getrusage(RUSAGE_SELF, &usage);
  const auto seconds = [](const timeval& time) {
    return static_cast<double>(time.tv_sec) + 1e-6 * static_cast<double>(time.tv_usec);
  };
  return seconds(usage.ru_utime) + seconds(usage.ru_stime);
}

// A topmost prompt (the others have no 10 ms tick) that nobody answers.
void ShowPrompt(unsigned seconds) {
  panelglow::ThePromptState().timeoutSeconds = seconds;
  panelglow::ThePromptState().timeoutResult = panelglow::prompt_result::kCancel;
  panelglow::TextPrompt(u"Wait.", u"title", panelglow::kPromptTopmost, nullptr, 0);
}

// The share of a core that the process takes during a wait.
template <class Wait>
void CountProcessor(benchmark::State& state, Wait wait) {
  for (auto _ : state) {
    const double before = ProcessorSeconds();
    const Clock::time_point begin = Clock::now();
    wait();
    const double waited = std::chrono::duration<double>(Clock::now() - begin).count();
    state.SetIterationTime(waited);
    state.counters["percent of a core"] = 100 * (ProcessorSeconds() - before) / waited;
  }
}

// The first prompt of a process loads the drawing library.
void PromptWaits(benchmark::State& state) {
  ShowPrompt(1);
  CountProcessor(state, [] { ShowPrompt(5); });
}

// The peer: a thread that wakes up as often and does nothing.
void BareWakeUps(benchmark::State& state) {
  CountProcessor(state, [] {
    for (int tick = 0; tick < 500; ++tick) {
      std::this_thread::sleep_for(10ms);
    }
  });
}

BENCHMARK(DialogToFirstPaint)->UseManualTime()->Iterations(10)->Unit(benchmark::kMillisecond);
BENCHMARK(MovedButton)->UseManualTime()->Iterations(200)->Unit(benchmark::kMillisecond);
BENCHMARK(MovedDialog)->UseManualTime()->Iterations(200)->Unit(benchmark::kMillisecond);
BENCHMARK(PromptWaits)->UseManualTime()->Iterations(1)->Unit(benchmark::kMillisecond);
BENCHMARK(BareWakeUps)->UseManualTime()->Iterations(1)->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
  constexpr const char* kCommandLine[] = {"panelglow-diags", "-subtest=CustomLEDTest"};
  panelglow::CmdLineParser::GetInstance(2, kCommandLine);
  ::benchmark::Initialize(&argc, argv);
  if (!Eye().IsOpen()) {
    std::fputs("bench_windows: DISPLAY names no display\n", stderr);
    return 1;
  }
  ::benchmark::RunSpecifiedBenchmarks();
  return 0;
}
