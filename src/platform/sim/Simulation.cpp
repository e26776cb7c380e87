#include "platform/sim/Simulation.h"

#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <map>
#include <system_error>

#include "platform/desktop/Scene.h"
#include "platform/posix/LazyDrawing.h"
#include "platform/posix/LazyXmlDocuments.h"
#include "platform/posix/PosixFiles.h"
#include "platform/profile/ProfileFilesOnFiles.h"
#include "platform/sim/ChipMaker.h"
#include "platform/sim/FirmwareTable.h"
#include "platform/sim/KeyboardDevice.h"
#include "platform/sim/Operator.h"
#include "platform/sim/SimDevices.h"
#include "platform/sim/SimDriver.h"
#include "platform/sim/SimHost.h"
#include "platform/sim/SimManagement.h"
#include "platform/sim/SimMutexes.h"
#include "platform/sim/SimScreen.h"

namespace panelglow::platform::sim {

namespace {

constexpr const char* kKeyboard = "keyboard";
constexpr const char* kFirmware = "firmware";

class SimClock : public Clock {
 public:
  SimClock(Scheduler& scheduler, std::time_t start) : scheduler_(scheduler), start_(start) {}
  std::uint32_t TickCount() override {
    scheduler_.Spend(1);  // so that a loop that only reads the clock comes to its end
    return static_cast<std::uint32_t>(scheduler_.Now() / 1000 + kBootTicks);
  }
  std::time_t WallTime() override { return start_ + static_cast<std::time_t>(scheduler_.Now() / 1'000'000); }
  std::tm LocalTime(std::time_t seconds) override {
    std::tm parts{};
    gmtime_r(&seconds, &parts);  // a simulated machine stands at Greenwich
    return parts;
  }
  void Sleep(std::uint32_t milliseconds) override { scheduler_.SleepFor(Microseconds{milliseconds} * 1000); }

 private:
  static constexpr std::uint64_t kBootTicks = 0xFFFFD8F0;  // 10 s before the counter wraps
  Scheduler& scheduler_;
  std::time_t start_;
};

class SimThreads : public Threads {
 public:
  explicit SimThreads(Scheduler& scheduler) : scheduler_(scheduler) {}
  ThreadHandle Start(const std::string& name, std::function<void()> body) override {
    if (refused_ != 0) {
      --refused_;
      return 0;
    }
    const ThreadHandle thread = scheduler_.Start(name, std::move(body));
    scheduler_.Spend(10);
    return thread;
  }
  bool Wait(ThreadHandle thread, std::uint32_t limit_ms) override {
    if (limit_ms == kNoLimit) {
      return scheduler_.WaitForEnd(thread, std::nullopt);
    }
    return scheduler_.WaitForEnd(thread, scheduler_.Now() + Microseconds{limit_ms} * 1000);
  }
  void Close(ThreadHandle /*thread*/) override {}
  void Terminate(ThreadHandle thread) override { scheduler_.Terminate(thread); }

  void RefuseNext(unsigned count) { refused_ = count; }

 private:
  Scheduler& scheduler_;
  unsigned refused_ = 0;
};

class SimConsole : public Console {
 public:
  SimConsole(Scheduler& scheduler, bool capture) : scheduler_(scheduler), capture_(capture) {}
  void Write(std::string_view bytes) override {
    scheduler_.Spend(1);
    if (capture_) {
      output_ += bytes;
      return;
    }
    while (!bytes.empty()) {
      const ssize_t written = ::write(STDOUT_FILENO, bytes.data(), bytes.size());
      if (written < 0 && errno == EINTR) {
        continue;
      }
      if (written <= 0) {
        outputError_ = outputError_ == 0 ? errno : outputError_;
        return;
      }
      bytes.remove_prefix(static_cast<std::size_t>(written));
    }
  }
  std::string OutputProblem() override {
    return outputError_ == 0 ? std::string() : std::generic_category().message(outputError_);
  }
  void WriteError(std::string_view bytes) override {
    if (capture_) {
      errors_ += bytes;
    } else {
      std::fwrite(bytes.data(), 1, bytes.size(), stderr);
    }
  }
  void SetControlHandler(std::function<bool(std::uint32_t)> handler) override { handler_ = std::move(handler); }

  void Raise(std::uint32_t type) {
    if (handler_) {
      scheduler_.Start("console control", [handler = handler_, type] { handler(type); });
    }
  }
  [[nodiscard]] bool IsHeard() const { return handler_ != nullptr; }
  [[nodiscard]] const std::string& Output() const { return output_; }
  [[nodiscard]] const std::string& Errors() const { return errors_; }
  void Clear() {
    output_.clear();
    errors_.clear();
  }

