#include "platform/sim/person/FrontPanel.h"

#include <algorithm>
#include <array>
#include <utility>

namespace panelglow::platform::sim {

namespace {

struct FaultName {
  std::string_view name;
  LedFault fault;
  std::string_view help;
};

constexpr std::array<FaultName, 8> kFaultNames{{
    {"dead", LedFault::kDead, "never lights"},
    {"stuck", LedFault::kStuck, "is always lit"},
    {"wrong-color", LedFault::kWrongColor, "glows in another colour: green where it should be red, else red"},
    {"swapped", LedFault::kSwapped, "swapped:OTHER lights in the place of the LED OTHER, and OTHER in its place"},
    {"shorted", LedFault::kShorted, "shorted:OTHER lights whenever it or the LED OTHER does, and so does OTHER"},
    {"inverted", LedFault::kInverted, "is dark where it should be lit; a blink looks the same"},
    {"lying-write", LedFault::kLyingWrite, "writes to its register are lost"},
    {"absent-chip", LedFault::kAbsentChip, "the part that drives it is not there"},
}};

// The colour that a wrongly fitted LED has instead.
std::string WrongColor(const std::string& color) { return color == "red" ? "green" : "red"; }

}  // namespace

std::optional<LedFault> LedFaultByName(std::string_view name) {
  const auto found =
      std::find_if(kFaultNames.begin(), kFaultNames.end(), [&](const FaultName& f) { return f.name == name; });
  return found == kFaultNames.end() ? std::nullopt : std::optional<LedFault>(found->fault);
}

std::string LedFaultNames() {
  std::string names;
  for (const FaultName& fault : kFaultNames) {
    names += (names.empty() ? "" : ", ") + std::string(fault.name);
  }
  return names;
}

std::string LedFaultHelp() {
  std::string text;
  for (const FaultName& fault : kFaultNames) {
    text +=
        "  " + std::string(fault.name) + std::string(13 - fault.name.size(), ' ') + std::string(fault.help) + "\n";
  }
  return text;
}

FrontPanel::FrontPanel(std::vector<Led> leds, PinReader reader)
    : leds_(std::move(leds)), reader_(std::move(reader)), lit_(leds_.size()) {}

std::optional<std::size_t> FrontPanel::Find(std::string_view name) const {
  const auto found = std::find_if(leds_.begin(), leds_.end(), [&](const Led& led) { return led.name == name; });
  return found == leds_.end() ? std::nullopt : std::optional<std::size_t>(found - leds_.begin());
}

bool FrontPanel::IsLit(std::string_view name) const {
  const std::optional<std::size_t> led = Find(name);
  return led && lit_[*led];
}

bool FrontPanel::Break(std::string_view name, LedFault fault, std::string_view partner) {
  const std::optional<std::size_t> index = Find(name);
  if (!index) {
    return false;
  }
  Led& led = leds_[*index];
  led.fault = fault;
  if (fault == LedFault::kSwapped || fault == LedFault::kShorted) {
    const std::optional<std::size_t> other = Find(partner);
    if (!other || *other == *index) {
      return false;
    }
    led.partner = std::string(partner);
    leds_[*other].fault = fault;
    leds_[*other].partner = led.name;
  }
  if (fault == LedFault::kWrongColor) {
    led.color = WrongColor(led.color);
  }
  return true;
}

bool FrontPanel::Level(const Led& led) const {
  const std::optional<bool> level = reader_(led.device, led.pin);
  return level && *level != led.activeLow;
}

bool FrontPanel::Appearance(const Led& led) const {
  const auto partnerLevel = [&] {
    const std::optional<std::size_t> partner = Find(led.partner);
    return partner && Level(leds_[*partner]);
  };
  switch (led.fault) {
    case LedFault::kDead:
    case LedFault::kAbsentChip:
      return false;
    case LedFault::kStuck:
      return true;
    case LedFault::kSwapped:
      return partnerLevel();
    case LedFault::kShorted:
      return Level(led) || partnerLevel();
    case LedFault::kInverted:
      return !Level(led);
    default:
      return Level(led);
  }
}

void FrontPanel::Update(Microseconds now) {
  for (std::size_t i = 0; i < leds_.size(); ++i) {
    const bool lit = Appearance(leds_[i]);
    if (lit != lit_[i]) {
      lit_[i] = lit;
      timeLine_.push_back({now, i, lit});
    }
  }
}

}  // namespace panelglow::platform::sim
