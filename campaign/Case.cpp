#include "Case.h"

#include <algorithm>
#include <random>

namespace panelglow::campaign {

namespace {

using Strings = std::vector<std::string>;

struct Lamp {
  const char* name;
  const char* kindCode;    // ReportFailure
  const char* buttonCode;  // TestFailed
};

constexpr Lamp kNum{"num-lock", "770102", "771003"};
constexpr Lamp kCaps{"caps-lock", "770101", "771006"};
constexpr Lamp kScroll{"scroll-lock", "770100", "771009"};
constexpr Lamp kGreen{"power-green", "770133", "771017"};
constexpr Lamp kRed{"power-red", "770134", "771020"};
constexpr Lamp kWhite{"power-white", "770133", "771017"};
constexpr Lamp kAmber{"power-amber", "770134", "771020"};

// A machine, the dialog's section for it, and the lamps that the test asks for.
struct Panel {
  const char* machine;
  const char* section;
  std::vector<Lamp> lamps;
  const char* mayLeave = "";
  bool hasStatus = true;  // false: no section for a board, which the subtest that blinks the power lamp needs
};

const std::vector<Panel>& Panels() {
  static const std::vector<Panel> kPanels = {
      {"desktop.toml", "Desktop", {kNum, kCaps, kScroll, kGreen, kRed, {"drive-red", "770132", "771016"}}},
      {"desktop.toml", "Default", {kNum, kCaps, kScroll, kGreen}},
      {"notebook.toml",
       "Notebook",
       {kNum,
        kCaps,
        kScroll,
        kWhite,
        kAmber,
        {"charge-white", "770148", "771012"},
        {"charge-amber", "770149", "771015"},
        {"touchpad", "770146", "771025"}}},
      {"unknown-board.toml", "Default", {kNum, kCaps, kScroll, kGreen}, "port 044D", false},
      {"sio-ite.toml", "TwoColorPower", {kNum, kGreen, kRed}},
      {"sio-fintek.toml", "TwoColorPower", {kNum, kGreen, kRed}},
      {"sio-generic.toml", "TwoColorPower", {kNum, kGreen, kRed}},
      {"ec-notebook.toml", "EcNotebook", {kCaps, kWhite, kAmber}},
      {"ec16-notebook.toml", "EcNotebook", {kCaps, kWhite, kAmber}},
      {"old-ec.toml", "TwoColorPower", {kCaps, kGreen, kRed}},
      {"mailbox-notebook.toml", "MailboxNotebook", {kCaps, kWhite}, "mailbox configuration mode"},
      {"codec-notebook.toml", "CodecNotebook", {kScroll}},
      {"casl-notebook.toml", "FirmwareNotebook", {kScroll, kWhite}, "radio 02"},
      {"drives-desktop.toml", "DrivesDesktop", {kNum, kGreen, {"network", "770146", "771018"}}},
      {"office-notebook.toml", "OfficeNotebook", {kNum, {"camera", "770147", "771024"}}},
      {"sio-f71808.toml", "TwoColorPower", {kNum, kGreen, kRed}},
      {"sio-fin.toml", "TwoColorPower", {kNum, kGreen, kRed}},
      {"sio-it8721.toml", "TwoColorPower", {kNum, kGreen, kRed}},
      {"sio-ite-old.toml", "TwoColorPower", {kNum, kGreen, kRed}},
      {"sio-lpc47.toml", "TwoColorPower", {kNum, kGreen, kRed}},
      {"sio-nct5571.toml", "TwoColorPower", {kNum, kGreen, kRed}},
      {"sio-sch5327.toml", "TwoColorPower", {kNum, kGreen, kRed}},
      {"sio-smsc5407.toml", "Default", {kNum, kGreen}},
      {"sio-vt1211.toml", "Default", {kNum, kGreen}},
      {"sio-win.toml", "Default", {kNum, kGreen}},
      {"sio-wpcd376.toml", "TwoColorPower", {kNum, kGreen, kRed}},
      {"bench-desktop.toml", "TwoColorPower", {kNum, kGreen, kRed}},
      {"ich-desktop.toml", "TwoColorPower", {kNum, kGreen, kRed}},
      {"orchard-desktop.toml", "TwoColorPower", {kNum, kGreen, kRed}, "", false},
      {"saddle-desktop.toml", "Default", {kNum, kGreen}, "", false},
      {"smbus-desktop.toml", "TwoColorPower", {kNum, kGreen, kRed}},
  };
  return kPanels;
}

// A line of a machine's file behind which a fault of that part may stand.
struct BusFault {
  const char* line;
  const char* fault;
};

constexpr std::string_view kDiskLine = "[[disk]]";
constexpr BusFault kBusFaults[] = {{"kind = \"embedded-controller\"", "stuck-ibf"},
                                   {"kind = \"embedded-controller\"", "stuck-obf"},
                                   {"kind = \"mailbox-controller\"", "stuck-busy"},
                                   {"kind = \"hda-codec\"", "stuck-busy"},
                                   {"[[disk]]", "no-open"},
                                   {"[[disk]]", "read-error"},
                                   {"[[disk]]", "write-error"},
                                   {"[[disk]]", "slow"}};

const Strings kPersons = {"perfect",  "wrong:1",  "wrong:2", "wrong:4", "slow:5", "slow:9",     "slow:40",
                          "cancel:1", "cancel:3", "silent",  "random",  "first",  "elimination"};
const Strings kFaults = {"dead", "stuck", "wrong-color", "inverted", "lying-write", "absent-chip"};
const Strings kFiles = {"chip.ini",
                        "mbdetect.ini",
                        "mbtest.ini",
                        "ui.xml",
                        "ui.xsd",
                        "buttondefinition.xml",
                        "buttondefinition.xsd",
                        "msctrl.ini",
                        "panelglow-diags.msg",
                        "nonui_panelglow-diags.msg",
                        "super.ico",
                        "spr_num.ico"};
constexpr const char* kEarlierRun =
    "<DiagnosticsData Version=\"4.15.0\">\n  <Diagnostic name=\"another\">\n"
    "    <Subtest name=\"Fans\" duration=\"7\"/>\n  </Diagnostic>\n</DiagnosticsData>\n";
const Strings kLogs = {"",
                       "<DiagnosticsData Version=\"4.15.0\">\n</DiagnosticsData>\n",
                       kEarlierRun,
                       "<DiagnosticsData",
                       "no markup at all",
                       std::string("\0\xFF\xFE", 3)};

struct ControlFile {
  const char* path;
  const char* content;
  bool stops;
};
constexpr ControlFile kControlFiles[] = {{"\\kill.ctl", "", true},
                                         {".\\kill.ctl", "", true},
                                         {"\\halcyon.ctl", "terminate", true},
                                         {"\\halcyon.ctl", "pause", false},
                                         {"\\halcyon.ctl", "terminate ", false}};
constexpr const char* kLogFile = "log.xml";
constexpr const char* kTimeOut = "770118";

// A number from 0 to `bound` - 1.
class Dice {
 public:
  explicit Dice(std::uint64_t seed) : random_(seed) {}
  std::uint64_t Number(std::uint64_t bound) { return random_() % bound; }
  template <class List>
  const auto& From(const List& list) {
    return *(std::begin(list) + static_cast<std::ptrdiff_t>(Number(std::size(list))));
  }