 private:
  Scheduler& scheduler_;
  bool capture_;
  std::string output_;
  std::string errors_;
  int outputError_ = 0;  // of the first write that failed
  std::function<bool(std::uint32_t)> handler_;
};

class SimEnvironment : public Environment {
 public:
  explicit SimEnvironment(const std::map<std::string, std::string>& variables) : variables_(variables) {}
  std::optional<std::string> Variable(std::string_view name) override {
    const auto found = variables_.find(std::string(name));
    return found == variables_.end() ? std::nullopt : std::optional<std::string>(found->second);
  }

 private:
  const std::map<std::string, std::string>& variables_;
};

class SimCpu : public Cpu {
 public:
  explicit SimCpu(const MachineDescription& machine) : machine_(machine) {}
  CpuidRegisters Cpuid(std::uint32_t leaf) override {
    const bool amd = !machine_.firmware.processors.empty() &&
                     machine_.firmware.processors.front().manufacturer.find("AMD") != std::string::npos;
    if (leaf == 0) {
      return amd ? CpuidRegisters{13, 0x68747541, 0x444D4163, 0x69746E65}
                 : CpuidRegisters{13, 0x756E6547, 0x6C65746E, 0x49656E69};
    }
    return leaf == 1 ? CpuidRegisters{0x000306A9, 0, 0, 0} : CpuidRegisters{};
  }
  bool Is64BitSystem() override { return machine_.is64Bit; }

 private:
  const MachineDescription& machine_;
};

class SimKeyboard : public Keyboard {
 public:
  SimKeyboard(Scheduler& scheduler, Buses& buses, KeyboardDevice& device, std::function<void()> moved)
      : scheduler_(scheduler), buses_(buses), device_(device), moved_(std::move(moved)) {}
  void Event(std::uint8_t virtualKey, std::uint8_t scanCode, std::uint32_t flags) override {
    scheduler_.Spend(20);
    if (!buses_.IsRemoved(kKeyboard) && !buses_.IsIgnored(kKeyboard, virtualKey)) {
      device_.Event(virtualKey, scanCode, flags);
    }
    moved_();
  }

 private:
  Scheduler& scheduler_;
  Buses& buses_;
  KeyboardDevice& device_;
  std::function<void()> moved_;
};

// The vendor's touchpad interface: one touchpad with one LED property.
class SimTouchpad : public Touchpad {
 public:
  SimTouchpad(bool present, Scheduler& scheduler, Buses& buses, KeyboardDevice& device, std::function<void()> moved)
      : present_(present), scheduler_(scheduler), buses_(buses), device_(device), moved_(std::move(moved)) {}

  std::unique_ptr<TouchpadApi> Create() override { return present_ ? std::make_unique<Api>(*this) : nullptr; }

 private:
  static constexpr std::int32_t kDevice = 3;
  static constexpr std::int32_t kTypeTouchpad = 2;
  static constexpr std::uint32_t kLedProperty = 0x10000171;

  class Pad : public TouchpadDevice {
   public:
    explicit Pad(SimTouchpad& owner) : owner_(owner) {}
    bool SetProperty(std::uint32_t property, std::int32_t value) override {
      owner_.scheduler_.Spend(50);
      if (property != kLedProperty) {
        return false;
      }
      if (!owner_.buses_.IsIgnored(kKeyboard, KeyboardDevice::kTouchpadLed)) {
        owner_.device_.SetTouchpadLed(value != 0);
      }
      owner_.moved_();
      return true;
    }

   private:
    SimTouchpad& owner_;
  };

  class Api : public TouchpadApi {
   public:
    explicit Api(SimTouchpad& owner) : owner_(owner) {}
    bool FindDevice(std::int32_t connection, std::int32_t type, std::int32_t& handle) override {
      if (connection != 0 || type != kTypeTouchpad || handle != -1) {
        return false;
      }
      handle = kDevice;
      return true;
    }
    std::unique_ptr<TouchpadDevice> OpenDevice(std::int32_t handle) override {
      return handle == kDevice ? std::make_unique<Pad>(owner_) : nullptr;
    }

   private:
    SimTouchpad& owner_;
  };

