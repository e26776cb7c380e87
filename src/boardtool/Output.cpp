#include "boardtool/Output.h"

#include <string>

#include "boardtool/Machine.h"

namespace panelglow::boardtool {

namespace {

platform::Console* g_own = nullptr;  // the machine's, while the library's lines are led away

}  // namespace

void Print(std::string_view text) { (g_own == nullptr ? platform::TheHost().console : *g_own).Write(text); }

void Say(std::string_view sentence) {
  platform::TheHost().console.WriteError(std::string(ProgramName()) + ": " + std::string(sentence) + "\n");
}

OwnOutput::OwnOutput(platform::Host& machine) : library_(machine.console) { g_own = &machine.console; }

OwnOutput::~OwnOutput() { g_own = nullptr; }

}  // namespace panelglow::boardtool
