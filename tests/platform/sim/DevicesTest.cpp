// The devices of a simulated machine behind every service that tells of them, and their lamps.
#include <gmock/gmock.h>

#include <unistd.h>

#include <cstdio>
#include <functional>

#include "platform/Text.h"
#include "platform/sim/Bench.h"
#include "platform/sim/silicon/DiskDevice.h"

namespace panelglow::platform::sim {
namespace {

using ::testing::HasSubstr;

constexpr const char* kSata = R"(PCI\VEN_8086&DEV_2922&SUBSYS_12345678&REV_02\3&11583659&0&FA)";
constexpr const char* kFirstDisk = R"(IDE\DISKFIRST\5&1A&0&0.0.0)";
constexpr const char* kFirstPath = R"(\\?\ide#diskfirst#5&1a&0&0.0.0#{53f56307-b6bf-11d0-94f2-00a0c91efb8b})";

constexpr const char* kControllers = R"(
libraries = ["storelib.dll"]
[[controller]]
name = "sata"
id = 'PCI\VEN_8086&DEV_2922&SUBSYS_12345678&REV_02\3&11583659&0&FA'
description = "Serial ATA"
driver = "storahci"
scsi_ports = [0, 3]
ui_number = 7
[[controller]]
name = "sas"
id = 'PCI\VEN_1000&DEV_0072&SUBSYS_30201000&REV_03\3&11583659&0&08'
kind = "scsi"
driver = "a driver with a name of more than 32 bytes"
scsi_ports = [1]
[[controller]]
name = "card"
id = 'SD\VID_15&OID_5344&PID_SD32G\4&1&0'
kind = "scsi"
[[disk]]
name = "dvd"
controller = "sata"
id = 'IDE\CDROM\5&1A&0&1.0.0'
interface_path = ""
[[disk]]
name = "first"
controller = "sata"
id = 'IDE\DISKFIRST\5&1A&0&0.0.0'
)";
constexpr const char* kOthers = R"(
[[disk]]
name = "second"
controller = "card"
id = 'SD\DISK\6&2&0'
gone_ms = 5000
size = 0x110000
[[camera]]
name = "cam"
build_ms = 400
[[adapter]]
name = "wire"
device_name = "Ethernet"
disconnect_ms = 700
connect_ms = 2000
[[adapter]]
name = "air"
device_name = "Drahtlos 無線 Беспроводной"
up = false
[[enumerated]]
id = 'FDC\GENERIC_FLOPPY_DRIVE\5&3&0&0'
hardware_ids = ["FDC\\GENERIC_FLOPPY_DRIVE", "GenFloppyDisk"]
[[chip]]
name = "fdc"
kind = "floppy-controller"
[[pci]]
device = 2
[pci.registers]
"0" = 0x591B8086
"8" = 0x03000004
"2C" = 0x87654321
)";

std::string LedText(const std::string& device, const std::string& pin) {
  return "[[led]]\nname = \"" + device + "\"\nsymbol = \"s\"\ncolor = \"green\"\ndevice = \"" + device +
         "\"\npin = \"" + pin + "\"\n";
}

// `change` stands behind the name line of the part `device`.
std::string DevicesText(const std::string& device = {}, const std::string& change = {}) {
  std::string text = std::string(kControllers) + kOthers;
  if (!device.empty()) {
    const std::string line = "name = \"" + device + "\"\n";
    const std::size_t at = text.find(line);
    EXPECT_NE(at, std::string::npos) << device;
    text.insert(at + line.size(), change + "\n");
  }
  return text + LedText("first", "activity") + LedText("second", "activity") + LedText("cam", "capture") +
         LedText("wire", "link") + LedText("fdc", "motor-a");
}

std::string TextOf(const std::optional<DeviceProperty>& property) {
  return property ? std::to_string(property->type) + ":" + std::string(property->bytes.begin(), property->bytes.end())
                  : "none";
}

