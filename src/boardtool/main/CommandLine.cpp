#include "boardtool/main/CommandLine.h"

#include <memory>

#include "boardtool/AssumedIdentity.h"
#include "boardtool/BoardOnMachine.h"
#include "boardtool/HostWith.h"
#include "boardtool/Output.h"
#include "boardtool/Trace.h"
#include "platform/HostInPlace.h"

namespace panelglow::boardtool {

namespace {

constexpr int kWrongCall = 2;

void AddFolder(CLI::App& verb, std::string& folder) {
  verb.add_option("--folder", folder, "Folder of the installation (default: the current one)")->type_name("FOLDER");
}

// Whether all that was said reached its reader.
void RequireOutput(platform::Console& console) {
  if (const std::string problem = console.OutputProblem(); !problem.empty()) {
    throw CannotRun("standard output did not take everything: " + problem);
  }
}

// Runs a verb on the machine, on a recorded one, or on one that is being recorded.
int OnMachine(const Between& between, const std::function<int()>& verb) {
  OwnOutput output(platform::TheHost());
  platform::Host machine = HostWith(platform::TheHost(), {.console = &output.LibraryConsole()});
  const platform::HostInPlace ownLines(machine);
  if (!between.replayFile.empty()) {
    TracePlayer player(between.replayFile, machine, IsSimulated());
    const platform::HostInPlace inPlace(player.TheHost());
    const AssumedIdentity identity(player.SystemId());
    int code = 0;
    try {
      code = verb();
    } catch (const CannotRun&) {
      player.Check();  // where they part is what matters
      throw;
    }
    player.Check();
    if (player.Left() > 0) {
      throw CannotRun(between.replayFile + ": the trace goes on where the program ended, with " +
                      std::to_string(player.Left()) + " more requests");
    }
    return code;
  }
  if (!between.traceFile.empty()) {
    TraceRecorder recorder(between.traceFile, machine, IsSimulated(), MachineId());
    const platform::HostInPlace inPlace(recorder.TheHost());
    const int code = verb();
    recorder.Close();
    return code;
  }
  return verb();
}

// The verb that a trace is played to belongs to the call, too.
class ReplayFormatter : public CLI::Formatter {
 public:
  std::string make_usage(const CLI::App* app, std::string name) const override {
    std::string usage = CLI::Formatter::make_usage(app, std::move(name));
    return usage.insert(usage.find_last_not_of('\n') + 1, " VERB [OPTIONS OF THE VERB]");
  }
};

}  // namespace

CommandLine::CommandLine(const char* name, bool isSimulated)
    : app_("What the board library makes of an installation's files and of a machine.", name) {
  app_.require_subcommand(1, 2);
  app_.fallthrough();
  app_.add_option("--trace", between_.traceFile, "Record every request to the driver in this file")
      ->type_name("FILE");
  if (isSimulated) {
    app_.add_option("--machine", between_.machine.file, "File of the simulated machine")->type_name("FILE");
    app_.add_flag("--real-time", between_.machine.realTime, "Let time pass as on a real machine");
  }
  AddExplain();
  AddCheck();
  AddReport();
  AddReadings();
  AddBlink();
  AddTry();
  AddReplay();
}

int CommandLine::Run(int argc, char** argv) {
  try {
    app_.parse(argc, argv);
  } catch (const CLI::ParseError& answer) {  // a call for help, too
    if (answer.get_exit_code() != 0 && app_.get_subcommands().empty()) {
      throw WrongCall("name a verb: " + Verbs() + "; --help says what each is for");
    }
    return app_.exit(answer) == 0 ? 0 : kWrongCall;
  }
  if (!run_) {
    throw WrongCall("name the verb that the trace is played to, behind its file");
  }
  RefuseWithReplay();
  UseMachine(between_.machine);
  try_.isReplayed = !between_.replayFile.empty();
  const int code = OnMachine(between_, run_);
  RequireOutput(platform::TheHost().console);
  return code;
}

// A trace is the machine, and all that can be recorded of it.
void CommandLine::RefuseWithReplay() const {
  if (between_.replayFile.empty()) {
    return;
  }
  if (!between_.traceFile.empty()) {
    throw WrongCall("a trace that is played is not recorded again: leave --trace out");
  }
  if (!between_.machine.file.empty() || between_.machine.realTime) {
    throw WrongCall("the trace answers in place of a machine: leave --machine and --real-time out");
  }
}

std::string CommandLine::Verbs() {
  std::string names;
  for (const CLI::App* const verb : app_.get_subcommands({})) {
    names += (names.empty() ? "" : ", ") + verb->get_name();
  }
  return names;
}

void CommandLine::AddExplain() {
  CLI::App& verb = *app_.add_subcommand(
      "explain", "The requests to the hardware by which a board's LEDs are lit; needs no hardware");
  verb.add_option("led", explain_.led, "One LED: " + BoardLedNames() + " (default: all)");
  verb.add_option("--board", explain_.systemId, "System id, as 7D10")->required();
  AddFolder(verb, explain_.folder);
  verb.add_flag("--json", explain_.json, "For programs");
  verb.callback([this] { run_ = [this] { return Explain(explain_); }; });
}

void CommandLine::AddCheck() {
  CLI::App& verb = *app_.add_subcommand("check", "What is wrong with an installation's files; needs no hardware");
  verb.add_option("files", check_.files, "Only these files of an installation (default: all of the folder)")
      ->type_name("FILE");
  AddFolder(verb, check_.folder);
  verb.add_option("--format", check_.format, "text, json or sarif")->check(CLI::IsMember({"text", "json", "sarif"}));
  verb.callback([this] { run_ = [this] { return Check(check_); }; });
}

void CommandLine::AddBlink() {
  CLI::App& verb = *app_.add_subcommand("blink", "Blinks one LED of this machine until Enter is pressed");
  verb.add_option("led", blink_.led, "One of " + BoardLedNames())->required();
  verb.add_option("--seconds", blink_.seconds, "Blink so long, and do not wait for Enter")
      ->check(CLI::Range(1, 86400));
  AddFolder(verb, blink_.folder);
  verb.callback([this] {
    run_ = [this] {
      const StopRequest stop;
      return Blink(blink_, PersonAtTerminal());
    };
  });
}

void CommandLine::AddReport() {
  CLI::App& verb = *app_.add_subcommand("report", "All that can be told of this machine and its board");
  AddFolder(verb, report_.folder);
  verb.add_flag("--json", report_.json, "For programs");
  verb.callback([this] { run_ = [this] { return Report(report_); }; });
}

void CommandLine::AddReadings() {
  const auto add = [this](const char* name, const char* what, bool hasLog,
                          int (*read)(const ReadOptions&, const Person&)) {
    CLI::App& verb = *app_.add_subcommand(name, what);
    AddFolder(verb, read_.folder);
    verb.add_flag("--json", read_.json, "For programs; with --watch JSON Lines: each reading is one line");
    CLI::Option* const watch = verb.add_flag("--watch", read_.watch, "Again and again until Enter is pressed");
    verb.add_option("--rounds", read_.rounds, "So many readings while watching")
        ->check(CLI::Range(1, 1000000))
        ->needs(watch);
    if (hasLog) {
      verb.add_option("--log", read_.logFile, "Write the test's log there, and its XML results beside it")
          ->type_name("FILE");
    }
    verb.callback([this, read] {
      run_ = [this, read] {
        const StopRequest stop;
        return read(read_, PersonAtTerminal());
      };
    });
  };
  add("fans", "The fans of this machine, with limits and states", true, Fans);
  add("zones", "The temperature zones of this machine, with limits and states", true, Zones);
  add("detect", "The devices that lines of this machine tell of: jumpers, cables, hood, buttons", false, Detect);
}

void CommandLine::AddTry() {
  CLI::App& verb =
      *app_.add_subcommand("try", "Finds the lamps of a board that nothing knows: one bit or line after the other");
  verb.add_option("--chip", try_.chip, "g_iospace, g_memoryspace, g_ite or g_it8702")->required();
  verb.add_option("--at", try_.at, "Port or address of the register of g_iospace or g_memoryspace, as 0xA20");
  CLI::Option* const bits = verb.add_option("--bits", try_.bits, "Bits of the register (default: 0-7)");
  verb.add_option("--lines", try_.lines, "Lines of g_ite or g_it8702, as 20-27")->excludes(bits);
  verb.add_option("--board", try_.systemId, "System id for the sections (default: the machine's)");
  AddFolder(verb, try_.folder);
  verb.callback([this] {
    run_ = [this] {
      const StopRequest stop;
      return Try(try_, PersonAtTerminal());
    };
  });
}

void CommandLine::AddReplay() {
  CLI::App& verb = *app_.add_subcommand("replay", "Runs another verb on a recorded trace in place of the machine");
  verb.add_option("file", between_.replayFile, "The trace")->type_name("FILE")->required();
  verb.require_subcommand(0, 1);
  verb.formatter(std::make_shared<ReplayFormatter>());
  verb.footer("The verb with its options stands behind the file: replay trace.txt blink power-green --seconds 5");
}

}  // namespace panelglow::boardtool
