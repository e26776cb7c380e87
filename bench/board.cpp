// A board built from the installation's INI files, and deleted again: what each blink worker does.
#include <benchmark/benchmark.h>

#include "board/MotherBoard.h"
#include "platform/sim/Simulation.h"

namespace {

// To be run in the folder installation/.
void BuildBoard(benchmark::State& state, const char* systemId) {
  panelglow::platform::sim::MachineDescription description;
  description.firmware.boardProduct = systemId;
  const panelglow::platform::sim::Simulation machine(std::move(description), {.realFiles = true});
  for (auto _ : state) {
    const auto board =
        panelglow::MotherBoard::Instantiate(".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini", "platform", systemId);
    if (board == nullptr) {
      state.SkipWithError("no board: run this in the folder installation/");
    }
    benchmark::DoNotOptimize(board.get());
  }
}

BENCHMARK_CAPTURE(BuildBoard, Desktop, "7D10")->Unit(benchmark::kMicrosecond);
BENCHMARK_CAPTURE(BuildBoard, Notebook, "7B20")->Unit(benchmark::kMicrosecond);

}  // namespace
