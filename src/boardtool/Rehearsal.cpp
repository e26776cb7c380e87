#include "boardtool/Rehearsal.h"

#include <algorithm>
#include <utility>

#include "board/MotherBoard.h"
#include "board/base/BoardDevio.h"
#include "boardtool/AssumedIdentity.h"
#include "boardtool/BoardOnMachine.h"
#include "boardtool/Everything.h"
#include "boardtool/RehearsalHost.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/Notices.h"
#include "platform/HostInPlace.h"

namespace panelglow::boardtool {

namespace {

constexpr std::uint8_t kZeros = 0x00;
constexpr std::uint8_t kOnes = 0xFF;

struct Run {
  struct Step {
    std::string name;
    bool answer = false;
    std::vector<HardwareAccess> accesses;
  };
  std::string failure;
  std::string className;
  std::vector<std::string> chips;
  std::vector<HardwareAccess> setUp;
  std::vector<Step> steps;
  std::vector<ImaginedHardware::Cell> leftChanged;
};

class Stage {
 public:
  Stage(std::span<const IniOutline> files, const BoardFiles& names, const std::string& systemId,
        platform::Host& machine)
      : names_(names), systemId_(systemId), host_(files, machine), inPlace_(host_.TheHost()), identity_(systemId) {
    BoardDevio().LoadDriver();
    Notices::Forget();
  }

  RehearsalHost& TheHost() { return host_; }

  /// Builds a board and runs the steps of an LED, or none.
  Run Play(const BoardLed* led, std::uint8_t background) {
    Run run;
    std::unique_ptr<MotherBoard> board = Build(run, background);
    if (board == nullptr || led == nullptr) {
      return run;
    }
    run.failure = FailureOf([&] {
      Do(run, *board, "save", led->save);
      const bool blinks = led->blink != nullptr && Do(run, *board, "blink", led->blink);
      if (!blinks) {
        Do(run, *board, "on", led->on);
        Do(run, *board, "off", led->off);
      }
      Do(run, *board, "restore", led->restore);
      run.leftChanged = LeftChanged(background);
      if (blinks) {  // the signal lamp still asks for them, and nothing is wrong when there is no such thing
        const RehearsalHost::Hush hush(host_);
        board.reset();
        Run ignored;
        board = Build(ignored, background);
        if (board != nullptr) {
          Do(run, *board, "on", led->on);
          Do(run, *board, "off", led->off);
        }
      }
    });
    return run;
  }

  void AskEverything() {
    Run ignored;
    if (const std::unique_ptr<MotherBoard> board = Build(ignored, kZeros)) {
      boardtool::AskEverything(*board);
    }
  }

 private:
  std::unique_ptr<MotherBoard> Build(Run& run, std::uint8_t background) {
    host_.NewHardware(background);
    std::unique_ptr<MotherBoard> board;
    run.failure = FailureOf([&] {
      board = MotherBoard::Instantiate(names_.detectPath, names_.testPath, names_.chipPath, "platform", systemId_);
      if (board == nullptr) {
        board = MotherBoard::Instance(names_.detectPath);
      }
    });
    run.setUp = host_.Hardware().TakeAccesses();
    if (board != nullptr) {
      run.className = board->GetClassName();
      run.chips = ChipsOf(*board);
    }
    return board;
  }

  bool Do(Run& run, MotherBoard& board, const char* name, BoardOperation operation) {
    run.steps.push_back({name, false, {}});
    try {
      run.steps.back().answer = (board.*operation)();
    } catch (...) {
      run.steps.back().accesses = host_.Hardware().TakeAccesses();
      throw;
    }
    run.steps.back().accesses = host_.Hardware().TakeAccesses();
    return run.steps.back().answer;
  }

  std::vector<ImaginedHardware::Cell> LeftChanged(std::uint8_t background) {
    std::vector<ImaginedHardware::Cell> changed;
    for (const auto& [cell, value] : host_.Hardware().Written()) {
      // A plain port's last byte says nothing of what stands behind it.
      constexpr int kLastConfigPort = 0x3FF;
      const bool isRegister = cell.space != HardwareAccess::Kind::kPortWrite ||
                              (cell.indexPort >= 0 && cell.indexPort <= kLastConfigPort);
      if (isRegister && value != background) {
        changed.push_back(cell);
      }
    }
    return changed;
  }