TEST(SimulatedDevices, StandInATreeFromWhichADiskGoes) {
  Simulation machine(DevicesText());
  DeviceTree& tree = machine.TheMachine().deviceTree;
  const std::function<std::string(DeviceNode)> walk = [&](DeviceNode node) {
    std::string text = tree.InstanceId(node).value_or("?").substr(0, 14);
    for (DeviceNode child = tree.Child(node); child != 0; child = tree.Sibling(child)) {
      EXPECT_EQ(tree.Parent(child), node);
      text += " (" + walk(child) + ")";
    }
    return text;
  };
  const std::string pci =
      R"(HTREE\ROOT\0 (ACPI\PNP0A08\0 (PCI\VEN_1000&D) (PCI\VEN_8086&D) (PCI\VEN_8086&D (IDE\CDROM\5&1A) (IDE\DISKFIRST\)))";
  EXPECT_EQ(walk(tree.Locate("")), pci + R"() (SD\VID_15&OID_ (SD\DISK\6&2&0)) (FDC\GENERIC_FL))");
  const DeviceNode second = tree.Locate(R"(sd\disk\6&2&0)");
  EXPECT_NE(second, 0U);
  machine.Time().SleepFor(5'000'000);
  EXPECT_EQ(walk(tree.Locate("")), pci + R"() (SD\VID_15&OID_) (FDC\GENERIC_FL))");
  EXPECT_EQ(tree.InstanceId(second), std::nullopt);
  EXPECT_EQ(tree.Locate(R"(SD\DISK\6&2&0)") + tree.Locate("nowhere") + tree.Child(99), 0U);
}

TEST(SimulatedDevices, AreListedByEnumeratorAndByInterfaceWithTheirProperties) {
  Simulation machine(DevicesText());
  machine.Time().SleepFor(6'000'000);  // one disk has gone
  DeviceTree& tree = machine.TheMachine().deviceTree;
  struct Case {
    std::string enumerator;
    std::uint32_t flags;
    std::string interfaceClass;
    std::string devices;
  };
  const std::string disk(kDiskInterface);
  const Case kCases[] = {
      {"PCI", 6, "", "PCI PCI PCI "},
      {"pci", 4, "", "PCI PCI PCI "},
      {"PC", 6, "", ""},
      {"FDC", 6, "", "FDC "},
      {"SD", 6, "", "SD "},
      {"SD", 4, "", "SD SD "},
      {"PCI", 2, "", "refused"},
      {kFirstDisk, 6, "", "refused"},
      {"", 18, disk, "IDE*"},
      {"", 16, disk, "IDE*SD*"},
      {kFirstDisk, 18, disk, "IDE*"},
      {kSata, 18, disk, ""},
      {R"(PCI\NONE\0)", 18, disk, "refused"},
      {"", 18, "", "refused"},
      {"", 18, "another", ""},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.enumerator + " " + std::to_string(c.flags));
    const std::unique_ptr<DeviceList> list = tree.Open(c.enumerator, c.flags, c.interfaceClass);
    std::string devices = list ? "" : "refused";
    for (std::uint32_t i = 0; list && list->Device(i); ++i) {
      const DeviceNode node = *list->Device(i);
      const std::string id = tree.InstanceId(node).value_or(R"(SD\gone)");
      devices += id.substr(0, id.find('\\')) + (list->Interface(i) ? "*" : " ");
    }
    EXPECT_EQ(devices, c.devices);
  }
  const DeviceNode sata = tree.Locate(kSata);
  const std::unique_ptr<DeviceList> list = tree.Open("PCI", 6, "");
  const std::string id = R"(PCI\VEN_8086&DEV_2922)";
  const std::string nul(1, '\0');
  EXPECT_EQ(TextOf(list->Property(sata, kHardwareIdProperty)), "7:" + id + "&SUBSYS_12345678&REV_02" + nul + id +
                                                                   "&SUBSYS_12345678" + nul + id + "&CC_010601" +
                                                                   nul + id + "&CC_0106" + nul + nul);
  EXPECT_EQ(TextOf(list->Property(sata, kDescriptionProperty)), "1:Serial ATA" + nul);
  EXPECT_EQ(TextOf(list->Property(sata, kLocationProperty)), "1:PCI bus 0, device 31, function 2" + nul);
  EXPECT_EQ(TextOf(tree.NodeProperty(sata, kNodeUiNumberProperty)), "4:\x07" + std::string(3, '\0'));
  EXPECT_EQ(TextOf(tree.NodeProperty(tree.Locate(kFirstDisk), kNodeUiNumberProperty)), "none");
  EXPECT_EQ(TextOf(list->Property(tree.Locate(kFirstDisk), kDescriptionProperty)), "none") << "not in this list";
  EXPECT_EQ(tree.Open("", 18, disk)->Interface(0)->path, kFirstPath);
  // The same controller in configuration space.
  EXPECT_EQ(machine.Hardware().ReadPciByte(0xFA, 0x03), 0x29);
  EXPECT_EQ(machine.Hardware().ReadPciByte(0xFA, 0x0B), 0x01);
}

