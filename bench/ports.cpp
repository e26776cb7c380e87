// One request for an I/O port through the driver's object, beside the kernel's own file of the ports, which takes a
// byte by pread and pwrite (at most 1.3 times as long). On a machine that gives its ports away: as root, and not in a
// container; `tools/bench --machine` runs it on the virtual PC.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <unistd.h>

#include <cstdint>

#include "hw/CDevio.h"
#include "platform/posix/Descriptor.h"

namespace {

using panelglow::CDevio;
using panelglow::platform::posix::Descriptor;

// A port of the virtual PC's test device: a byte that is what was written last, and nothing hangs on it.
constexpr std::uint16_t kPort = 0xE1;

void ReadThroughDriver(benchmark::State& state) {
  CDevio devio;
  if (!devio.IsDriverLoaded()) {
    state.SkipWithError("no driver here");
    return;
  }
  for (auto _ : state) {
    benchmark::DoNotOptimize(devio.InportByte(kPort));
  }
}

void WriteThroughDriver(benchmark::State& state) {
  CDevio devio;
  if (!devio.IsDriverLoaded()) {
    state.SkipWithError("no driver here");
    return;
  }
  for (auto _ : state) {
    benchmark::DoNotOptimize(devio.OutportByte(kPort, 0x5A));
  }
}

void BareRead(benchmark::State& state) {
  const Descriptor ports(::open("/dev/port", O_RDWR | O_CLOEXEC));
  std::uint8_t value = 0;
  for (auto _ : state) {
    if (::pread(ports.Get(), &value, 1, kPort) != 1) {
      state.SkipWithError("no /dev/port here");
      break;
    }
  }
}

void BareWrite(benchmark::State& state) {
  const Descriptor ports(::open("/dev/port", O_RDWR | O_CLOEXEC));
  const std::uint8_t value = 0x5A;
  for (auto _ : state) {
    if (::pwrite(ports.Get(), &value, 1, kPort) != 1) {
      state.SkipWithError("no /dev/port here");
      break;
    }
  }
}

BENCHMARK(ReadThroughDriver);
BENCHMARK(BareRead);
BENCHMARK(WriteThroughDriver);
BENCHMARK(BareWrite);

}  // namespace