  const BoardFiles& names_;
  const std::string& systemId_;
  RehearsalHost host_;
  platform::HostInPlace inPlace_;
  AssumedIdentity identity_;
};

// Another value of the same kind: every number with its lowest bit turned, "yes" for "no". Empty when there is none.
std::string Turned(const std::string& value) {
  if (value == "yes" || value == "no") {
    return value == "yes" ? "no" : "yes";
  }
  std::string turned;
  bool differs = false;
  for (std::size_t at = 0; at < value.size();) {
    const std::size_t end = std::min(value.find_first_of(":.,; \t", at), value.size());
    const std::string token = value.substr(at, end - at);
    const bool isNumber = CDMUtil::ToUnsignedLong(token) != 0 || token.find_first_not_of("0xX") == std::string::npos;
    if (!token.empty() && isNumber) {
      turned += "0x" + CDMUtil::ToHexString(static_cast<int>(CDMUtil::ToUnsignedLong(token) ^ 1U));
      differs = true;
    } else {
      turned += token;
    }
    if (end < value.size()) {
      turned += value[end];
    }
    at = end + 1;
  }
  return differs ? turned : std::string();
}

using Accesses = std::vector<HardwareAccess>;

std::vector<PlannedAccess> Planned(const Accesses& zeros, const Accesses& ones) {
  const bool isComparable = zeros.size() == ones.size();
  std::vector<PlannedAccess> planned;
  for (std::size_t i = 0; i < zeros.size(); ++i) {
    const std::uint64_t other = isComparable && ones[i].kind == zeros[i].kind && ones[i].address == zeros[i].address
                                    ? ones[i].value
                                    : zeros[i].value;
    planned.push_back({zeros[i], zeros[i].value & other, zeros[i].value ^ other, {}});
  }
  return planned;
}

// Marks what is not the same in another run: what differs between the common beginning and the common end.
void Mark(std::vector<PlannedAccess>& planned, const Accesses& other, const IniEntry* entry) {
  const auto isSame = [&](std::size_t mine, std::size_t theirs) {
    const HardwareAccess& a = planned[mine].access;
    const HardwareAccess& b = other[theirs];
    return IsRead(a.kind)
               ? a.kind == b.kind && a.address == b.address && a.reg == b.reg && a.logicalDevice == b.logicalDevice
               : a == b;
  };
  if (planned.size() == other.size()) {
    for (std::size_t i = 0; i < planned.size(); ++i) {
      if (!isSame(i, i)) {
        planned[i].from.push_back(entry);
      }
    }
    return;
  }
  const std::size_t shorter = std::min(planned.size(), other.size());
  std::size_t begin = 0;
  while (begin < shorter && isSame(begin, begin)) {
    ++begin;
  }
  std::size_t end = 0;
  while (end < shorter - begin && isSame(planned.size() - 1 - end, other.size() - 1 - end)) {
    ++end;
  }
  for (std::size_t i = begin; i < planned.size() - end; ++i) {
    planned[i].from.push_back(entry);
  }
}

LedPlan PlanOf(const BoardLed& led, const Run& zeros, const Run& ones) {
  LedPlan plan;
  plan.led = &led;
  plan.failure = zeros.failure;
  for (std::size_t i = 0; i < zeros.steps.size(); ++i) {
    const Run::Step& step = zeros.steps[i];
    const bool isComparable = i < ones.steps.size() && ones.steps[i].name == step.name;
    plan.steps.push_back(
        {step.name, step.answer, Planned(step.accesses, isComparable ? ones.steps[i].accesses : step.accesses)});
    plan.blinksByItself = plan.blinksByItself || (step.name == "blink" && step.answer);
  }
  std::set_intersection(zeros.leftChanged.begin(), zeros.leftChanged.end(), ones.leftChanged.begin(),
                        ones.leftChanged.end(), std::back_inserter(plan.leftChanged));
  return plan;
}

}  // namespace

const PlannedStep* LedPlan::Find(std::string_view name) const {
  const auto found =
      std::find_if(steps.begin(), steps.end(), [&](const PlannedStep& step) { return step.name == name; });
  return found == steps.end() ? nullptr : &*found;
}

bool LedPlan::IsLit() const {
  const PlannedStep* const on = Find("on");
  return blinksByItself || (on != nullptr && on->answer);
}

BoardPlan Rehearse(std::span<const IniOutline> files, const BoardFiles& names, const std::string& systemId,
                   platform::Host& machine, const RehearsalWish& wish) {
  BoardPlan plan;
  plan.systemId = systemId;
  Stage stage(files, names, systemId, machine);
  RecordedProfiles& profiles = stage.TheHost().Profiles();
  const Run empty = stage.Play(nullptr, kZeros);
  plan.className = empty.className;
  plan.failure = empty.failure;
  plan.chips = empty.chips;
  plan.setUp = Planned(empty.setUp, empty.setUp);
  std::vector<std::uint8_t> backgrounds;  // of the LEDs' plans
  if (!empty.className.empty()) {
    for (const BoardLed& led : BoardLeds()) {
      if (wish.led == nullptr || wish.led == &led) {
        const Run zeros = stage.Play(&led, kZeros);
        const Run ones = stage.Play(&led, kOnes);
        plan.leds.push_back(PlanOf(led, zeros, ones));
        backgrounds.push_back(kZeros);
        // A part that reports success by a set bit works on the one hardware only.
        if (LedPlan other = PlanOf(led, ones, zeros); !plan.leds.back().IsLit() && other.IsLit()) {
          plan.leds.back() = std::move(other);
          backgrounds.back() = kOnes;
        }
      }
    }
  }
  if (wish.everything && !empty.className.empty()) {
    stage.AskEverything();
  }
  plan.lookUps = profiles.LookUps();
  plan.found = profiles.Found();
  plan.notices = stage.TheHost().TakeNotices();
  for (const IniEntry* const entry : wish.withSources ? plan.found : std::set<const IniEntry*>{}) {
    const std::string turned = Turned(entry->value);
    if (turned.empty()) {
      continue;
    }
    profiles.Replace(entry, turned);
    for (std::size_t at = 0; at < plan.leds.size(); ++at) {
      LedPlan& led = plan.leds[at];
      const Run other = stage.Play(led.led, backgrounds[at]);
      if (at == 0 && backgrounds[at] == kZeros) {
        Mark(plan.setUp, other.setUp, entry);
      }
      for (std::size_t i = 0; i < led.steps.size() && i < other.steps.size(); ++i) {
        if (led.steps[i].name == other.steps[i].name && other.failure.empty()) {
          Mark(led.steps[i].accesses, other.steps[i].accesses, entry);
        }
      }
    }
    profiles.Replace(nullptr, {});
  }
  return plan;
}

}  // namespace panelglow::boardtool