TEST(SimulatedDevices, AnswerManagementQueriesInTheLanguageOfTheService) {
  Simulation machine(DevicesText("sas", "description = \"SAS\""));
  machine.Time().SleepFor(6'000'000);  // one disk has gone
  ManagementError error;
  const auto connection = machine.TheMachine().management.Connect("ROOT\\CIMV2", error);
  struct Case {
    std::string query;
    const char16_t* property;
    std::string values;  // each with ";" behind it
  };
  const std::string disks = "SELECT * FROM Win32_DiskDrive";
  const std::string driver =
      R"(ASSOCIATORS OF {Win32_PnPEntity.DeviceID="PCI\\VEN_8086&DEV_2922&SUBSYS_12345678&REV_02\\3&11583659&0&FA"})";
  const Case kCases[] = {
      {"SELECT * FROM Win32_IDEController", u"PNPDeviceID", std::string(kSata) + ";"},
      {"select PNPDeviceID, Description\nfrom win32_scsicontroller", u"Description", "SAS;Storage controller;"},
      {"SELECT * FROM Win32_SCSIController", u"DriverName", "a driver with a name of more than 32 bytes;;"},
      {"SELECT * FROM Win32_IDEController", u"DriverName", "?;"},
      {disks, u"DeviceID", R"(\\.\PHYSICALDRIVE0;)"},
      {disks + R"( where PNPDeviceID='IDE\\DiskFirst\\5&1A&0&0.0.0')", u"DeviceID", R"(\\.\PHYSICALDRIVE0;)"},
      {disks + R"( WHERE PNPDeviceID = "IDE\\NONE")", u"DeviceID", ""},
      {disks + R"( where Nothing='x')", u"DeviceID", ""},
      {disks + R"( where PNPDeviceID='x)", u"DeviceID", "refused"},
      {disks + " where PNPDeviceID", u"DeviceID", "refused"},
      {disks + " order", u"DeviceID", "refused"},
      {driver + " WHERE ResultClass=Win32_SystemDriver", u"Name", "storahci;"},
      {driver + " WHERE ResultClass = Win32_Bus", u"Name", ""},
      {driver, u"Name", "refused"},
      {"ASSOCIATORS OF {Win32_PnPEntity.DeviceID=\"none\"} WHERE ResultClass=Win32_SystemDriver", u"Name", "refused"},
      {"SELECT * FROM Win32_VideoController", u"PNPDeviceID",
       R"(PCI\VEN_8086&DEV_591B&SUBSYS_87654321&REV_04\3&11583659&0&10;)"},
      {"SELECT * FROM Win32_PROCESSOR", u"Manufacturer", "Intel;"},
      {"SELECT * FROM Win32_Toaster", u"Name", "refused"},
  };
  for (const Case& c : kCases) {
    const auto rows = connection->Query(WideFromUtf8(c.query));
    std::string values = rows ? "" : "refused";
    for (const ManagementRow& row : rows.value_or(std::vector<ManagementRow>())) {
      const ManagementValue* value = row.Find(c.property);
      values += (value ? Utf8FromWide(std::get<wstring>(std::get<ManagementScalar>(value->content))) : "?") + ";";
    }
    EXPECT_EQ(values, c.values) << c.query;
  }
  EXPECT_FALSE(machine.TheMachine().management.Connect("ROOT\\WMI", error)->Query(WideFromUtf8(disks)));
}

