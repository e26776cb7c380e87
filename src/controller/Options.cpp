#include "controller/Options.h"

#include "platform/sim/SimHost.h"
#include "platform/sim/person/Operator.h"

namespace panelglow::controller {

void AddOptions(CLI::App& app, Options& options) {
  app.description(
      "Runs panelglow-diags on a simulated machine with a simulated operator, follows it as a controller does, and "
      "shows the front panel's time line and the verdict. Run it in the folder of an installation.\n"
      "Exits with the program's code (0 passed, 1 failed, also when the output could not be written); 2: a wrong "
      "call; 3: a run that could not be made.");
  app.name("panelglow-sim");
  app.add_option("--machine", options.machine, "the machine's file, as machines/notebook.toml")
      ->type_name("FILE")
      ->required();
  app.add_option("--operator", options.person,
                 "who sits there: " + platform::sim::Operator::PolicyNames() +
                     " (some take a number: wrong:2, slow:10); perfect, or with --window nobody but you");
  app.add_option("--seed", options.seed, "another seed is another order of LEDs and events")
      ->capture_default_str()
      ->check(CLI::NonNegativeNumber);
  app.add_option("--fault", options.faults,
                 "LED=KIND, repeatable; kinds: " + platform::sim::LedFaultNames() + " (swapped:OTHER, shorted:OTHER)")
      ->allow_extra_args(false);
  app.add_flag("--real-time", options.realTime, "follow the wall clock instead of jumping through time");
  app.add_flag("--window", options.window,
               "show windows and front panel on the display, in real time, and take the test yourself");
  app.add_option("--screenshots", options.screenshots, "save a picture of the screen at each press in this folder")
      ->type_name("FOLDER");
  app.add_option("--trace", options.trace, "write every driver request to this file")->type_name("FILE");
  app.add_flag("--raw", options.raw, "pass the program's lines through unchanged, and nothing else");
  app.add_option("ARGS", options.arguments, "parameters of the program, behind --: -subtest=CustomLEDTest ...");
  app.positionals_at_end();
  app.footer("\nOperators:\n" + platform::sim::Operator::PolicyHelp() + "\nFaults of a LED:\n" +
             platform::sim::LedFaultHelp());
}

}  // namespace panelglow::controller
