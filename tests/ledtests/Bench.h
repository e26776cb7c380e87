// A simulated desktop with every LED that the blink workers can drive, an installation in a folder of its own, and
// the test on it. What is to happen during a run is set up before, by the machine's time.
#pragma once

#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <functional>
#include <optional>
#include <sstream>
#include <string>
#include <vector>

#include "board/base/BoardDevio.h"
#include "harness/CmdLineParser.h"
#include "harness/DiagnosticManager.h"
#include "hw/PciDeviceList.h"
#include "hw/WMIDiscovery.h"
#include "ledtests/BlinkWorkers.h"
#include "ledtests/CustomLEDTest.h"
#include "ledtests/LedKind.h"
#include "platform/sim/Simulation.h"
#include "storage/MSUtils.h"

namespace panelglow::ledtest {

namespace fs = std::filesystem;
namespace sim = platform::sim;

// Of every run in this program: a process has one command line.
inline constexpr const char* kCommandLine[] = {"panelglow-diags", "-subtest=CustomLEDTest", "-SectionID=Bench",
                                               "-LEDTimeout=10"};
inline constexpr int kArguments = static_cast<int>(std::size(kCommandLine));

class Bench {
 public:
  /// `machine` stands in front of bench.toml, or is the name of a file of machines/, which then has the
  /// installation's own board files; `person` is the policy of who sits at it, nobody when empty.
  explicit Bench(const std::string& machine = "", const std::string& person = "", std::uint64_t seed = 1)
      : sim(MachineText(machine), EnterFolder(person, seed)), windows(sim.Windows()), loaded_(Load()) {
    if (IsFile(machine)) {
      const std::string id = SystemIdIn(TextOf(fs::path(PANELGLOW_SOURCE_DIR) / "machines" / machine));
      for (const char* ini : {"mbdetect.ini", "mbtest.ini"}) {
        sim.DiskFiles().Put(ini, AsOurs(TextOf(ini), id));
      }
    } else {
      AddBoardSetting("");
      sim.DiskFiles().Put("mbdetect.ini", "[7D10]\nplatform=generic\nchips=g_iospace,g_memoryspace\n");
    }
    test.iniFile = ".\\mbdetect.ini";
    test.testIni = ".\\mbtest.ini";
    test.chipIni = ".\\chip.ini";
    sim.Trace().Keep();
  }
  ~Bench() = default;
  Bench(const Bench&) = delete;
  Bench& operator=(const Bench&) = delete;

  void UseUnknownBoard() { sim.DiskFiles().Put("mbdetect.ini", ""), sim.DiskFiles().Put("mbtest.ini", ""); }

  /// A line of mbtest.ini in front of what is there.
  void AddBoardSetting(const std::string& line) {
    sim.DiskFiles().Put("mbtest.ini", "[7D10]\n" + line +
                                          "\ntest.powerled.chip=g_iospace\ntest.hdled.chip=g_iospace\n"
                                          "test.chargeled.chip=g_memoryspace\ntest.powerled.redled.support=yes\n"
                                          "test.chargeled.redled.support=yes\n");
  }

  /// One button for each function and, behind them, one for each further command; the device array of the functions
  /// in this order instead of a random one.
  void Prepare(const std::vector<std::string>& functions, const std::vector<int>& moreButtons = {}) {
    test.buttons.clear();
    const auto add = [this](const std::string& function, std::uint32_t command) {
      ButtonDefStruct button;
      button.messageId = std::to_string(26 + test.buttons.size());  // of the installation's button captions
      button.errorCode = std::to_string(770000 + command);
      button.function = function;
      button.buttonLParam = std::to_string(command);
      test.buttons.push_back(button);
    };
    for (const std::string& function : functions) {
      add(function, FindLedKindByFunction(function)->buttonCommand);
    }
    for (const int command : moreButtons) {
      add("none", static_cast<std::uint32_t>(command));
    }
    test.functions.clear();
    test.MapButtonFunctionsToTests();
    test.PrepareDeviceArray();
    test.InitializeButtonArray();
    test.MakeDialogRules();
    std::size_t place = 0;
    for (const std::string& function : functions) {
      if (LEDStruct* entry = test.FindDevice(FindLedKindByFunction(function)->deviceId)) {
        entry->cheatCheck = false;
        std::swap(*entry, test.devices[place++]);
      }
    }
    if (place > 1) {
      test.devices[place - 1].cheatCheck = test.operatorCheating;
    }
  }
  LEDStruct& Entry(const std::string& function) {
    return *test.FindDevice(FindLedKindByFunction(function)->deviceId);
  }

  /// Starts the worker of a function of the device array as its turn would, with `running` as given.
  platform::ThreadHandle StartWorker(const std::string& function, bool running = true) {
    LEDStruct& entry = Entry(function);
    entry.running = running;
    entry.workerStarted = false;
    entry.workerFinished = false;
    sim.Trace().Clear();
    const BlinkWorker worker = FindLedKindByFunction(function)->worker;
    return platform::TheHost().threads.Start("worker",
                                             [this, worker, &entry] { RunBlinkWorker(worker, test, entry); });
  }
  void RunWorker(const std::string& function, bool running = true) {
    platform::TheHost().threads.Wait(StartWorker(function, running), platform::Threads::kNoLimit);
  }

