// A board with a chip in each of its places, built and deleted again; and what the classes add to the requests
// that they send: a byte of an embedded controller, and Super-I/O registers by file and by table, beside the same
// number of bare requests to the driver's device.
#include <benchmark/benchmark.h>

#include <array>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include "board/MotherBoard.h"
#include "board/base/BoardDevio.h"
#include "board/base/IniReader.h"
#include "board/chips/fin/FinChip.h"
#include "board/chips/generic/GEcChip.h"
#include "board/chips/generic/GSioChip.h"
#include "platform/Host.h"
#include "platform/sim/Simulation.h"

namespace {

using panelglow::platform::sim::DriverRequest;
using panelglow::platform::sim::Simulation;
using panelglow::platform::sim::SimulationOptions;

// A controller that is ready whenever it is looked at, and a Super-I/O.
constexpr const char* kMachine =
    "[[chip]]\nname = \"ec\"\nkind = \"embedded-controller\"\ntake_us = 0\nanswer_us = 0\n"
    "[chip.memory]\n\"10\" = 0x2D\n"
    "[[chip]]\nname = \"sio\"\nkind = \"super-io\"\nfamily = \"plain\"\nchip_id = [0xC3, 0x33, 0x00]\n";

constexpr const char* kPorts =
    "config.index.port=0x2E\nconfig.data.port=0x2F\nconfig.mode.enter.sequence=0x87,0x87\n"
    "config.mode.exit.sequence=0xAA\nenvironment.index.reg=5\nenvironment.data.reg=6\nhwmbar=0xA10\ngpiobar=0xA20\n";

void PutFiles(Simulation& machine) {
  // Without a list of chips every place has one.
  machine.DiskFiles().Put(".\\mbdetect.ini", "[7D10]\nplatform=generic\nchip.codec.hdabar=0xFE500000\n");
  machine.DiskFiles().Put(".\\mbtest.ini", "");
  machine.DiskFiles().Put(".\\chip.ini", "[g_sio]\n" + std::string(kPorts) + "[g_ec]\nec.set_pwm.cmd=0xC1\n");
  panelglow::BoardDevio().LoadDriver();
}

SimulationOptions Endless() {
  SimulationOptions options;
  options.timeLimit_us = 0;
  return options;
}

void BuildBoardOfAllPlaces(benchmark::State& state) {
  Simulation machine(kMachine, Endless());
  PutFiles(machine);
  for (auto _ : state) {
    const auto board =
        panelglow::MotherBoard::Instantiate(".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini", "platform", "7D10");
    if (board == nullptr) {
      state.SkipWithError("no board");
      break;
    }
    benchmark::DoNotOptimize(board.get());
  }
}

template <class Class>
std::unique_ptr<Class> Make() {
  panelglow::IniReader::Instance("7D10", ".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini");
  auto chip = std::make_unique<Class>();
  chip->Initialize();
  return chip;
}

using EcByte = panelglow::GEcChip;
std::uint8_t Read(panelglow::GEcChip& chip) { return chip.ReadEc(0x10); }

using SuperIoRegister = panelglow::GSioChip;
std::uint8_t Read(panelglow::GSioChip& chip) { return chip.ReadConfigRegister(0x20); }

// A class whose registers stand in tables.
using TableRegister = panelglow::FinChip;
std::uint8_t Read(panelglow::FinChip& chip) {
  int value = 0;
  chip.ReadTemperature(1, value);
  return static_cast<std::uint8_t>(value);
}

// The requests that one operation sends.
template <class Class>
std::vector<DriverRequest> RequestsOf() {
  Simulation machine(kMachine, Endless());
  PutFiles(machine);
  const auto chip = Make<Class>();
  machine.Trace().Keep();
  Read(*chip);
  return machine.Trace().Requests();
}

void Count(benchmark::State& state, std::size_t requests) {
  state.counters["requests"] = static_cast<double>(requests);
  state.counters["per request"] = benchmark::Counter(
      static_cast<double>(requests), benchmark::Counter::kIsIterationInvariantRate | benchmark::Counter::kInvert);
}

template <class Class>
void ThroughTheChip(benchmark::State& state) {
  const std::size_t requests = RequestsOf<Class>().size();
  Simulation machine(kMachine, Endless());
  PutFiles(machine);
  const auto chip = Make<Class>();
  for (auto _ : state) {
    benchmark::DoNotOptimize(Read(*chip));
  }
  Count(state, requests);
}

// The same requests as bytes, handed to the device as they are.
template <class Class>
void BareRequests(benchmark::State& state) {
  const std::vector<DriverRequest> requests = RequestsOf<Class>();
  Simulation machine(kMachine, Endless());
  PutFiles(machine);
  std::uint32_t error = 0;
  const auto device = panelglow::platform::TheHost().drivers.Open("tmbhalcyon", error);
  if (device == nullptr) {
    state.SkipWithError("no device");
    return;
  }
  std::array<std::byte, 4> answer{};
  for (auto _ : state) {
    for (const DriverRequest& request : requests) {
      benchmark::DoNotOptimize(
          device->Control(request.code, request.in, std::span(answer).first(request.out.size())));
    }
  }
  Count(state, requests.size());
}

BENCHMARK(BuildBoardOfAllPlaces)->Unit(benchmark::kMicrosecond);
BENCHMARK(ThroughTheChip<EcByte>);
BENCHMARK(BareRequests<EcByte>);
BENCHMARK(ThroughTheChip<SuperIoRegister>);
BENCHMARK(BareRequests<SuperIoRegister>);
BENCHMARK(ThroughTheChip<TableRegister>);
BENCHMARK(BareRequests<TableRegister>);

}  // namespace
