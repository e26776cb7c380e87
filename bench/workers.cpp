// The workers of camera, network and drive LEDs in real time, on stand-ins that note when they are told something:
// the median of how far a phase is off the pattern (at most 1 ms). And the activity thread of a
// drive beside bare requests of the same block to the same file (at most 5 % more). To be run in the folder
// installation/.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdlib>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "harness/CmdLineParser.h"
#include "ledtests/BlinkWorkers.h"
#include "ledtests/CustomLEDTest.h"
#include "platform/AbsentDevices.h"
#include "platform/host_linux/LinuxHost.h"
#include "platform/posix/Descriptor.h"
#include "platform/sim/FirmwareTable.h"
#include "platform/sim/MachineDescription.h"

namespace {

namespace platform = panelglow::platform;
using Clock = std::chrono::steady_clock;

constexpr std::size_t kBlock_bytes = 0x8000;
constexpr std::uint64_t kBlockPosition = 0x100000;
constexpr std::size_t kPhases = 12;
constexpr double kPhase_ms = 500;

// What the stand-ins are told, and when they have had enough.
struct Watch {
  std::vector<Clock::time_point> edges;
  panelglow::LEDStruct* entry = nullptr;          // stops blinking behind the last phase
  panelglow::FrontPanelTest* busyTest = nullptr;  // its activity stops when no passes are left
  std::size_t passes = 0;

  void Note() {
    edges.push_back(Clock::now());
    if (entry != nullptr && edges.size() >= kPhases) {
      entry->running = false;
    }
  }
};
Watch g_watch;

class Graph : public platform::CaptureGraph {
 public:
  class OneDevice : public platform::CaptureDevices {
    bool Next() override { return true; }
    bool Bind() override { return true; }
  };
  platform::CaptureResult Initialize() override { return 0; }
  platform::CaptureResult Make(platform::CapturePart /*part*/) override { return 0; }
  platform::CaptureResult SetFilterGraph() override { return 0; }
  bool MakeDeviceEnumerator() override { return true; }
  std::unique_ptr<platform::CaptureDevices> OpenVideoInputs() override { return std::make_unique<OneDevice>(); }
  platform::CaptureResult AddCaptureFilter() override { return 0; }
  platform::CaptureResult MakeGrabber() override { return 0; }
  platform::CaptureResult AddGrabber() override { return 0; }
  platform::CaptureResult RenderStream() override { return 0; }
  platform::CaptureResult HideVideoWindow() override { return 0; }
  platform::CaptureResult Run() override { return g_watch.Note(), 0; }
  platform::CaptureResult Stop() override { return g_watch.Note(), 0; }
};

class Link : public platform::Connection {
 public:
  std::optional<std::string> DeviceName() override { return "Wireless"; }
  bool Connect() override { return g_watch.Note(), true; }
  bool Disconnect() override { return g_watch.Note(), true; }
};

class Links : public platform::ConnectionList {
 public:
  std::unique_ptr<platform::Connection> Next() override { return std::make_unique<Link>(); }
};

// A file in the place of a drive. The kernel keeps it in memory, so that what is measured beside the requests is not
// lost in the time of a real disk.
class FileDisk : public platform::RawDisk {
 public:
  explicit FileDisk(const char* path) : file_(::open(path, O_RDWR | O_CLOEXEC)) { g_watch.Note(); }
  ~FileDisk() override { g_watch.Note(); }
  FileDisk(const FileDisk&) = delete;
  FileDisk& operator=(const FileDisk&) = delete;

  bool Seek(std::uint64_t position) override {
    position_ = position;
    return true;
  }
  std::size_t Read(std::span<std::byte> bytes) override {
    return Done(::pread(file_.Get(), bytes.data(), bytes.size(), static_cast<off_t>(position_)));
  }
  std::size_t Write(std::span<const std::byte> bytes) override {
    if (g_watch.busyTest != nullptr && --g_watch.passes == 0) {
      g_watch.busyTest->SetThreadState(0);
    }
    return Done(::pwrite(file_.Get(), bytes.data(), bytes.size(), static_cast<off_t>(position_)));
  }

 private:
  std::size_t Done(ssize_t size) {
    position_ += size > 0 ? static_cast<std::uint64_t>(size) : 0;
    return size > 0 ? static_cast<std::size_t>(size) : 0;
  }

