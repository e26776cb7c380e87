#include "platform/sim/person/Operator.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <fstream>
#include <utility>

#include "platform/sim/base/MachineError.h"

namespace panelglow::platform::sim {

namespace {

constexpr Microseconds kMillisecond = 1000;
constexpr Microseconds kGlance = 50 * kMillisecond;        // how often the person looks
constexpr Microseconds kReaction = 300 * kMillisecond;     // from knowing to pressing
constexpr Microseconds kReading = 800 * kMillisecond;      // of a prompt
constexpr Microseconds kBlindPause = 3000 * kMillisecond;  // between presses of one who does not look
// A LED blinks when it has changed five times and not long ago: a LED that is put back after its turn, or that blinks
// by itself until then, changes up to four times more. The slowest blink has phases of 1.5 s.
constexpr std::size_t kEdgesOfABlink = 5;
constexpr Microseconds kLongestPhase = 1600 * kMillisecond;
constexpr Microseconds kShortestFlash = 1 * kMillisecond;  // a shorter change and its reverse go unseen
constexpr Microseconds kDarkness = 6000 * kMillisecond;    // nothing has changed for so long: no LED blinks

constexpr int kOkButton = 1005;
constexpr int kCancelTest = 999;
constexpr int kStartTest = 1000;
constexpr int kNoLedButton = 1019;

struct Knowledge {
  std::string_view symbol;
  std::array<std::string_view, 3> colors;
  int button;
};

// What a trained person knows: which button stands for which lamp.
constexpr std::array<Knowledge, 15> kKnowledge{{
    {"num-lock", {"green", "white", "blue"}, 1003},
    {"caps-lock", {"green", "white", "blue"}, 1006},
    {"scroll-lock", {"green", "white", "blue"}, 1009},
    {"power", {"green", "white", "blue"}, 1017},
    {"power", {"red", "amber", ""}, 1020},
    {"charge", {"green", "white", "blue"}, 1012},
    {"charge", {"red", "amber", ""}, 1015},
    {"drive", {"green", "white", "blue"}, 1013},
    {"drive", {"red", "amber", ""}, 1016},
    {"network", {"green", "white", "blue"}, 1018},
    {"webcam", {"green", "white", "blue"}, 1024},
    {"floppy", {"green", "white", "amber"}, 1001},
    {"touchpad", {"amber", "white", "green"}, 1025},
    {"speaker-mute", {"amber", "white", "red"}, 1026},
    {"microphone-mute", {"amber", "white", "red"}, 1027},
}};

struct PolicyRow {
  std::string_view name;
  unsigned number;  // when the policy does not say
  std::string_view help;
};

constexpr std::array<PolicyRow, 9> kPolicies{{
    {"perfect", 0, "presses the button of the LED that blinks, \"no LED\" when none does"},
    {"wrong", 1, "wrong:N is wrong once, at the N-th answer (1), and perfect otherwise, also at a retry"},
    {"slow", 5, "slow:S answers rightly S seconds late (5)"},
    {"cancel", 1, "cancel:N presses the cancel button once, at the N-th answer (1), and is perfect otherwise"},
    {"silent", 0, "confirms prompts and never answers a LED"},
    {"random", 0, "never looks, presses any LED button"},
    {"first", 0, "never looks, always presses the first LED button"},
    {"elimination", 0, "never looks, presses each LED button once, in a random order"},
    {"script", 0, "script:FILE clicks at given times; each line of FILE is \"<milliseconds> <control id>\""},
}};

// A caption as it is read: "&&" is an ampersand, a single one marks a letter.
std::string CaptionOf(const std::u16string& text) {
  std::u16string caption;
  for (std::size_t i = 0; i < text.size(); ++i) {
    i += text[i] == u'&' && i + 1 < text.size() ? 1 : 0;
    caption += text[i];
  }
  return Utf8FromWide(caption);
}

}  // namespace

std::string Operator::PolicyHelp() {
  std::string text;
  for (const PolicyRow& policy : kPolicies) {
    text +=
        "  " + std::string(policy.name) + std::string(13 - policy.name.size(), ' ') + std::string(policy.help) + "\n";
  }
  return text;
}

std::string Operator::PolicyNames() {
  std::string names;
  for (const PolicyRow& policy : kPolicies) {
    names += (names.empty() ? "" : ", ") + std::string(policy.name);
  }
  return names;
}

Operator::Operator(OperatorSeat seat, std::vector<Led> design, const std::string& policy)
    : seat_(std::move(seat)), design_(std::move(design)) {
  const std::size_t colon = policy.find(':');
  const std::string name = policy.substr(0, colon);
  const std::string detail = colon == std::string::npos ? "" : policy.substr(colon + 1);
  const auto found =
      std::find_if(kPolicies.begin(), kPolicies.end(), [&](const PolicyRow& p) { return p.name == name; });
  if (found == kPolicies.end()) {
    throw MachineError("there is no operator \"" + name + "\" (" + PolicyNames() + ")");
  }
  policy_ = static_cast<Policy>(found - kPolicies.begin());
  number_ = found->number;
  if (policy_ == Policy::kScript) {
    RunScript(detail);
    return;
  }
  if (!detail.empty()) {
    const auto [end, error] = std::from_chars(detail.data(), detail.data() + detail.size(), number_);
    if (error != std::errc() || end != detail.data() + detail.size()) {
      throw MachineError("the operator \"" + policy + "\" needs a number behind the colon");
    }
  }
  LookAgain();
}

void Operator::LookAgain() {
  seat_.time.At(seat_.time.Now() + kGlance, [this] { Look(); });
}

std::vector<Operator::Button> Operator::ButtonsOnTop(desktop::WindowSystem& windows, WindowHandle top) const {
  std::vector<Button> buttons;
  for (const WindowHandle child : windows.Children(top)) {
    if (windows.ControlId(child) == 0 || !windows.IsWindowVisible(child) || !windows.IsWindowEnabled(child)) {
      continue;
    }
    const Rectangle area = windows.ScreenRectangle(child);
    buttons.push_back({windows.ControlId(child), (area.left + area.right) / 2, (area.top + area.bottom) / 2,
                       CaptionOf(windows.WindowText(child))});
  }
  return buttons;
}

void Operator::Look() {
  desktop::WindowSystem& windows = seat_.windows;
  const Microseconds now = seat_.time.Now();
  const std::vector<WindowHandle> visible = windows.TopLevelWindows();
  const WindowHandle top = visible.empty() ? 0 : visible.back();
  if (top != window_) {
    window_ = top;
    windowSeen_ = now;
    turnBegan_ = now;
    judged_.reset();
    pressed_.clear();
  }
  if (top != 0) {
    const std::vector<Button> buttons = ButtonsOnTop(windows, top);
    const bool isTest = windows.FindControl(top, kCancelTest) != 0;
    if (isTest) {
      LookAtTest(buttons);
    } else {
      LookAtPrompt(buttons);
    }
  }
  LookAgain();
}

void Operator::LookAtPrompt(const std::vector<Button>& buttons) {
  const bool canConfirm =
      std::any_of(buttons.begin(), buttons.end(), [](const Button& button) { return button.id == kOkButton; });
  if (canConfirm && pressed_.empty() && seat_.time.Now() >= windowSeen_ + kReading) {
    Press(buttons, kOkButton);
  }
}

void Operator::LookAtTest(const std::vector<Button>& buttons) {
  const Microseconds now = seat_.time.Now();
  const bool canStart =
      std::any_of(buttons.begin(), buttons.end(), [](const Button& button) { return button.id == kStartTest; });
  if (canStart) {
    if (now >= windowSeen_ + kReading) {
      Press(buttons, kStartTest);
    }
    return;
  }
  if (policy_ == Policy::kSilent) {
    return;
  }
  if (!judged_) {
    const bool blind = policy_ == Policy::kRandom || policy_ == Policy::kFirst || policy_ == Policy::kElimination;
    if (blind) {
      answer_ = now >= turnBegan_ + kBlindPause ? GuessButton(buttons) : std::nullopt;
    } else {
      answer_ = JudgePanel(buttons);
    }
    if (answer_) {
      judged_ = now;
    }
    return;
  }
  const Microseconds late = policy_ == Policy::kSlow ? Microseconds{number_} * 1'000'000 : kReaction;
  if (now < *judged_ + late) {
    return;
  }
  ++answers_;
  int id = *answer_;
  if (policy_ == Policy::kCancel && answers_ == number_) {
    id = kCancelTest;
  } else if (policy_ == Policy::kWrong && answers_ == number_) {
    const auto other = std::find_if(buttons.begin(), buttons.end(), [&](const Button& button) {
      return button.id != id && button.id != kCancelTest && button.id != kStartTest;
    });
    id = other == buttons.end() ? id : other->id;
  }
  Press(buttons, id);
}

// The button for what the panel shows, once that is clear; nothing while it is not, and for good when the panel shows
// what no button stands for: two LEDs that blink at once, or a colour that this machine does not have.
std::optional<int> Operator::JudgePanel(const std::vector<Button>& buttons) const {
  const FrontPanel& panel = seat_.panel;
  const Microseconds now = seat_.time.Now();
  const std::vector<LedChange>& timeLine = panel.TimeLine();
  const auto turn = std::find_if(timeLine.rbegin(), timeLine.rend(),
                                 [this](const LedChange& change) { return change.time < turnBegan_; });
  std::vector<std::vector<Microseconds>> edges(panel.Leds().size());
  for (auto change = turn.base(); change != timeLine.end(); ++change) {
    std::vector<Microseconds>& seen = edges[change->led];
    if (!seen.empty() && change->time - seen.back() < kShortestFlash) {
      seen.pop_back();  // neither this change nor the one that it takes back was seen
    } else {
      seen.push_back(change->time);
    }
  }
  Microseconds lastChange = turnBegan_;
  for (const std::vector<Microseconds>& seen : edges) {
    lastChange = seen.empty() ? lastChange : std::max(lastChange, seen.back());
  }
  std::vector<std::size_t> blinking;
  for (std::size_t led = 0; led < edges.size(); ++led) {
    if (edges[led].size() >= kEdgesOfABlink && edges[led].back() + kLongestPhase >= now) {
      blinking.push_back(led);
    }
  }
  int wanted = 0;
  if (blinking.size() == 1) {
    const Led& seen = panel.Leds()[blinking.front()];
    const bool designed = std::any_of(design_.begin(), design_.end(), [&](const Led& led) {
      return led.symbol == seen.symbol && led.color == seen.color;
    });
    for (const Knowledge& known : kKnowledge) {
      const bool fits = known.symbol == seen.symbol &&
                        std::find(known.colors.begin(), known.colors.end(), seen.color) != known.colors.end();
      wanted = fits && designed ? known.button : wanted;
    }
  } else if (blinking.empty() && lastChange + kDarkness <= now) {
    wanted = kNoLedButton;
  }
  const bool offered =
      std::any_of(buttons.begin(), buttons.end(), [&](const Button& button) { return button.id == wanted; });
  return wanted != 0 && offered ? std::optional<int>(wanted) : std::nullopt;
}

std::optional<int> Operator::GuessButton(const std::vector<Button>& buttons) {
  std::vector<int> choices;
  for (const Button& button : buttons) {
    const bool used =
        policy_ == Policy::kElimination && std::find(pressed_.begin(), pressed_.end(), button.id) != pressed_.end();
    if (button.id > kStartTest && !used) {
      choices.push_back(button.id);
    }
  }
  if (choices.empty()) {
    return std::nullopt;
  }
  if (policy_ == Policy::kFirst) {
    return choices.front();
  }
  return choices[seat_.time.Random(static_cast<std::uint32_t>(choices.size()))];
}

void Operator::Press(const std::vector<Button>& buttons, int id) {
  const auto button = std::find_if(buttons.begin(), buttons.end(), [&](const Button& b) { return b.id == id; });
  if (button == buttons.end()) {
    return;
  }
  seat_.picture(id == kOkButton ? "prompt" : "press-" + std::to_string(id));
  actions_.push_back({seat_.time.Now(), "presses \"" + button->caption + "\" (" + std::to_string(id) + ")"});
  pressed_.push_back(id);
  turnBegan_ = seat_.time.Now();
  judged_.reset();
  seat_.windows.Click(button->x, button->y);
}

void Operator::RunScript(const std::string& path) {
  std::ifstream file(path);
  if (!file) {
    throw MachineError("the operator's script " + path + " cannot be read");
  }
  Microseconds at_ms = 0;
  int id = 0;
  while (file >> at_ms >> id) {
    seat_.time.At(at_ms * kMillisecond, [this, id] {
      desktop::WindowSystem& windows = seat_.windows;
      const std::vector<WindowHandle> visible = windows.TopLevelWindows();
      if (!visible.empty()) {
        Press(ButtonsOnTop(windows, visible.back()), id);
      }
    });
  }
  if (!file.eof()) {
    throw MachineError("the operator's script " + path + " must hold lines of \"<milliseconds> <control id>\"");
  }
}

}  // namespace panelglow::platform::sim
