// Starts the program: builds the manager and the subtests, and runs what the command line asks for.
#include "Version.h"
#include "harness/DiagnosticManager.h"
#include "ledtests/CustomLEDTest.h"
#include "ledtests/LEDStatusIndicator.h"
#include "ledtests/LEDTest.h"

namespace {

constexpr const char* kName = "Panelglow-diags";
}  // namespace

// No guard stands around this: building the manager and the subtests throws nothing short of memory running out, and
// what a run throws is caught by the manager.
int main(int argc, char** argv) {
  using namespace panelglow;
  DiagnosticManager manager(argc, argv, kVersion, kName);
  // Subtests live to the end of the process and are never destroyed: what is to be left behind is written during Run.
  // These pointers own them.
  static LEDTest* const ledTest = new LEDTest;
  manager.RegisterSubtest("LEDTest", ledTest);
  static CustomLEDTest* const customLedTest = new CustomLEDTest;
  manager.RegisterSubtest("CustomLEDTest", customLedTest);
  static LEDStatusIndicator* const ledStatusIndicator = new LEDStatusIndicator;
  manager.RegisterSubtest("LEDStatusIndicator", ledStatusIndicator);
  return manager.Run();
}