  bool present_;
  Scheduler& scheduler_;
  Buses& buses_;
  KeyboardDevice& device_;
  std::function<void()> moved_;
};

class SimWindowHost : public desktop::WindowHost {
 public:
  explicit SimWindowHost(Scheduler& scheduler) : scheduler_(scheduler) {}
  std::uint32_t CurrentThread() override { return scheduler_.Current(); }
  std::uint64_t Now_ms() override { return scheduler_.Now() / 1000; }
  void Block(const void* key, const std::string& what, std::optional<std::uint64_t> deadline_ms) override {
    scheduler_.Block(key, what, deadline_ms ? std::optional<Microseconds>(*deadline_ms * 1000) : std::nullopt);
  }
  void Wake(const void* key) override { scheduler_.Wake(key); }
  void Spend() override { scheduler_.Spend(1); }

 private:
  Scheduler& scheduler_;
};

Simulation* g_current = nullptr;

volatile std::sig_atomic_t g_pendingSignals[2] = {0, 0};

extern "C" void NoteSignal(int number) { g_pendingSignals[number == SIGINT ? 0 : 1] = 1; }

}  // namespace

struct Simulation::Parts {
  Parts(MachineDescription machine, const SimulationOptions& simulationOptions)
      : options(simulationOptions),
        description(std::move(machine)),
        scheduler({simulationOptions.seed, simulationOptions.realTime, simulationOptions.timeLimit_us}),
        buses(description.pci),
        keyboardDevice(AttachKeyboard(buses)),
        firmwareCall(AttachFirmwareCall(buses, description)),
        devices(description, {scheduler, buses, [this] { LookAtPanel(); }}),
        chips(devices.Parts()),
        panel(description.leds,
              [this](const std::string& device, const std::string& pin) {
                const Device* found = buses.Find(device);
                return found == nullptr ? std::optional<bool>() : found->Signal(pin);
              }),
        driver(description.driver, buses, scheduler, trace, [this] { LookAtPanel(); }),
        management(description, devices.tables, scheduler, firmwareCall, [this] { LookAtPanel(); }),
        mutexes(scheduler, description.peers, options.realFiles),
        clock(scheduler, description.startTime + static_cast<std::time_t>(simulationOptions.seed * 7919 % 86400)),
        threads(scheduler),
        console(scheduler, simulationOptions.captureOutput),
        environment(description.environment),
        cpu(description),
        keyboard(scheduler, buses, keyboardDevice, [this] { LookAtPanel(); }),
        touchpad(description.touchpad, scheduler, buses, keyboardDevice, [this] { LookAtPanel(); }),
        files(simulationOptions.realFiles ? &posixFiles : nullptr, scheduler),
        profiles(files),
        windowHost(scheduler),
        windows(windowHost, description.screenWidth, description.screenHeight),
        images(drawing),
        host{.cameras = devices.cameras,
             .clock = clock,
             .connections = devices.connections,
             .console = console,
             .cpu = cpu,
             .desktop = windows,
             .deviceTree = devices.tree,
             .drivers = driver,
             .environment = environment,
             .files = files,
             .images = images,
             .keyboard = keyboard,
             .management = management,
             .modules = devices.modules,
             .mutexes = mutexes,
             .profiles = profiles,
             .rawDisks = devices.disks,
             .registry = devices.registry,
             .services = driver,
             .threads = threads,
             .touchpad = touchpad,
             .xmlDocuments = xmlDocuments} {}

  static KeyboardDevice& AttachKeyboard(Buses& buses) {
    auto keyboard = std::make_unique<KeyboardDevice>();
    KeyboardDevice& device = *keyboard;
    buses.Attach(kKeyboard, std::move(keyboard));
    return device;
  }

  // Null on a machine whose firmware has no such interface.
  static FirmwareCall* AttachFirmwareCall(Buses& buses, const MachineDescription& machine) {
    if (!machine.firmwareCall) {
      return nullptr;
    }
    auto firmware = std::make_unique<FirmwareCall>(*machine.firmwareCall);
    FirmwareCall* device = firmware.get();
    buses.Attach(kFirmware, std::move(firmware));
    return device;
  }

  void AttachChips() {
    for (const ChipDescription& chip : description.chips) {
      std::unique_ptr<Device> device = MakeChip(chip, scheduler);
      chips.push_back(device.get());
      buses.Attach(chip.name, std::move(device));
    }
  }

  // To be called after everything that may have moved a pin.
  void LookAtPanel() {
    panel.Update(scheduler.Now());
    AwaitNextEvent();
  }

  // Keeps one event ahead for the chip that acts first; what an access changes in the meantime is looked at then.
  void AwaitNextEvent() {
    std::optional<Microseconds> next;
    for (const Device* chip : chips) {
      if (const std::optional<Microseconds> event = chip->NextEvent()) {
        next = std::min(next.value_or(*event), *event);
      }
    }
    if (!next || (awaited && *awaited <= *next)) {
      return;
    }
    awaited = next;
    scheduler.At(*next, [this, when = *next] {
      if (awaited == when) {
        awaited.reset();
        for (Device* chip : chips) {
          chip->Advance();
        }
        LookAtPanel();
      }
    });
  }