TEST(SimulatedDevices, StandInTheRegistryByTheirDriversPortsAndLibrariesCanBeLoaded) {
  Simulation machine(DevicesText());
  Registry& registry = machine.TheMachine().registry;
  std::string drivers;
  for (int port = 0; port < 5; ++port) {
    const auto key = registry.OpenMachineKey("hardware\\DEVICEMAP\\Scsi\\Scsi Port " + std::to_string(port));
    std::vector<char> room(32);
    std::size_t size = 0;
    if (key && key->Read("Driver", room, size) == kMoreData) {
      room.resize(size);
      EXPECT_EQ(key->Read("driver", room, size), 0U);
    }
    drivers += key ? std::string(room.data()) + ";" : "-;";
    EXPECT_NE(key ? key->Read("Other", room, size) : 1U, 0U);
  }
  EXPECT_EQ(drivers, "storahci;a driver with a name of more than 32 bytes;-;storahci;-;");
  EXPECT_TRUE(machine.TheMachine().modules.CanLoad("StoreLib.dll"));
  EXPECT_FALSE(machine.TheMachine().modules.CanLoad("other.dll"));
}

class Disk {
 public:
  explicit Disk(Simulation& machine, const std::string& path = R"(\\.\physicaldrive0)")
      : block(machine.TheMachine().rawDisks.Allocate(0x8000)), handle(machine.TheMachine().rawDisks.Open(path)) {}

  std::size_t Read(std::uint64_t at = 0x100000) { return handle->Seek(at) ? handle->Read(block->Bytes()) : 0; }
  std::size_t Write(std::uint64_t at = 0x100000) { return handle->Seek(at) ? handle->Write(block->Bytes()) : 0; }

  std::unique_ptr<DiskBlock> block;
  std::unique_ptr<RawDisk> handle;
};

std::vector<Microseconds> Edges(Simulation& machine, const std::string& lamp) {
  std::vector<Microseconds> edges;
  for (const LedChange& change : machine.Panel().TimeLine()) {
    if (machine.Panel().Leds()[change.led].name == lamp) {
      edges.push_back(change.time);
    }
  }
  return edges;
}