 private:
  std::mt19937_64 random_;
};

std::string Event(std::uint64_t at_ms, const std::string& what) {
  return "\n[[event]]\nat_ms = " + std::to_string(at_ms) + "\n" + what + "\n";
}

// Takes something away from a text, or breaks a byte of it.
std::string Damaged(std::string text, Dice& dice) {
  const std::uint64_t kind = dice.Number(4);
  const auto place = static_cast<std::size_t>(dice.Number(text.size() + 1));
  if (kind == 0) {
    return {};
  }
  if (kind == 1) {
    return text.substr(0, place);
  }
  if (kind == 2 && place < text.size()) {
    text[place] = static_cast<char>(dice.Number(256));
    return text;
  }
  return text.erase(place, static_cast<std::size_t>(dice.Number(200)));
}

void DrawSubtest(Dice& dice, const Panel& panel, Case& drawn) {
  const std::uint64_t number = dice.Number(10);
  if (number == 0) {
    drawn.arguments = {"-subtest=LEDStatusIndicator", "-BlinkTime=1",
                       "-BlinkSpeed=" + std::to_string(100 + dice.Number(900))};
    drawn.mustPass = panel.hasStatus && std::any_of(panel.lamps.begin(), panel.lamps.end(), [](const Lamp& lamp) {
                       return lamp.kindCode == std::string(kGreen.kindCode);
                     });
  } else if (number == 1) {
    drawn.arguments = {"-subtest=LEDTest", "-NumLock=true", "-CapsLock=true"};
    drawn.mustPass = true;
  } else {
    drawn.arguments = {"-subtest=CustomLEDTest", std::string("-SectionID=") + panel.section};
    drawn.mustPass = true;
  }
}

bool IsCustomTest(const Case& drawn) { return drawn.arguments.front() == "-subtest=CustomLEDTest"; }

}  // namespace

const std::vector<PartName>& AllParts() {
  static const std::vector<PartName> kParts = {{Part::kArguments, "arguments"},
                                               {Part::kOperator, "operator"},
                                               {Part::kPanelFault, "panel-fault"},
                                               {Part::kBusFault, "bus-fault"},
                                               {Part::kFileFault, "file-fault"},
                                               {Part::kLog, "log"},
                                               {Part::kStopFile, "stop-file"},
                                               {Part::kConsole, "console"},
                                               {Part::kDisk, "disk"},
                                               {Part::kPeer, "peer"},
                                               {Part::kKill, "kill"}};
  return kParts;
}

Case Draw(std::uint64_t seed, const std::vector<Part>& without, const Files& installation, const Files& machines) {
  Dice dice(seed);
  Case drawn;
  drawn.seed = seed;
  const Panel& panel = dice.From(Panels());
  drawn.machineFile = panel.machine;
  drawn.machine = machines.at(panel.machine);
  drawn.mayLeave = panel.mayLeave;
  DrawSubtest(dice, panel, drawn);
  const bool isStatus = drawn.arguments.front() == "-subtest=LEDStatusIndicator";
  // Each part has dice of its own, so that one that is left out changes no other.
  const auto has = [&](Part part, std::uint64_t oneIn) {
    const bool isDrawn = dice.Number(oneIn) == 0;
    if (isDrawn) {
      drawn.drawn.push_back(part);
    }
    return isDrawn && std::find(without.begin(), without.end(), part) == without.end();
  };
  const auto spoil = [&] { drawn.mustPass = false, drawn.mustReport.clear(), drawn.mustFail.clear(); };
  bool fails = false;

  Dice own(dice.Number(~std::uint64_t{0}));
  if (const Lamp lamp = own.From(panel.lamps); has(Part::kPanelFault, 3) && IsCustomTest(drawn)) {
    const std::string kind = own.From(kFaults);
    drawn.fault = std::string(lamp.name) + "=" + kind;
    fails = kind == "dead" || kind == "stuck" || kind == "wrong-color";
    drawn.mustPass = drawn.mustPass && kind == "inverted";
    if (fails) {
      drawn.mustReport = {lamp.kindCode};
      drawn.mustFail = lamp.buttonCode;
    }
    if (kind == "lying-write") {
      drawn.mayLeave = "*";  // what is not written cannot be put back
    }
    if (kind == "wrong-color") {
      drawn.mustReport.emplace_back(kTimeOut);
    }
  }
  own = Dice(dice.Number(~std::uint64_t{0}));
  if (has(Part::kArguments, 2)) {
    if (!isStatus) {
      drawn.arguments.push_back("-Retries=" + std::to_string(own.Number(3)));
    }
    if (IsCustomTest(drawn)) {
      drawn.arguments.push_back(own.Number(2) == 0 ? "-AutoStart=true" : "-OperatorCheating=false");
    }
  }
  own = Dice(dice.Number(~std::uint64_t{0}));
  if (has(Part::kOperator, 2)) {
    drawn.person = own.From(kPersons);
    const bool isGood = drawn.person == "perfect" || (drawn.person == "slow:5" && !fails);
    if (!isGood) {
      spoil();
    }
  }
  own = Dice(dice.Number(~std::uint64_t{0}));
  if (has(Part::kBusFault, 16)) {
    const BusFault fault = own.From(kBusFaults);
    if (const std::size_t at = drawn.machine.find(fault.line); at != std::string::npos) {
      drawn.machine.insert(drawn.machine.find('\n', at), std::string("\nfault = \"") + fault.fault + "\"");
      spoil();
      if (fault.line != kDiskLine) {
        drawn.mayLeave = "*";  // what does not answer cannot be put back
      }
    }
  }
  own = Dice(dice.Number(~std::uint64_t{0}));
  if (has(Part::kFileFault, 8)) {
    const std::string& name = own.From(kFiles);
    if (own.Number(5) == 0) {
      drawn.missing.push_back(name);
    } else {
      drawn.files[name] = Damaged(installation.at(name), own);
      if (name == "chip.ini" || name == "mbdetect.ini" || name == "mbtest.ini") {
        drawn.mayLeave = "*";  // they say what is saved
      }
    }
    spoil();
  }
  own = Dice(dice.Number(~std::uint64_t{0}));
  if (has(Part::kLog, 2)) {
    drawn.arguments.push_back(std::string("-DataCollectionFile=") + kLogFile);
    drawn.files[kLogFile] = own.From(kLogs);
    drawn.endsInLog = !isStatus;
    drawn.leavesLog = isStatus;
  }
  own = Dice(dice.Number(~std::uint64_t{0}));
  if (has(Part::kStopFile, 10)) {
    const ControlFile file = own.From(kControlFiles);
    drawn.machine +=
        Event(own.Number(60000), std::string("write_file = '") + file.path + "'\ncontent = '" + file.content + "'");
    if (file.stops) {
      spoil();
    }
  }
  own = Dice(dice.Number(~std::uint64_t{0}));
  if (has(Part::kConsole, 10)) {
    drawn.machine += Event(own.Number(60000), "console = " + std::to_string(own.Number(2)));
    spoil();
  }
  own = Dice(dice.Number(~std::uint64_t{0}));
  if (has(Part::kDisk, 12)) {
    drawn.machine += Event(own.Number(60000), "fill_disk = true");
    drawn.endsInLog = false;
  }
  own = Dice(dice.Number(~std::uint64_t{0}));
  if (has(Part::kPeer, 8)) {
    const std::uint64_t from_ms = 1 + own.Number(20000);
    drawn.peerLock = own.Number(2) == 0 ? "_HalcyonMotherBoardLib" : "_HalcyonPromptLock";
    drawn.machine += "\n[[peer]]\nmutex = '" + drawn.peerLock + "'\nfrom_ms = " + std::to_string(from_ms) +
                     "\nuntil_ms = " + std::to_string(from_ms + 1 + own.Number(20000)) + "\n";
    spoil();
  }
  own = Dice(dice.Number(~std::uint64_t{0}));
  if (has(Part::kKill, 12)) {
    drawn.kill_us = own.Number(60'000'000);
  }
  return drawn;
}

std::string Describe(const Case& drawn) {
  std::string text = drawn.machineFile + ", " + drawn.person;
  for (const std::string& argument : drawn.arguments) {
    text += " " + argument;
  }
  text += drawn.fault.empty() ? "" : ", " + drawn.fault;
  for (const auto& [name, content] : drawn.files) {
    text += ", another " + name + " (" + std::to_string(content.size()) + " bytes)";
  }
  for (const std::string& name : drawn.missing) {
    text += ", no " + name;
  }
  for (const PartName& row : AllParts()) {
    if (std::find(drawn.drawn.begin(), drawn.drawn.end(), row.part) != drawn.drawn.end()) {
      text += std::string(" [") + row.name + "]";
    }
  }
  return text;
}

}  // namespace panelglow::campaign
