#include "boardtool/Explain.h"
#include "boardtool/Output.h"

#include <algorithm>
#include <map>
#include <nlohmann/json.hpp>

#include "platform/Host.h"

namespace panelglow::boardtool {

namespace {

using Json = nlohmann::ordered_json;
using Files = std::vector<IniOutline>;

constexpr std::size_t kSourceColumn = 62;

// A written value as people think of it: which bits it sets, which it clears, which stay.
std::string BitsOf(const PlannedAccess& planned) {
  if (!IsWrite(planned.access.kind) || planned.kept == 0) {
    return {};
  }
  const int digits = static_cast<int>(std::max(1U, planned.access.width) * 2);
  const std::uint64_t all =
      planned.access.width >= 8 ? ~std::uint64_t{0} : (std::uint64_t{1} << (8 * planned.access.width)) - 1;
  const std::uint64_t cleared = all & ~planned.kept & ~planned.set;
  std::string text = "as read";
  text += planned.set == 0 ? "" : ", bits " + Hex(planned.set, digits) + " set";
  text += cleared == 0 ? "" : ", bits " + Hex(cleared, digits) + " cleared";
  return text;
}

std::string ValueOf(const PlannedAccess& planned) {
  const std::string bits = BitsOf(planned);
  if (!bits.empty()) {
    return " <- " + bits;
  }
  return IsRead(planned.access.kind)
             ? " is read"
             : " <- " + Hex(planned.access.value, static_cast<int>(std::max(1U, planned.access.width) * 2));
}

std::string TextOf(const PlannedAccess& planned) {
  const HardwareAccess& access = planned.access;
  const std::string text =
      IsRead(access.kind) || IsWrite(access.kind) ? PlaceOf(access) + ValueOf(planned) : Describe(access);
  const std::string reg = RegisterOf(access);
  return text + (reg.empty() ? "" : "  (" + reg + ")");
}

// A line for people: one request, or an index port's write with the access to the register behind it.
struct ShownLine {
  std::string text;
  std::vector<const IniEntry*> from;
  unsigned times = 1;
};

bool SelectsNext(const PlannedAccess& access, const PlannedAccess& next) {
  // Above the configuration ports an index is only one way to see it: an output in front of its pins looks the same.
  constexpr int kLastConfigPort = 0x3FF;
  return access.access.kind == HardwareAccess::Kind::kPortWrite && next.access.reg >= 0 &&
         next.access.indexPort <= kLastConfigPort &&
         access.access.address == static_cast<std::uint64_t>(next.access.indexPort) &&
         access.access.value == static_cast<std::uint64_t>(next.access.reg);
}

std::vector<ShownLine> Shown(const std::vector<PlannedAccess>& accesses) {
  std::vector<ShownLine> lines;
  for (std::size_t i = 0; i < accesses.size(); ++i) {
    ShownLine line{TextOf(accesses[i]), accesses[i].from};
    if (i + 1 < accesses.size() && SelectsNext(accesses[i], accesses[i + 1])) {
      const PlannedAccess& access = accesses[++i];
      line = {RegisterOf(access.access) + " behind port " + Hex(static_cast<unsigned>(access.access.indexPort), 4) +
                  ValueOf(access),
              access.from};
    }
    if (!lines.empty() && lines.back().text == line.text && lines.back().from == line.from) {
      ++lines.back().times;
    } else {
      lines.push_back(std::move(line));
    }
  }
  return lines;
}

// How many requests hang on each entry.
using Weights = std::map<const IniEntry*, std::size_t>;

Weights WeightsOf(const BoardPlan& plan) {
  Weights weights;
  const auto count = [&](const std::vector<PlannedAccess>& accesses) {
    for (const PlannedAccess& access : accesses) {
      for (const IniEntry* const entry : access.from) {
        ++weights[entry];
      }
    }
  };
  count(plan.setUp);
  for (const LedPlan& led : plan.leds) {
    for (const PlannedStep& step : led.steps) {
      count(step.accesses);
    }
  }
  return weights;
}

// The entry that says most about a request is the one on which the fewest hang.
std::string SourceOf(std::vector<const IniEntry*> from, const Files& files, const Weights& weights) {
  constexpr std::size_t kMostShown = 2;
  std::stable_sort(from.begin(), from.end(),
                   [&](const IniEntry* a, const IniEntry* b) { return weights.at(a) < weights.at(b); });
  std::string text;
  for (std::size_t i = 0; i < from.size() && i < kMostShown; ++i) {
    text += (i == 0 ? "" : ", ") + PlaceOf(files, *from[i]) + " " + from[i]->key;
  }
  return text + (from.size() > kMostShown ? ", ..." : "");
}

std::string Line(const std::string& head, const std::string& text, const std::string& source) {
  std::string line = head + text;
  if (!source.empty()) {
    line.resize(std::max(line.size() + 2, kSourceColumn), ' ');
    line += source;
  }
  return line + "\n";
}

std::string StepText(const PlannedStep& step, const Files& files, const Weights& weights) {
  std::string head = "  " + step.name;
  head.resize(12, ' ');
  if (step.accesses.empty()) {
    return head + (step.answer ? "nothing to do" : "no such thing on this board") + "\n";
  }
  std::string text;
  for (const ShownLine& line : Shown(step.accesses)) {
    text += Line(text.empty() ? head : std::string(head.size(), ' '),
                 line.text + (line.times > 1 ? "  (" + std::to_string(line.times) + " times)" : ""),
                 SourceOf(line.from, files, weights));
  }
  return text + (step.answer ? "" : std::string(head.size(), ' ') + "the board answers: not done\n");
}

// The entries that chose the board, its chips and an LED's chip.
std::string Decided(const BoardPlan& plan, const Files& files, const std::string& key) {
  for (const IniEntry* const entry : plan.found) {
    if (LoweredName(entry->key) == LoweredName(key)) {
      return PlaceOf(files, *entry) + " " + entry->key + "=" + entry->value;
    }
  }
  return {};
}

std::string ByteName(const ImaginedHardware::Cell& cell) {
  HardwareAccess access;
  access.kind = cell.space;
  access.width = 1;
  access.address = cell.address;
  if (cell.indexPort >= 0) {
    access.address = static_cast<std::uint64_t>(cell.indexPort) + 1;
    access.indexPort = cell.indexPort;
    access.logicalDevice = cell.logicalDevice;
    access.reg = static_cast<int>(cell.address);
    return RegisterOf(access) + " at " + PlaceOf(access);
  }
  return PlaceOf(access);
}

std::string LedText(const BoardPlan& plan, const LedPlan& led, const Files& files, const Weights& weights) {
  std::string text = "\n" + std::string(led.led->id) + ": " + std::string(led.led->title) + "\n";
  const std::string decided = Decided(plan, files, std::string(led.led->chipKey));
  text += Line("  chip      ",
               decided.empty() ? "no key \"" + std::string(led.led->chipKey) + "\" chooses one" +
                                     (led.IsLit() ? ": the board's class lights it itself" : "")
                               : "",
               decided);
  if (!led.failure.empty()) {
    text += "  ends with  " + led.failure + "\n";
  }
  for (const PlannedStep& step : led.steps) {
    text += StepText(step, files, weights);
  }
  if (led.blinksByItself) {
    text += "  The chip blinks it by itself; \"on\" and \"off\" are for the signal lamp.\n";
  } else if (led.IsLit()) {
    text += "  It is blinked by \"on\" and \"off\" in turn.\n";
  }
  for (const ImaginedHardware::Cell& cell : led.leftChanged) {
    text += "  Not put back: " + ByteName(cell) + "\n";
  }
  return text;
}

Json JsonOf(const PlannedAccess& planned, const Files& files) {
  constexpr const char* kKinds[] = {"port-read", "port-write", "memory-read", "memory-write", "pci-read",
                                    "pci-write", "msr-read",   "firmware",    "wait"};
  const HardwareAccess& access = planned.access;
  Json json{{"kind", kKinds[static_cast<std::size_t>(access.kind)]}};
  if (access.kind == HardwareAccess::Kind::kWait) {
    json["milliseconds"] = access.value;
  } else {
    json["address"] = access.address;
    json["width"] = access.width;
  }
  if (IsWrite(access.kind)) {
    json["set"] = planned.set;
    json["kept"] = planned.kept;
  }
  if (access.reg >= 0) {
    json["index_port"] = access.indexPort;
    json["register"] = access.reg;
    if (access.logicalDevice >= 0) {
      json["logical_device"] = access.logicalDevice;
    }
  }
  if (access.kind == HardwareAccess::Kind::kFirmwareCall) {
    json["command_type"] = access.value;
    json["data"] = access.bytes;
  }
  json["text"] = TextOf(planned);
  Json from = Json::array();
  for (const IniEntry* const entry : planned.from) {
    from.push_back({{"place", PlaceOf(files, *entry)}, {"section", entry->section}, {"key", entry->key}});
  }
  json["from"] = std::move(from);
  return json;
}

Json JsonOf(const std::vector<PlannedAccess>& accesses, const Files& files) {
  Json json = Json::array();
  for (const PlannedAccess& access : accesses) {
    json.push_back(JsonOf(access, files));
  }
  return json;
}

}  // namespace

std::string ExplainText(const BoardPlan& plan, const Files& files, bool allLeds) {
  const Weights weights = WeightsOf(plan);
  std::string text = "board " + plan.systemId + ": ";
  if (!plan.failure.empty()) {
    text += "cannot be built: " + plan.failure + "\n";
  } else if (plan.className.empty()) {
    text += "the files select no board; a test would use the fixed ports of the oldest desktops\n";
  } else {
    std::string decided = Decided(plan, files, "platform");
    if (decided.empty()) {
      decided = Decided(plan, files, "MotherboardClass");
    }
    text += "class " + plan.className + (decided.empty() ? "" : "  (" + decided + ")") + "\n";
    std::string chips;
    for (const std::string& chip : plan.chips) {
      chips += (chips.empty() ? "" : ", ") + chip;
    }
    const std::string list = Decided(plan, files, "chips");
    text += "chips: " + (chips.empty() ? "none" : chips) + (list.empty() ? "" : "  (" + list + ")") + "\n";
    if (!plan.setUp.empty()) {
      text += StepText({"building", true, plan.setUp}, files, weights);
    }
  }
  std::string without;
  for (const LedPlan& led : plan.leds) {
    const bool isBare = led.failure.empty() && !led.IsLit() &&
                        std::all_of(led.steps.begin(), led.steps.end(),
                                    [](const PlannedStep& step) { return step.accesses.empty(); });
    if (isBare && allLeds) {
      without += (without.empty() ? "" : ", ") + std::string(led.led->id);
    } else {
      text += LedText(plan, led, files, weights);
    }
  }
  text += without.empty() ? "" : "\nThis board lights none of: " + without + "\n";
  for (const std::string& notice : plan.notices) {
    // That no key names a chip is said above.
    text += notice.find("names no chip for it") == std::string::npos ? "\nnote: " + notice + "\n" : std::string();
  }
  return text;
}

std::string ExplainJson(const BoardPlan& plan, const Files& files) {
  Json json{{"board", plan.systemId}, {"class", plan.className}, {"failure", plan.failure}, {"chips", plan.chips}};
  json["set_up"] = JsonOf(plan.setUp, files);
  json["leds"] = Json::array();
  for (const LedPlan& led : plan.leds) {
    Json one{{"led", std::string(led.led->id)},
             {"title", std::string(led.led->title)},
             {"lit", led.IsLit()},
             {"blinks_by_itself", led.blinksByItself},
             {"failure", led.failure}};
    one["steps"] = Json::array();
    for (const PlannedStep& step : led.steps) {
      one["steps"].push_back(
          {{"step", step.name}, {"done", step.answer}, {"requests", JsonOf(step.accesses, files)}});
    }
    one["not_put_back"] = Json::array();
    for (const ImaginedHardware::Cell& cell : led.leftChanged) {
      one["not_put_back"].push_back(ByteName(cell));
    }
    json["leds"].push_back(std::move(one));
  }
  json["notices"] = plan.notices;
  return json.dump(2, ' ', false, Json::error_handler_t::replace) + "\n";
}

int Explain(const ExplainOptions& options) {
  RehearsalWish wish;
  if (!options.led.empty()) {
    wish.led = FindBoardLed(options.led);
    if (wish.led == nullptr) {
      throw WrongCall("there is no LED \"" + options.led + "\": name one of " + BoardLedNames());
    }
  }
  const BoardFiles names = BoardFilesIn(options.folder);
  const std::vector<IniOutline> files = ReadBoardFiles(names);
  platform::Host& machine = platform::TheHost();
  const BoardPlan plan = Rehearse(files, names, options.systemId, machine, wish);
  Print(options.json ? ExplainJson(plan, files) : ExplainText(plan, files, wish.led == nullptr));
  return plan.className.empty() ? 1 : 0;
}

}  // namespace panelglow::boardtool
