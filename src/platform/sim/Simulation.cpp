#include "platform/sim/Simulation.h"

#include <algorithm>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <map>

#include "platform/HostInPlace.h"
#include "platform/desktop/Scene.h"
#include "platform/posix/LazyDrawing.h"
#include "platform/posix/LazyXmlDocuments.h"
#include "platform/posix/PosixFiles.h"
#include "platform/profile/ProfileFilesOnFiles.h"
#include "platform/sim/ChipMaker.h"
#include "platform/sim/FirmwareTable.h"
#include "platform/sim/SimClock.h"
#include "platform/sim/SimConsole.h"
#include "platform/sim/SimCpu.h"
#include "platform/sim/SimDevices.h"
#include "platform/sim/SimDriver.h"
#include "platform/sim/SimEnvironment.h"
#include "platform/sim/SimHost.h"
#include "platform/sim/SimInput.h"
#include "platform/sim/SimManagement.h"
#include "platform/sim/SimMutexes.h"
#include "platform/sim/SimThreads.h"
#include "platform/sim/SimWindowHost.h"
#include "platform/sim/person/Operator.h"
#include "platform/sim/person/SimScreen.h"
#include "platform/sim/silicon/KeyboardDevice.h"
#include "platform/sim/silicon/PciDoorway.h"

namespace panelglow::platform::sim {

namespace {

constexpr const char* kFirmware = "firmware";
constexpr const char* kPci = "pci";

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
                // Asked at every access to the hardware: each lamp's part is looked for once.
                const auto [part, isNew] = partsOfLamps.try_emplace(&device, nullptr);
                part->second = isNew ? buses.Find(device) : part->second;
                return part->second == nullptr ? std::optional<bool>() : part->second->Signal(pin);
              }),
        cpu(description),
        driver(description.driver, cpu, buses, scheduler, trace, [this] { LookAtPanel(); }),
        management(description, devices.tables, scheduler, firmwareCall, [this] { LookAtPanel(); }),
        mutexes(scheduler, description.peers, options.realFiles),
        clock(scheduler, description.startTime + static_cast<std::time_t>(simulationOptions.seed * 7919 % 86400)),
        threads(scheduler),
        console(scheduler, simulationOptions.captureOutput),
        environment(description.environment),
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
    if (!buses.PciFunctions().empty()) {
      buses.Attach(kPci, std::make_unique<PciDoorway>(buses));
    }
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
  std::map<const std::string*, const Device*> partsOfLamps;  // by the name in the lamp, where it stands
  FrontPanel panel;
  SimCpu cpu;
  SimDriver driver;
  SimManagement management;
  SimMutexes mutexes;
  SimClock clock;
  SimThreads threads;
  SimConsole console;
  SimEnvironment environment;
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
  p.initialState = HardwareState();
  if (!options.operatorPolicy.empty()) {
    p.person = std::make_unique<Operator>(Seat(), p.description.leds, options.operatorPolicy);
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
OperatorSeat Simulation::Seat() {
  return {parts_->scheduler, parts_->panel, parts_->windows, [this](std::string_view what) { Screenshot(what); }};
}
const MachineDescription& Simulation::Description() const { return parts_->description; }
const std::string& Simulation::Output() const { return parts_->console.Output(); }
const std::string& Simulation::Errors() const { return parts_->console.Errors(); }
void Simulation::ClearOutput() { parts_->console.Clear(); }
void Simulation::RefuseThreads(unsigned count) { parts_->threads.RefuseNext(count); }
void Simulation::RaiseConsole(std::uint32_t type) { parts_->console.Raise(type); }
std::string Simulation::HardwareState() { return parts_->buses.State() + parts_->cpu.State(); }
std::string Simulation::SettledState() {
  parts_->Settle();
  return HardwareState();
}
const std::string& Simulation::InitialState() const { return parts_->initialState; }
std::vector<Simulation::StateChange> Simulation::StateChanges() {
  std::istringstream before(InitialState());
  std::istringstream after(SettledState());
  std::vector<StateChange> changes;
  while (before || after) {
    StateChange line;
    std::getline(before, line.before);
    std::getline(after, line.after);
    if (line.before != line.after) {
      changes.push_back(std::move(line));
    }
  }
  return changes;
}
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
  FirmwareCall* const firmware = broken.device == kFirmware ? parts_->firmwareCall : nullptr;
  if (kind == LedFault::kAbsentChip) {
    parts_->buses.Remove(broken.device);
    if (firmware != nullptr) {
      firmware->GoAway();
    }
  }
  if (kind == LedFault::kLyingWrite && firmware != nullptr) {
    firmware->IgnoreOrders();
  } else if (kind == LedFault::kLyingWrite) {
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

namespace panelglow::platform {

// Weak, so that a program may link a host of its own: a test that stands in for a service of the machine.
[[gnu::weak]] Host& TheHost() {
  Host* const other = HostInPlace::Current();
  return other == nullptr ? sim::CurrentSimulation().TheMachine() : *other;
}

}  // namespace panelglow::platform
