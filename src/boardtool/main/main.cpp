// The integrator's program: says what the board library makes of an installation's files and of a machine, and helps
// to bring up a board that nothing knows yet.
#include <CLI/CLI.hpp>
#include <cstdio>
#include <exception>
#include <string>

#include "boardtool/Check.h"
#include "boardtool/Explain.h"
#include "platform/Host.h"

namespace {

using namespace panelglow;
using namespace panelglow::boardtool;

constexpr int kWrongCall = 2;
constexpr int kCouldNotRun = 3;

int Complain(int code, const std::string& problem) {
  std::fprintf(stderr, "panelglow-board: %s\n", problem.c_str());
  return code;
}

}  // namespace

int main(int argc, char** argv) {
  CLI::App app{"What the board library makes of an installation's files and of a machine.", "panelglow-board"};
  app.require_subcommand(1);
  int code = 0;
  ExplainOptions explain;
  CLI::App* const explainVerb =
      app.add_subcommand("explain", "The requests to the hardware by which a board's LEDs are lit, without hardware");
  explainVerb->add_option("led", explain.led, "One LED: " + BoardLedNames() + " (default: all)");
  explainVerb->add_option("--board", explain.systemId, "System id, as 7D10")->required();
  explainVerb->add_option("--folder", explain.folder, "Folder of the installation (default: the current one)");
  explainVerb->add_flag("--json", explain.json, "For programs");
  explainVerb->callback([&] { code = Explain(explain); });
  CheckOptions check;
  CLI::App* const checkVerb = app.add_subcommand("check", "What is wrong with an installation's files");
  checkVerb->add_option("files", check.files, "Only these files of an installation (default: all of the folder)");
  checkVerb->add_option("--folder", check.folder, "Folder of the installation (default: the current one)");
  checkVerb->add_option("--format", check.format, "text, json or sarif")
      ->check(CLI::IsMember({"text", "json", "sarif"}));
  checkVerb->callback([&] { code = Check(check); });
  try {
    app.parse(argc, argv);
    return code;
  } catch (const CLI::CallForHelp& call) {
    return app.exit(call);
  } catch (const CLI::ParseError& wrong) {
    app.exit(wrong);
    return kWrongCall;
  } catch (const WrongCall& wrong) {
    return Complain(kWrongCall, wrong.what());
  } catch (const CannotRun& problem) {
    return Complain(kCouldNotRun, problem.what());
  } catch (const std::exception& problem) {
    return Complain(kCouldNotRun, problem.what());
  }
}