  platform::posix::Descriptor file_;
  std::uint64_t position_ = 0;
};

class Block : public platform::DiskBlock {
 public:
  std::span<std::byte> Bytes() override { return memory_; }

 private:
  alignas(4096) std::array<std::byte, kBlock_bytes> memory_{};
};

// The firmware's table, for the network worker to know the board by.
class Firmware : public platform::Management {
 public:
  std::unique_ptr<platform::ManagementConnection> Connect(std::string_view /*name*/,
                                                          platform::ManagementError& /*error*/) override {
    return std::make_unique<Connection>();
  }

 private:
  class Connection : public platform::ManagementConnection {
   public:
    std::optional<std::vector<platform::ManagementRow>> Query(std::u16string_view query) override {
      if (query.find(u"SmBios") == std::u16string_view::npos) {
        return std::nullopt;
      }
      platform::sim::FirmwareDescription description;
      description.boardProduct = "0001";  // that no board file knows
      const std::vector<std::uint8_t> table = platform::sim::BuildFirmwareTable(description);
      platform::ManagementRow row;
      row.Set(u"Size", {platform::ManagementScalar(static_cast<std::uint32_t>(table.size()))});
      row.Set(u"SMBiosData", {platform::ManagementArray(table.begin(), table.end())});
      return std::vector<platform::ManagementRow>{row};
    }
    platform::ManagementCallResult Call(const platform::ManagementCall& /*call*/) override {
      return {platform::ManagementCallStep::kGetMethod, {}};
    }
  };
};

struct StandIns : platform::Cameras, platform::Connections, platform::RawDisks {
  std::unique_ptr<platform::CaptureGraph> NewGraph() override { return std::make_unique<Graph>(); }
  std::unique_ptr<platform::ConnectionList> Enumerate() override { return std::make_unique<Links>(); }
  std::unique_ptr<platform::RawDisk> Open(std::string_view path) override {
    return std::make_unique<FileDisk>(std::string(path).c_str());
  }
  std::unique_ptr<platform::DiskBlock> Allocate(std::size_t /*size_bytes*/) override {
    return std::make_unique<Block>();
  }
};

// The drive's file, gone at the end.
class DriveFile {
 public:
  DriveFile() {
    const std::vector<char> content(kBlockPosition + kBlock_bytes, 'x');
    const platform::posix::Descriptor file(::open(kPath, O_RDWR | O_CREAT | O_TRUNC | O_CLOEXEC, 0600));
    if (::write(file.Get(), content.data(), content.size()) != static_cast<ssize_t>(content.size())) {
      std::abort();
    }
  }
  ~DriveFile() { ::unlink(kPath); }
  DriveFile(const DriveFile&) = delete;
  DriveFile& operator=(const DriveFile&) = delete;