  // Lets all chips come to the end of what they have under way. One can set the next one going only a few times.
  void Settle() {
    constexpr int kMostSteps = 100;
    for (int step = 0; step < kMostSteps; ++step) {
      std::optional<Microseconds> end;
      for (const Device* chip : chips) {
        if (const std::optional<Microseconds> until = chip->UnderWayUntil()) {
          end = std::min(end.value_or(*until), *until);
        }
      }
      if (!end) {
        return;
      }
      scheduler.PassTo(*end);
      for (Device* chip : chips) {
        chip->Advance();
      }
    }
  }

  SimulationOptions options;
  MachineDescription description;
  Scheduler scheduler;
  Buses buses;
  KeyboardDevice& keyboardDevice;
  FirmwareCall* firmwareCall;
  SimDevices devices;
  std::vector<Device*> chips;           // those that may act by themselves
  std::optional<Microseconds> awaited;  // the chips' next event, when one is ahead
  DriverTrace trace;
  FrontPanel panel;
  SimDriver driver;
  SimManagement management;
  SimMutexes mutexes;
  SimClock clock;
  SimThreads threads;
  SimConsole console;
  SimEnvironment environment;
  SimCpu cpu;
  SimKeyboard keyboard;
  SimTouchpad touchpad;
  posix::PosixFiles posixFiles;
  SimFiles files;
  profile::ProfileFilesOnFiles profiles;
  SimWindowHost windowHost;
  desktop::WindowSystem windows;
  posix::LazyDrawing drawing;
  posix::DrawnImages images;
  posix::LazyXmlDocuments xmlDocuments{files};
  Host host;
  std::unique_ptr<Operator> person;
  std::unique_ptr<SimScreen> screen;
  std::string initialState;
  unsigned pictures = 0;
  Simulation* former = nullptr;
};

Simulation::Simulation(std::string_view toml, const SimulationOptions& options)
    : Simulation(ParseMachine(toml, "machine"), options) {}

Simulation::Simulation(MachineDescription description, const SimulationOptions& options)
    : parts_(std::make_unique<Parts>(std::move(description), options)) {
  Parts& p = *parts_;
  p.AttachChips();
  for (const Led& led : p.description.leds) {
    const Device* device = p.buses.Find(led.device);
    if (device == nullptr || !device->Signal(led.pin)) {
      throw MachineError("led \"" + led.name + "\": there is no pin \"" + led.pin + "\" on a device \"" + led.device +
                         "\"");
    }
  }
  if (p.description.firmware.entryPoint) {
    const std::vector<std::uint8_t> segment = BuildFirmwareSegment(p.description.firmware);
    p.buses.LoadMemory(kFirmwareSegment, segment);
  }
  p.scheduler.OnThreadEnd([this](ThreadId thread) {
    parts_->windows.EndThread();
    parts_->mutexes.Abandon(thread);
  });
  p.windows.SetDrawing([this] { return parts_->drawing.Get(); });
  for (const ScriptedEvent& event : p.description.events) {
    p.scheduler.At(event.at, [this, event] {
      switch (event.kind) {
        case ScriptedEvent::Kind::kWriteFile:
          parts_->files.Put(event.path, event.content);
          break;
        case ScriptedEvent::Kind::kDeleteFile:
          parts_->files.Hide(event.path);
          break;
        case ScriptedEvent::Kind::kFillDisk:
          parts_->files.FillDisk();
          break;
        case ScriptedEvent::Kind::kDevice:
          parts_->windows.Broadcast(message::kDeviceChange, device_event::kNodesChanged);
          parts_->windows.Broadcast(message::kDeviceChange,
                                    event.arrives ? device_event::kArrival : device_event::kRemoveComplete);
          break;
        case ScriptedEvent::Kind::kConsole:
          RaiseConsole(event.console);
          break;
        case ScriptedEvent::Kind::kKill:
          std::raise(SIGKILL);
          break;
      }
    });
  }
  if (!options.captureOutput) {
    // The simulated console is the real one: an interrupt from outside is a control event of the machine.
    for (const int number : {SIGINT, SIGTERM, SIGHUP, SIGQUIT}) {
      std::signal(number, NoteSignal);
    }
    std::signal(SIGPIPE, SIG_IGN);
  }
  if (options.window) {
    p.screen = std::make_unique<SimScreen>(p.windows, p.panel, p.description.name);
  }
  if (!options.captureOutput || options.window) {
    p.scheduler.OnHandOver([this] {
      if (parts_->screen) {
        parts_->screen->Look();
      }
      // What comes before the program listens waits for that, as it does between two hand-overs.
      for (std::uint32_t type = 0; type < 2 && parts_->console.IsHeard(); ++type) {
        if (g_pendingSignals[type] != 0) {
          g_pendingSignals[type] = 0;
          RaiseConsole(type);
        }
      }
    });
  }
  p.LookAtPanel();
  p.initialState = p.buses.State();
  if (!options.operatorPolicy.empty()) {
    p.person = std::make_unique<Operator>(*this, options.operatorPolicy);
  }
  p.former = g_current;
  g_current = this;
}

Simulation::~Simulation() {
  parts_->scheduler.EndThreads();  // while their windows and locks are still there
  g_current = parts_->former;
}

platform::Host& Simulation::TheMachine() { return parts_->host; }
Scheduler& Simulation::Time() { return parts_->scheduler; }
FrontPanel& Simulation::Panel() { return parts_->panel; }
Buses& Simulation::Hardware() { return parts_->buses; }
DriverTrace& Simulation::Trace() { return parts_->trace; }
SimFiles& Simulation::DiskFiles() { return parts_->files; }
desktop::WindowSystem& Simulation::Windows() { return parts_->windows; }
Operator* Simulation::Person() { return parts_->person.get(); }
const MachineDescription& Simulation::Description() const { return parts_->description; }
const std::string& Simulation::Output() const { return parts_->console.Output(); }
const std::string& Simulation::Errors() const { return parts_->console.Errors(); }
void Simulation::ClearOutput() { parts_->console.Clear(); }
void Simulation::RefuseThreads(unsigned count) { parts_->threads.RefuseNext(count); }
void Simulation::RaiseConsole(std::uint32_t type) { parts_->console.Raise(type); }
std::string Simulation::HardwareState() { return parts_->buses.State(); }
std::string Simulation::SettledState() {
  parts_->Settle();
  return HardwareState();
}
const std::string& Simulation::InitialState() const { return parts_->initialState; }
bool Simulation::IsMutexOwned(std::string_view name) const { return parts_->mutexes.IsOwned(name); }

void Simulation::Break(std::string_view led, std::string_view fault) {
  const std::size_t colon = fault.find(':');
  const std::string_view kindName = fault.substr(0, colon);
  const std::string_view partner = colon == std::string_view::npos ? std::string_view() : fault.substr(colon + 1);
  const std::optional<LedFault> kind = LedFaultByName(kindName);
  if (!kind) {
    throw MachineError("there is no fault \"" + std::string(kindName) + "\" (" + LedFaultNames() + ")");
  }
  if (!parts_->panel.Break(led, *kind, partner)) {
    throw MachineError("the fault \"" + std::string(fault) + "\" cannot be put on \"" + std::string(led) +
                       "\": no such LED, or no such partner (swapped:OTHER, shorted:OTHER)");
  }
  const Led& broken = parts_->panel.Leds()[*parts_->panel.Find(led)];
  if (kind == LedFault::kAbsentChip) {
    parts_->buses.Remove(broken.device);
  }
  if (kind == LedFault::kLyingWrite) {
    const Device* device = parts_->buses.Find(broken.device);
    if (const std::optional<std::uint64_t> address = device->RegisterOf(broken.pin)) {
      parts_->buses.IgnoreWrites(broken.device, *address);
    }
  }
  parts_->LookAtPanel();
}

void Simulation::Screenshot(std::string_view what) {
  if (parts_->options.screenshots.empty()) {
    return;
  }
  desktop::SceneDrawing* drawing = parts_->drawing.Get();
  char number[16];
  std::snprintf(number, sizeof number, "%02u", ++parts_->pictures);
  const std::string path = parts_->options.screenshots + "/" + number + "-" + std::string(what) + ".png";
  if (drawing == nullptr || !drawing->WritePng(parts_->windows.MakeScene(), path)) {
    std::fprintf(stderr, "simulation: the picture %s could not be written\n", path.c_str());
  }
}

Simulation& CurrentSimulation() {
  if (g_current == nullptr) {
    // Kept to the end of the process: threads that a stuck run leaves behind may still refer to it.
    static Simulation* const fromEnvironment = MakeSimulationFromEnvironment().release();
    g_current = fromEnvironment;
  }
  return *g_current;
}

}  // namespace panelglow::platform::sim