  /// Runs the whole program; the lines of its output, and the exit code behind them.
  std::vector<std::string> RunProgram() {
    DiagnosticManager manager(kArguments, kCommandLine, "", "");
    manager.RegisterSubtest("CustomLEDTest", &test);
    sim.ClearOutput();
    const int exitCode = manager.Run();
    std::vector<std::string> lines = Lines();
    lines.push_back(std::to_string(exitCode));
    return lines;
  }
  [[nodiscard]] std::vector<std::string> Lines() const {
    std::vector<std::string> lines;
    std::istringstream output(sim.Output());
    for (std::string line; std::getline(output, line);) {
      lines.push_back(line);
    }
    return lines;
  }

  // ---- time and the person's hands
  [[nodiscard]] unsigned Now_ms() { return static_cast<unsigned>(sim.Time().Now() / 1000); }
  void After(unsigned time_ms, std::function<void()> action) {
    sim.Time().At(sim.Time().Now() + sim::Microseconds{time_ms} * 1000, std::move(action));
  }
  void Press(int id) {
    const platform::Rectangle place = windows.ScreenRectangle(windows.FindControl(Top(), id));
    windows.Click((place.left + place.right) / 2, (place.top + place.bottom) / 2);
  }
  void PressAfter(unsigned time_ms, int id) {
    After(time_ms, [this, id] { Press(id); });
  }
  [[nodiscard]] platform::WindowHandle Top() {
    const std::vector<platform::WindowHandle> all = windows.TopLevelWindows();
    return all.empty() ? 0 : all.back();
  }

  // ---- the panel and the registers

  /// How often the LED went on; pauses that nobody sees do not count.
  [[nodiscard]] int TimesLit(const std::string& led) {
    constexpr sim::Microseconds kUnseen = 5000;
    std::optional<sim::Microseconds> dark;  // since when
    int times = 0;
    for (const sim::LedChange& change : sim.Panel().TimeLine()) {
      if (sim.Panel().Leds()[change.led].name == led) {
        times += change.lit && change.time > (dark ? *dark + kUnseen : 0) ? 1 : 0;
        dark = change.time;
      }
    }
    return times;
  }

  /// The names of the LEDs that are lit.
  [[nodiscard]] std::string Lit() {
    std::string names;
    for (const sim::Led& led : sim.Panel().Leds()) {
      names += sim.Panel().IsLit(led.name) ? led.name + " " : "";
    }
    return names;
  }

  /// Port and memory writes since the trace was cleared, separated by ", ".
  [[nodiscard]] std::string Writes() {
    std::string text;
    for (const sim::DriverRequest& request : sim.Trace().Requests()) {
      const std::string line = Describe(request);
      const std::size_t at = std::min(line.find("out8 "), line.find("memory "));
      if (at != std::string::npos && line.find("<-") != std::string::npos) {
        text += (text.empty() ? "" : ", ") + line.substr(line.find(' ', at) + 1);
      }
    }
    return text;
  }

  /// Where the installation of every bench of this process is.
  static const fs::path& FolderPath() {
    static const Folder folder;  // one for the process, whose message files are opened once
    return folder.path;
  }

  sim::Simulation sim;
  platform::desktop::WindowSystem& windows;

 private:
  struct Folder {
    const fs::path path = fs::temp_directory_path() / ("panelglow-bench-" + std::to_string(::getpid()));
    ~Folder() { fs::remove_all(path); }
  };

  static bool IsFile(const std::string& machine) { return machine.ends_with(".toml"); }

  // A process has one system id: a machine of a file goes by that of bench.toml, in its board files too.
  static std::string AsOurs(std::string text, const std::string& systemId) {
    if (systemId == "7D10") {
      return text;
    }
    for (const auto& [from, to] : {std::pair<std::string, const char*>("[7D10]", "[other]"), {systemId, "7D10"}}) {
      for (std::size_t at = 0; (at = text.find(from, at)) != std::string::npos;) {
        text.replace(at, from.size(), to);
      }
    }
    return text;
  }
  static std::string TextOf(const fs::path& file) {
    std::ostringstream text;
    text << std::ifstream(file).rdbuf();
    return text.str();
  }
  static std::string SystemIdIn(const std::string& machine) {
    const std::string key = "board_product = \"";
    return machine.substr(machine.find(key) + key.size(), 4);
  }
  static std::string MachineText(const std::string& machine) {
    std::ostringstream text;
    if (IsFile(machine)) {
      const std::string file = TextOf(fs::path(PANELGLOW_SOURCE_DIR) / "machines" / machine);
      return AsOurs(file, SystemIdIn(file));
    }
    text << machine << (machine.find("touchpad") == std::string::npos ? "touchpad = true\n" : "")
         << std::ifstream(fs::path(PANELGLOW_SOURCE_DIR) / "tests/ledtests/bench.toml").rdbuf();
    return text.str();
  }
  // A new installation, which is the current folder; and nothing is known of the machine before.
  static sim::SimulationOptions EnterFolder(const std::string& person, std::uint64_t seed) {
    MSUtils::Forget();
    PciDeviceList::Forget();
    WMIDiscovery::Forget();
    fs::current_path(fs::temp_directory_path());  // out of the folder of the bench before
    fs::remove_all(FolderPath());
    fs::copy(fs::path(PANELGLOW_SOURCE_DIR) / "installation", FolderPath(), fs::copy_options::recursive);
    fs::current_path(FolderPath());
    sim::SimulationOptions options;
    options.realFiles = true;
    options.operatorPolicy = person;
    options.seed = seed;
    return options;
  }
  static bool Load() {
    CmdLineParser::GetInstance(kArguments, kCommandLine);
    BoardDevio().LoadDriver();
    return g_objDriverObjectCustom.LoadDriver();
  }

  bool loaded_;  // the driver, which is there before the test is built

 public:
  CustomLEDTest test;
};

}  // namespace panelglow::ledtest
