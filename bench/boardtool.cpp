// The integrator's program on the installation that is shipped: a whole check, and an explanation of all LEDs of a
// board.
#include <benchmark/benchmark.h>

#include "boardtool/Check.h"
#include "boardtool/Installation.h"
#include "boardtool/Machine.h"
#include "boardtool/Rehearsal.h"
#include "platform/Host.h"

namespace panelglow::boardtool {

bool IsSimulated() { return false; }
const char* ProgramName() { return "bench_boardtool"; }
std::string PanelNow() { return {}; }

namespace {

// To be run in the folder installation/. At most 100 ms.
void CheckInstallation(benchmark::State& state) {
  for (auto _ : state) {
    benchmark::DoNotOptimize(FindingsOf({}, platform::TheHost()));
  }
}

// At most 20 ms.
void ExplainBoard(benchmark::State& state, const char* systemId) {
  const BoardFiles names = BoardFilesIn(".");
  for (auto _ : state) {
    const std::vector<IniOutline> files = ReadBoardFiles(names);
    benchmark::DoNotOptimize(Rehearse(files, names, systemId, platform::TheHost()));
  }
}

BENCHMARK(CheckInstallation)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(ExplainBoard, Ports, "7D10")->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(ExplainBoard, SuperIo, "7C10")->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(ExplainBoard, EmbeddedController, "7C40")->Unit(benchmark::kMillisecond);

}  // namespace
}  // namespace panelglow::boardtool