  static constexpr const char* kPath = "bench-drive.bin";
};

// How far a phase is off the pattern; between edges that are `each` phases apart.
double MedianOffset_ms(std::size_t each) {
  std::vector<double> offsets;
  for (std::size_t i = each; i < g_watch.edges.size(); i += each) {
    const std::chrono::duration<double, std::milli> phases = g_watch.edges[i] - g_watch.edges[i - each];
    offsets.push_back(std::abs(phases.count() / static_cast<double>(each) - kPhase_ms));
  }
  std::sort(offsets.begin(), offsets.end());
  return offsets.empty() ? -1 : offsets[offsets.size() / 2];
}

// One blink of a few phases. `each`: a drive's busy phase ends with a request that is under way, so that only its
// begins stand in the pattern.
void Phases(benchmark::State& state, panelglow::BlinkWorker worker, std::size_t each) {
  const DriveFile drive;
  for (auto _ : state) {
    panelglow::CustomLEDTest test;
    panelglow::LEDStruct& entry = test.devices[0];
    test.iniFile = ".\\mbdetect.ini";
    test.testIni = ".\\mbtest.ini";
    test.chipIni = ".\\chip.ini";
    test.ChangeDriveHandle(DriveFile::kPath);
    entry.running = true;
    g_watch = {};
    g_watch.entry = &entry;
    worker(test, entry);
    state.counters["edges"] = static_cast<double>(g_watch.edges.size());
    state.counters["median offset ms (at most 1)"] = MedianOffset_ms(each);
  }
}

// The peer: a thread that does nothing but sleep through the phases.
void BareSleeps(benchmark::State& state) {
  for (auto _ : state) {
    g_watch = {};
    while (g_watch.edges.size() <= kPhases) {
      g_watch.Note();
      std::this_thread::sleep_for(std::chrono::duration<double, std::milli>(kPhase_ms));
    }
    state.counters["median offset ms"] = MedianOffset_ms(1);
  }
}

constexpr std::size_t kPasses = 2000;

double Activity_us() {
  panelglow::CustomLEDTest test;
  g_watch = {};
  g_watch.busyTest = &test;
  g_watch.passes = kPasses;
  test.SetThreadState(1);
  const Clock::time_point begin = Clock::now();
  panelglow::CustomLightUpFpHddLed(test, DriveFile::kPath);
  return std::chrono::duration<double, std::micro>(Clock::now() - begin).count() / kPasses;
}

double Bare_us() {
  const platform::posix::Descriptor file(::open(DriveFile::kPath, O_RDWR | O_CLOEXEC));
  const auto block = std::make_unique<Block>();
  const std::span<std::byte> bytes = block->Bytes();
  const Clock::time_point begin = Clock::now();
  for (std::size_t pass = 0; pass < kPasses; ++pass) {
    if (::pread(file.Get(), bytes.data(), bytes.size(), kBlockPosition) != static_cast<ssize_t>(bytes.size()) ||
        ::pwrite(file.Get(), bytes.data(), bytes.size(), kBlockPosition) != static_cast<ssize_t>(bytes.size())) {
      std::abort();
    }
  }
  return std::chrono::duration<double, std::micro>(Clock::now() - begin).count() / kPasses;
}

// In turn, and the best of each: what else the machine does falls on both.
void DriveActivity(benchmark::State& state) {
  const DriveFile drive;
  double activity = 1e9;
  double bare = 1e9;
  for (auto _ : state) {
    activity = std::min(activity, Activity_us());
    bare = std::min(bare, Bare_us());
  }
  state.counters["us a pass"] = activity;
  state.counters["bare us"] = bare;
  state.counters["ratio (at most 1.05)"] = activity / bare;
}

BENCHMARK_CAPTURE(Phases, Camera, panelglow::CustomBlinkWebcamLED, 1)->Iterations(1)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(Phases, Network, panelglow::CustomBlinkNetworkLED, 1)->Iterations(1)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(Phases, Drive, panelglow::CustomBlinkCtrlHDLED, 2)->Iterations(1)->Unit(benchmark::kMillisecond);
BENCHMARK(BareSleeps)->Iterations(1)->Unit(benchmark::kMillisecond);
BENCHMARK(DriveActivity)->Iterations(40)->Unit(benchmark::kMillisecond);

}  // namespace

namespace panelglow::platform {

// In place of the backend's own: its machine, but for the stand-ins.
Host& TheHost() {
  static auto* const machine = new host_linux::LinuxHost;
  static auto* const standIns = new StandIns;
  static auto* const firmware = new Firmware;
  static auto* const absent = new AbsentDevices;
  static Host* const host = new Host{.cameras = *standIns,
                                     .clock = machine->clock,
                                     .connections = *standIns,
                                     .console = machine->console,
                                     .cpu = machine->cpu,
                                     .desktop = machine->desktop,
                                     .deviceTree = *absent,
                                     .drivers = machine->driver,
                                     .environment = machine->environment,
                                     .files = machine->files,
                                     .images = machine->images,
                                     .keyboard = machine->keyboard,
                                     .management = *firmware,
                                     .modules = *absent,
                                     .mutexes = machine->mutexes,
                                     .profiles = machine->profiles,
                                     .rawDisks = *standIns,
                                     .registry = *absent,
                                     .services = machine->driver,
                                     .threads = machine->threads,
                                     .touchpad = machine->touchpad,
                                     .xmlDocuments = machine->xmlDocuments};
  return *host;
}

}  // namespace panelglow::platform

int main(int argc, char** argv) {
  const char* const kCommandLine[] = {"bench_workers", "-subtest=CustomLEDTest"};
  panelglow::CmdLineParser::GetInstance(2, kCommandLine);
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
}
