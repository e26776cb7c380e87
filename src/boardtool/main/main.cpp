// The integrator's program: says what the board library makes of an installation's files and of a machine, and helps
// to bring up a board that nothing knows yet.
#include <cstdio>
#include <exception>

#include "boardtool/Installation.h"
#include "boardtool/main/CommandLine.h"

namespace {

using namespace panelglow::boardtool;

constexpr int kWrongCall = 2;
constexpr int kCouldNotRun = 3;

int Complain(int code, const char* problem) {
  std::fprintf(stderr, "%s: %s\n", ProgramName(), problem);
  return code;
}

}  // namespace

int main(int argc, char** argv) {
  try {
    return CommandLine().Run(argc, argv);
  } catch (const WrongCall& wrong) {
    return Complain(kWrongCall, wrong.what());
  } catch (const std::exception& problem) {
    return Complain(kCouldNotRun, problem.what());
  }
}
