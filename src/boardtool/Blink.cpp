#include "boardtool/Blink.h"

#include <algorithm>
#include <set>

#include "boardtool/BoardOnMachine.h"
#include "boardtool/Output.h"
#include "boardtool/Rehearsal.h"
#include "platform/Host.h"

namespace panelglow::boardtool {

namespace {

constexpr std::uint32_t kPhase_ms = 500;
constexpr std::uint32_t kLook_ms = 50;

// Where a plan writes, each place once.
std::string PlacesOf(const LedPlan& plan) {
  std::set<std::string> places;
  for (const PlannedStep& step : plan.steps) {
    for (const PlannedAccess& access : step.accesses) {
      if (IsWrite(access.access.kind)) {
        places.insert(PlaceOf(access.access));
      } else if (access.access.kind == HardwareAccess::Kind::kFirmwareCall) {
        places.insert("the firmware's own calls");
      }
    }
  }
  std::string text;
  for (const std::string& place : places) {
    text += (text.empty() ? "" : ", ") + place;
  }
  return text;
}

// Keeps an LED's state, and gives it back whatever happens.
class KeptLed {
 public:
  KeptLed(MotherBoard& board, const BoardLed& led) : board_(board), led_(led) {}
  ~KeptLed() {
    const std::string failure = FailureOf([&] { (board_.*led_.restore)(); });
    if (!failure.empty()) {
      Say("the LED could not be put back: " + failure);
    }
  }
  KeptLed(const KeptLed&) = delete;
  KeptLed& operator=(const KeptLed&) = delete;

 private:
  MotherBoard& board_;
  const BoardLed& led_;
};

// Waits in short looks; false when the blinking is to end.
bool WaitPhase(const Person& person, bool forKey, std::uint32_t wait_ms) {
  platform::Clock& clock = platform::TheHost().clock;
  const std::uint32_t begin = clock.TickCount();
  for (std::uint32_t waited_ms = 0; waited_ms < wait_ms; waited_ms = clock.TickCount() - begin) {
    if (StopRequest::IsMade() || (forKey && person.hasPressedKey())) {
      return false;
    }
    clock.Sleep(std::min(kLook_ms, wait_ms - waited_ms));
  }
  return true;
}

}  // namespace

int Blink(const BlinkOptions& options, const Person& person) {
  const BoardLed* const led = FindBoardLed(options.led);
  if (led == nullptr) {
    throw WrongCall("there is no LED \"" + options.led + "\": name one of " + BoardLedNames());
  }
  if (options.seconds <= 0 && !person.isThere) {
    throw WrongCall("nobody is at the terminal who could press Enter: give --seconds");
  }
  const BoardFiles names = BoardFilesIn(options.folder);
  RehearsalWish wish;
  wish.led = led;
  wish.withSources = false;
  const BoardPlan plan = Rehearse(ReadBoardFiles(names), names, MachineId(), platform::TheHost(), wish);
  BoardOnMachine machine(options.folder);
  if (!plan.leds.empty()) {
    const std::string places = PlacesOf(plan.leds.front());
    // Hardware may light it where the imagined one does not.
    const std::string title(led->title);
    Say((plan.leds.front().IsLit() ? "blinks the " + title : "looks whether the " + title + " can be lit") +
        " of board " + machine.SystemId() + (IsSimulated() ? " (simulated)" : "") +
        (places.empty() ? "" : "; it writes " + places) + (options.seconds > 0 ? "." : ". Enter ends it."));
  }
  MotherBoard& board = machine.Board();
  const bool forKey = options.seconds <= 0;
  bool isLit = false;
  std::string failure;
  {
    const KeptLed kept(board, *led);
    failure = FailureOf([&] {
      (board.*led->save)();
      const bool byItself = led->blink != nullptr && (board.*led->blink)();
      isLit = byItself;
      const std::uint32_t begin = platform::TheHost().clock.TickCount();
      bool isOn = false;
      do {
        isOn = !isOn;
        if (!byItself) {
          isLit = (board.*(isOn ? led->on : led->off))() || (isLit && !isOn);
        }
      } while (isLit && WaitPhase(person, forKey, kPhase_ms) &&
               (forKey ||
                platform::TheHost().clock.TickCount() - begin < static_cast<std::uint32_t>(options.seconds) * 1000U));
      if (isLit && isOn && !byItself) {
        (board.*led->off)();
      }
    });
  }
  if (!failure.empty()) {
    throw CannotRun("the LED cannot be blinked: " + failure);
  }
  if (!isLit) {
    Say("this board does not light it; \"explain\" says why");
    return 1;
  }
  return 0;
}

}  // namespace panelglow::boardtool