TEST(SimulatedDisk, GlowsThroughItsTrafficAndALittleLongerAndStaysAsItWas) {
  Simulation machine(DevicesText());
  Disk disk(machine, kFirstPath);
  std::vector<Microseconds> expected;
  for (int cycle = 0; cycle < 3; ++cycle) {
    const Microseconds begin = machine.Time().Now();
    while (machine.Time().Now() < begin + 500'000) {
      ASSERT_EQ(disk.Read(), 0x8000U);
      ASSERT_EQ(disk.Write(), 0x8000U);
    }
    expected.insert(expected.end(), {begin + 1, machine.Time().Now() + 30'000});  // behind the first positioning
    machine.Time().SleepFor(500'000);
  }
  EXPECT_EQ(Edges(machine, "first"), expected);
  EXPECT_EQ(machine.HardwareState(), machine.InitialState());
}

// From a controller of the management service to its disk and to the lamp, as a person would look whether the file is
// right.
TEST(SimulatedDisk, OfEachMachineIsFoundOnItsControllerAndLightsItsLamp) {
  for (const auto& [file, lamps] : {std::pair{"drives-desktop.toml", "sata-drive sas-drive nvme-drive "},
                                    std::pair{"office-notebook.toml", "drive "}}) {
    Simulation machine(MachineText(file));
    platform::Host& host = machine.TheMachine();
    ManagementError error;
    const auto connection = host.management.Connect("ROOT\\CIMV2", error);
    std::string lit;
    for (const char16_t* query : {u"SELECT * FROM Win32_IDEController", u"SELECT * FROM Win32_SCSIController"}) {
      const std::optional<std::vector<ManagementRow>> rows = connection->Query(query);
      for (const ManagementRow& row : rows.value()) {
        const auto& id = std::get<wstring>(std::get<ManagementScalar>(row.Find(u"PNPDeviceID")->content));
        const DeviceNode node = host.deviceTree.Child(host.deviceTree.Locate(Utf8FromWide(id)));
        const auto list =
            host.deviceTree.Open(host.deviceTree.InstanceId(node).value_or(R"(none\)"), 18, kDiskInterface);
        if (!list) {
          continue;  // a controller without a disk
        }
        EXPECT_EQ(Disk(machine, list->Interface(0)->path).Read(), 0x8000U);
        lit += machine.Panel().Leds()[machine.Panel().TimeLine().back().led].name + " ";
        machine.Time().SleepFor(100'000);
      }
    }
    EXPECT_EQ(lit, lamps) << file;
  }
}

TEST(SimulatedDisk, IsIllInTheWayOfItsFault) {
  struct Case {
    const char* change;
    bool opens;
    std::size_t read;
    std::size_t write;
    std::size_t elsewhere;
    Microseconds least_us;
  };
  const Case kCases[] = {
      {"fault = \"no-open\"", false, 0, 0, 0, 0},
      {"fault = \"read-error\"", true, 0, 0x8000, 0x8000, 6000},
      {"fault = \"write-error\"", true, 0x8000, 0, 0x8000, 6000},
      {"fault = \"slow\"", true, 0x8000, 0x8000, 0x8000, 6'000'000},
      {"gone_ms = 1", true, 0, 0, 0, 1000},  // in the middle of the first request
      {"size = 0x104000", true, 0x4000, 0x4000, 0x8000, 6000},
      {"size = 0x100000", true, 0, 0, 0x8000, 2000},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.change);
    Simulation machine(DevicesText("first", c.change));
    Disk disk(machine);
    ASSERT_EQ(disk.handle != nullptr, c.opens);
    if (c.opens) {
      const Microseconds begin = machine.Time().Now();
      EXPECT_EQ(disk.Read(), c.read);
      EXPECT_EQ(disk.Write(), c.write);
      EXPECT_EQ(disk.Read(0), c.elsewhere);
      EXPECT_GE(machine.Time().Now() - begin, c.least_us);
    }
    machine.Time().SleepFor(1'000'000);
    EXPECT_FALSE(machine.Panel().IsLit("first"));
  }
}

// What a run must never do to a stranger's disk is left behind for all to see.
TEST(SimulatedDisk, TellsOfEveryWriteThatNoTestMayMake) {
  struct Case {
    const char* name;
    std::function<void(Disk&)> act;
    const char* told;
    bool contentStays;
  };
  const Case kCases[] = {
      {"as it must be", [](Disk& disk) { disk.Read(), disk.Write(); }, "writes = only what was read", true},
      {"what was never read", [](Disk& disk) { disk.Write(); }, "1 forbidden, the first of 32768 bytes at 0x100000",
       false},
      {"another byte", [](Disk& disk) { disk.Read(), disk.block->Bytes()[9] ^= std::byte{1}, disk.Write(); },
       "1 forbidden", false},
      {"twice", [](Disk& disk) { disk.Read(), disk.Write(), disk.Write(); }, "1 forbidden", true},
      {"ahead of the block", [](Disk& disk) { disk.Read(0xFFE00), disk.Write(0xFFE00); }, "at 0xFFE00", true},
      {"behind the block", [](Disk& disk) { disk.Read(0x100200), disk.Write(0x100200); }, "at 0x100200", true},
      {"to another place", [](Disk& disk) { disk.Read(0), disk.Write(); }, "1 forbidden", false},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.name);
    Simulation machine(DevicesText());
    Disk disk(machine);
    c.act(disk);
    const std::string state = machine.HardwareState();
    EXPECT_THAT(state, HasSubstr(c.told));
    const std::string content = state.substr(state.find("disk first content"), 40);
    EXPECT_EQ(machine.InitialState().find(content) != std::string::npos, c.contentStays);
  }
}

TEST(SimulatedDisk, TakesOnlyWholeSectorsAndEndsARequestWhoseThreadIsEnded) {
  Simulation machine(DevicesText("first", "latency_us = 400000"));
  Disk disk(machine);
  EXPECT_FALSE(disk.handle->Seek(0x100001));
  EXPECT_EQ(disk.handle->Read(disk.block->Bytes().first(100)), 0U);
  EXPECT_EQ(disk.handle->Read(disk.block->Bytes().subspan(8, 512)), 0U);
  Threads& threads = machine.TheMachine().threads;
  const ThreadHandle reader = threads.Start("reader", [&] { disk.Read(); });
  machine.Time().SleepFor(100'000);
  EXPECT_TRUE(machine.Panel().IsLit("first"));
  threads.Terminate(reader);
  machine.Time().SleepFor(31'000);
  EXPECT_FALSE(machine.Panel().IsLit("first"));
}

TEST(SimulatedDisk, LivesInAFileOfItsSize) {
  const std::string path = testing::TempDir() + "panelglow-disk-" + std::to_string(::getpid());
  const std::string change = "file = '" + path + "'\nsize = 0x110000";
  std::ofstream(path, std::ios::binary) << std::string(0x110000, 'x');
  {
    Simulation machine(DevicesText("first", change));
    Disk disk(machine);
    EXPECT_EQ(disk.Read(), 0x8000U);
    EXPECT_EQ(disk.Write(), 0x8000U);
    EXPECT_EQ(machine.HardwareState(), machine.InitialState());
    disk.block->Bytes()[9] = std::byte{'y'};
    EXPECT_EQ(disk.Write(), 0x8000U);
    EXPECT_NE(machine.HardwareState(), machine.InitialState());
  }
  std::ostringstream content;
  content << std::ifstream(path, std::ios::binary).rdbuf();
  EXPECT_EQ(content.str().find('y'), 0x100009U);
  std::ofstream(path, std::ios::binary) << "short";
  EXPECT_THROW(Simulation(DevicesText("first", change)), MachineError);
  std::remove(path.c_str());
  EXPECT_THROW(Simulation(DevicesText("first", change)), MachineError);
}

TEST(SimulatedAdapter, FollowsTheOrdersOfTheConnectionManagerAlsoOfACallerThatIsEnded) {
  struct Case {
    const char* change;
    bool disconnects;
    bool connects;
    std::vector<Microseconds> edges;  // from the order on, in ms
    const char* end;
  };
  const Case kCases[] = {
      {"", true, true, {700, 2700}, "adapter wire = up"},
      {"fault = \"stays-down\"", true, false, {700}, "adapter wire = down"},
      {"fault = \"stays-up\"", false, true, {}, "adapter wire = up"},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.change);
    Simulation machine(DevicesText("wire", c.change));
    const auto list = machine.TheMachine().connections.Enumerate();
    const auto wire = list->Next();
    EXPECT_EQ(wire->DeviceName(), "Ethernet");
    const Microseconds begin = machine.Time().Now();
    EXPECT_EQ(wire->Disconnect(), c.disconnects);
    EXPECT_EQ(wire->Connect(), c.connects);
    EXPECT_GE(machine.Time().Now(), begin + 2'700'000);
    std::vector<Microseconds> edges;
    for (const Microseconds edge : Edges(machine, "wire")) {
      if (edge > begin) {
        edges.push_back((edge - begin) / 1000);
      }
    }
    EXPECT_EQ(edges, c.edges);
    EXPECT_THAT(machine.HardwareState(), HasSubstr(c.end));
    EXPECT_EQ(list->Next()->DeviceName(), "Drahtlos 無線 Беспроводной");
    EXPECT_EQ(list->Next(), nullptr);
  }
  Simulation machine(DevicesText());
  const auto list = machine.TheMachine().connections.Enumerate();
  const auto wire = list->Next();
  Threads& threads = machine.TheMachine().threads;
  const ThreadHandle cutter = threads.Start("cutter", [&] {
    const std::unique_ptr<int, std::function<void(int*)>> restore(new int, [&](int* it) {
      wire->Connect();
      delete it;
    });
    wire->Disconnect();
  });
  machine.Time().SleepFor(300'000);
  threads.Terminate(cutter);
  EXPECT_EQ(machine.HardwareState(), machine.InitialState());
  EXPECT_EQ(Edges(machine, "wire").size(), 3U);  // lit at the start, cut, back
  const ThreadHandle careless = threads.Start("careless", [&] { wire->Disconnect(); });
  machine.Time().SleepFor(300'000);
  threads.Terminate(careless);
  EXPECT_EQ(machine.HardwareState(), machine.InitialState());
  EXPECT_THAT(machine.SettledState(), HasSubstr("adapter wire = down"));
}

// Takes the steps in their order and says at which it came to an end.
std::string Capture(Simulation& machine, std::unique_ptr<CaptureGraph>& graph) {
  graph = machine.TheMachine().cameras.NewGraph();
  const std::pair<const char*, std::function<bool()>> kSteps[] = {
      {"initialize", [&] { return graph->Initialize() >= 0; }},
      {"make-graph", [&] { return graph->Make(CapturePart::kGraph) >= 0; }},
      {"make-builder", [&] { return graph->Make(CapturePart::kBuilder) >= 0; }},
      {"make-control", [&] { return graph->Make(CapturePart::kControl) >= 0; }},
      {"make-video-window", [&] { return graph->Make(CapturePart::kVideoWindow) >= 0; }},
      {"set-filter-graph", [&] { return graph->SetFilterGraph() >= 0; }},
      {"make-enumerator", [&] { return graph->MakeDeviceEnumerator(); }},
      {"open-inputs",
       [&] {
         const auto inputs = graph->OpenVideoInputs();
         bool bound = false;
         while (inputs && !bound && inputs->Next()) {
           bound = inputs->Bind();
         }
         return bound;
       }},
      {"add-capture-filter", [&] { return graph->AddCaptureFilter() >= 0; }},
      {"make-grabber", [&] { return graph->MakeGrabber() >= 0; }},
      {"add-grabber", [&] { return graph->AddGrabber() >= 0; }},
      {"render", [&] { return graph->RenderStream() >= 0; }},
      {"hide-window", [&] { return graph->HideVideoWindow() >= 0; }},
      {"run", [&] { return graph->Run() >= 0; }},
  };
  for (const auto& [name, step] : kSteps) {
    if (!step()) {
      return name;
    }
  }
  return "runs";
}

TEST(SimulatedCamera, FailsAtTheStepOfItsFault) {
  for (const std::string_view fault : kCaptureFaults) {
    SCOPED_TRACE(fault);
    Simulation machine(DevicesText("cam", "fault = \"" + std::string(fault) + "\""));
    std::unique_ptr<CaptureGraph> graph;
    const std::string expected = fault.empty() || fault == "stop" ? "runs"
                                 : fault == "bind"                ? "open-inputs"
                                                                  : std::string(fault);
    EXPECT_EQ(Capture(machine, graph), expected);
    EXPECT_EQ(machine.Panel().IsLit("cam"), expected == "runs");
    EXPECT_GE(machine.Time().Now(), expected == "runs" ? 400'000U : 0U);
    if (expected == "runs") {
      EXPECT_THAT(machine.HardwareState(), HasSubstr("camera cam = captures"));
      EXPECT_EQ(graph->Stop() >= 0, fault != "stop");
      EXPECT_EQ(machine.Panel().IsLit("cam"), fault == "stop");
    }
    graph.reset();  // and with it whatever still captures
    EXPECT_FALSE(machine.Panel().IsLit("cam"));
    EXPECT_EQ(machine.HardwareState(), machine.InitialState());
  }
}

TEST(SimulatedCamera, GivesWayToTheNextAndIsDarkFromTheMomentItIsUnplugged) {
  {
    Simulation bare("");
    std::unique_ptr<CaptureGraph> none;
    EXPECT_EQ(Capture(bare, none), "open-inputs");
  }
  Simulation machine(DevicesText("cam", "fault = \"bind\"\n[[camera]]\nname = \"other\"\ngone_ms = 3000") +
                     LedText("other", "capture"));
  std::unique_ptr<CaptureGraph> graph;
  EXPECT_EQ(Capture(machine, graph), "runs");
  EXPECT_FALSE(machine.Panel().IsLit("cam"));
  std::unique_ptr<CaptureGraph> second;
  EXPECT_EQ(Capture(machine, second), "run") << "one at a time";
  machine.Time().SleepFor(3'000'000);
  EXPECT_EQ(Edges(machine, "other").back(), 3'000'000U);
  EXPECT_LT(graph->Run(), 0);
  EXPECT_EQ(Capture(machine, second), "open-inputs");
}

TEST(SimulatedFloppy, LightsTheSelectedDriveWhoseMotorRunsOutOfReset) {
  Bench bench(DevicesText());
  for (const auto& [value, lit] : {std::pair{0x1C, true},
                                   {0x14, true},
                                   {0x18, false},
                                   {0x0C, false},
                                   {0x1D, false},
                                   {0x2D, false},
                                   {0xF4, true},
                                   {0x00, false}}) {
    bench.Out(0x3F2, static_cast<std::uint8_t>(value));
    EXPECT_EQ(bench.IsLit("fdc"), lit) << value;
    EXPECT_EQ(bench.In(0x3F2), value);
    EXPECT_EQ(bench.In(0x3F4), (value & 4) != 0 ? 0x80 : 0);
  }
  EXPECT_EQ(bench.machine.HardwareState(), bench.machine.InitialState());
}

TEST(SimulatedDevices, AreDarkWhenThePanelSaysThatTheyAreNotThereOrTakeNoOrders) {
  for (const char* fault : {"absent-chip", "lying-write"}) {
    SCOPED_TRACE(fault);
    const bool isThere = std::string(fault) == "lying-write";
    Bench bench(DevicesText());
    Simulation& machine = bench.machine;
    for (const char* lamp : {"first", "cam", "wire", "fdc"}) {
      machine.Break(lamp, fault);
    }
    Disk disk(machine);
    EXPECT_EQ(disk.handle != nullptr, isThere);
    std::unique_ptr<CaptureGraph> graph;
    EXPECT_EQ(Capture(machine, graph), isThere ? "runs" : "open-inputs");
    const auto connection = machine.TheMachine().connections.Enumerate()->Next();
    EXPECT_EQ(connection->DeviceName() == "Ethernet", isThere);
    bench.Out(0x3F2, 0x1C);
    if (isThere) {
      EXPECT_EQ(disk.Read(), 0x8000U);
      EXPECT_TRUE(connection->Disconnect());
    }
    for (const char* lamp : {"first", "cam", "fdc"}) {
      EXPECT_TRUE(Edges(machine, lamp).empty()) << lamp;
    }
    EXPECT_EQ(machine.Panel().IsLit("wire"), isThere);  // it is never cut
    EXPECT_EQ(machine.TheMachine().deviceTree.Locate(kFirstDisk) != 0, isThere);
  }
}

TEST(SimulatedDevices, AreRefusedWhenTheirDescriptionFitsNoMachine) {
  struct Case {
    const char* part;
    const char* change;
    const char* problem;
  };
  const Case kCases[] = {
      {"first", "controller = \"sata\"\nid = 'A\\1'\n[[disk]]\nname = \"fdc\"",
       "\"disk.name\" is the name of another part"},
      {"first", "controller = \"none\"\nid = 'A\\1'\n[[disk]]\nname = \"x\"",
       "\"disk.controller\" names no [[controller]]"},
      {"first", "fault = \"ill\"", "\"disk.fault\" must be one of"},
      {"cam", "device = 1", "\"camera.device\" is not a key"},
      {"wire", "[[adapter]]\nname = \"y\"", "\"adapter.device_name\" is missing"},
      {"sata", "class = 0x1000000", "must have 24 bits"},
      {"sas", "id = 'PCI'\n[[controller]]\nname = \"z\"", "must be an instance id"},
      {"sas", "id = 'PCI\\VEN_1&DEV_1&SUBSYS_1&REV_1\\0&10'\n[[controller]]\nname = \"z\"",
       "\"controller.id\" ends in the place of another PCI function"},
      {"fdc", "[[enumerated]]\nid = 'sd\\disk\\6&2&0'", "two devices have the instance id sd\\disk"},
      {"fdc", "[[enumerated]]\nid = 'A\\1'\nparent = 'B\\1'", "which is no device of this machine ahead of it"},
      {"fdc", "[[controller]]\nname = \"z\"\nid = 'A\\1'\nscsi_ports = [3]", "two controllers have the SCSI port 3"},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.change);
    std::string change = c.change;
    if (std::string(c.part) == "fdc") {
      change = "kind = \"floppy-controller\"\n" + change + "\n[[chip]]\nname = \"more\"";
    }
    try {
      const Simulation machine(DevicesText(c.part, change));
      ADD_FAILURE() << "accepted";
    } catch (const MachineError& error) {
      EXPECT_THAT(error.what(), HasSubstr(c.problem));
    }
  }
}

}  // namespace
}  // namespace panelglow::platform::sim
