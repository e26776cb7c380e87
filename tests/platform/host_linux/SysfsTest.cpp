// What the doors to devices, management rows, firmware tables, SCSI ports and temperatures make of the kernel's
// files, well formed and not.
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <functional>
#include <vector>

#include "platform/Host.h"
#include "platform/host_linux/KernelTree.h"
#include "platform/host_linux/LinuxDeviceTree.h"
#include "platform/host_linux/LinuxManagement.h"
#include "platform/host_linux/LinuxModules.h"
#include "platform/host_linux/LinuxRegistry.h"
#include "platform/host_linux/StorageInventory.h"

namespace panelglow::platform::host_linux {
namespace {

using namespace std::string_literals;

constexpr std::uint32_t kPresentOfAll = kPresentDevices | kAllDeviceClasses;
constexpr std::uint32_t kPresentWithInterface = kPresentDevices | kDeviceInterfaces;

constexpr const char* kSata = R"(PCI\VEN_8086&DEV_2922&SUBSYS_11001AF4&REV_02\3&11583659&0&10)";
constexpr const char* kNvme = R"(PCI\VEN_1B36&DEV_0010&SUBSYS_11001AF4&REV_02\3&11583659&0&18)";
constexpr const char* kVirtio = R"(PCI\VEN_1AF4&DEV_1048&SUBSYS_11001AF4&REV_02\3&11583659&0&20)";
constexpr const char* kBehind = R"(PCI\VEN_8086&DEV_3420&SUBSYS_11001AF4&REV_02\3&11583659&0&E0)";
constexpr const char* kNetwork = R"(PCI\VEN_8086&DEV_10D3&SUBSYS_A01F8086&REV_02\4&00000001&0&00)";
constexpr const char* kEmptySata = R"(PCI\VEN_8086&DEV_2922&SUBSYS_11001AF4&REV_02\3&11583659&0&FA)";

// The doors are made ahead of the machine, so that what they tell was read when they were asked.
class SysfsTest : public testing::Test {
 protected:
  void SetUp() override {
    tree.AddFunction("0000:00:1c.0", {"0x8086", "0x3420", "0x1af4", "0x1100"}, "0x060400", "pcieport");
    tree.AddFunction("0000:00:1c.0/0000:01:00.0", {"0x8086", "0x10d3", "0x8086", "0xa01f"}, "0x020000", "e1000e");
    tree.AddFunction("0000:00:1f.2", {"0x8086", "0x2922", "0x1af4", "0x1100"}, "0x010601", "ahci");
    tree.AddFunction("0000:00:02.0", {"0x8086", "0x2922", "0x1af4", "0x1100"}, "0x010601", "ahci");
    tree.AddFunction("0000:00:03.0", {"0x1b36", "0x0010", "0x1af4", "0x1100"}, "0x010802", "nvme");
    tree.AddFunction("0000:00:04.0", {"0x1af4", "0x1048", "0x1af4", "0x1100"}, "0x010000", "virtio-pci");
    tree.Put("sys/bus/pci/slots/7/address", "0000:00:02\n");
    for (const char* host : {"0000:00:02.0/ata1/host0", "0000:00:02.0/ata2/host1", "0000:00:1f.2/ata7/host6"}) {
      tree.AddHost(host, "ahci");
    }
    tree.AddHost("0000:00:04.0/virtio2/host12", "virtio_scsi");
    tree.AddDisk("0000:00:02.0/ata1/host0/target0:0:0/0:0:0:0", "/block/sdb", "ATA     ", "QEMU HARDDISK");
    tree.AddDisk("0000:00:03.0/nvme/nvme0", "/nvme0n1", "", "QEMU NVMe Ctrl");
    tree.AddDisk("0000:00:04.0/virtio2/host12/target12:0:0/12:0:0:0", "/block/sda", "QEMU    ", "QEMU HARDDISK");
    tree.Put("sys/devices/virtual/block/loop0/size", "8\n");
    tree.Link("sys/block/loop0", "sys/devices/virtual/block/loop0");
  }

  [[nodiscard]] std::vector<std::string> ChildrenOf(std::string_view id) {
    std::vector<std::string> ids;
    for (DeviceNode node = devices.Child(devices.Locate(id)); node != 0; node = devices.Sibling(node)) {
      ids.push_back(devices.InstanceId(node).value_or("?"));
    }
    return ids;
  }

  [[nodiscard]] std::vector<ManagementRow> Query(const std::string& text, const char* nameSpace = "ROOT\\CIMV2") {
    ManagementError error;
    const auto connection = management.Connect(nameSpace, error);
    return connection ? connection->Query(WideFromUtf8(text)).value_or(std::vector<ManagementRow>())
                      : std::vector<ManagementRow>();
  }

  static std::string Text(const ManagementRow& row, const char* property) {
    const ManagementValue* value = row.Find(WideFromUtf8(property));
    return value == nullptr ? "-" : Utf8FromWide(std::get<wstring>(std::get<ManagementScalar>(value->content)));
  }

  [[nodiscard]] std::vector<std::string> Texts(const std::string& query, const char* property) {
    std::vector<std::string> texts;
    for (const ManagementRow& row : Query(query)) {
      texts.push_back(Text(row, property));
    }
    return texts;
  }

  [[nodiscard]] std::string FirmwareTable() {
    const auto rows = Query("SELECT * FROM MSSmBios_RawSMBiosTables", "\\\\.\\root\\wmi");
    std::string bytes;
    if (!rows.empty()) {
      for (const auto& byte : std::get<ManagementArray>(rows[0].Find(u"SMBiosData")->content)) {
        bytes += static_cast<char>(std::get<std::uint8_t>(byte));
      }
      const ManagementValue* size = rows[0].Find(u"Size");
      EXPECT_EQ(std::get<std::uint32_t>(std::get<ManagementScalar>(size->content)), bytes.size());
    }
    return bytes;
  }

  [[nodiscard]] std::string PortDriver(unsigned port) {
    const auto key = registry.OpenMachineKey("HARDWARE\\DEVICEMAP\\Scsi\\Scsi Port " + std::to_string(port));
    std::string room(4, '\0');
    std::size_t size = 0;
    if (!key || key->Read("driver", room, size) == 0) {
      return key ? room : "-";
    }
    room.resize(size);
    EXPECT_EQ(key->Read("Driver", room, size), 0U);
    return room.c_str();
  }

  [[nodiscard]] std::string Property(DeviceList& list, DeviceNode node, std::uint32_t property) {
    const auto found = list.Property(node, property);
    return found ? std::string(found->bytes.begin(), found->bytes.end()) : "-";
  }

  // Every question once; the number of devices.
  std::size_t AskEverything() {
    std::size_t count = 0;
    const auto list = devices.Open("", kPresentOfAll, "");
    while (const auto node = list->Device(static_cast<std::uint32_t>(count))) {
      ++count;
      for (std::uint32_t property = 0; property <= kNodeUiNumberProperty; ++property) {
        (void)list->Property(*node, property);
      }
      (void)ChildrenOf(devices.InstanceId(*node).value_or(""));
    }
    for (const char* name : {"IDEController", "SCSIController", "DiskDrive", "VideoController", "Processor"}) {
      (void)Query("SELECT * FROM Win32_"s + name);
    }
    (void)FirmwareTable();
    (void)PortDriver(0);
    (void)modules.LoadGraphics("atiadlxx.dll", GraphicsInterface::kAdl);
    return count;
  }

  KernelTree tree;
  LinuxDeviceTree devices{tree.Folders()};
  LinuxManagement management{tree.Folders()};
  LinuxModules modules{tree.Folders()};
  LinuxRegistry registry{tree.Folders()};
};

TEST_F(SysfsTest, FunctionsStandInTheOrderOfTheirPlacesBelowTheirBridges) {
  EXPECT_EQ(ChildrenOf("ACPI\\PNP0A08\\0"), (std::vector<std::string>{kSata, kNvme, kVirtio, kBehind, kEmptySata}));
  EXPECT_EQ(ChildrenOf(kBehind), std::vector<std::string>{kNetwork});
  EXPECT_EQ(devices.InstanceId(devices.Parent(devices.Locate(kNetwork))), kBehind);
  EXPECT_TRUE(ChildrenOf(kEmptySata).empty());

  const auto list = devices.Open("PCI", kPresentOfAll, "");
  const DeviceNode first = list->Device(0).value();
  EXPECT_EQ(Property(*list, first, kHardwareIdProperty),
            "PCI\\VEN_8086&DEV_2922&SUBSYS_11001AF4&REV_02\0PCI\\VEN_8086&DEV_2922&SUBSYS_11001AF4\0"
            "PCI\\VEN_8086&DEV_2922&CC_010601\0PCI\\VEN_8086&DEV_2922&CC_0106\0\0"s);
  EXPECT_EQ(Property(*list, first, kDriverProperty), "ahci\0"s);
  EXPECT_EQ(Property(*list, first, kUiNumberProperty), "\7\0\0\0"s);
  EXPECT_EQ(Property(*list, list->Device(5).value(), kLocationProperty), "PCI bus 1, device 0, function 0\0"s);
  EXPECT_FALSE(list->Device(6));
}

TEST_F(SysfsTest, ADisksPathSaysItsKindAndLeadsToItsFile) {
  const std::string folder = tree.Folders().dev;
  const struct {
    const char* controller;
    const char* kind;
    std::string file;
  } kDisks[] = {{kSata, "\\ide#disk", folder + "/sdb"},
                {kNvme, "\\scsi#disk", folder + "/nvme0n1"},
                {kVirtio, "\\scsi#disk", folder + "/sda"}};
  const auto all = devices.Open("", kPresentWithInterface, kDiskInterface);
  for (std::uint32_t i = 0; i < std::size(kDisks); ++i) {
    const std::vector<std::string> children = ChildrenOf(kDisks[i].controller);
    ASSERT_EQ(children.size(), 1U);
    const auto own = devices.Open(children[0], kPresentWithInterface, kDiskInterface);
    const std::string path = own->Interface(0).value().path;
    EXPECT_NE(path.find(kDisks[i].kind), std::string::npos) << path;
    EXPECT_EQ(DiskFileOf(tree.Folders(), path), kDisks[i].file);
    EXPECT_EQ(all->Interface(i).value().path, path);

    std::string doubled;
    for (const char c : children[0]) {
      doubled += c == '\\' ? "\\\\" : std::string(1, c);
    }
    EXPECT_EQ(Texts("SELECT * FROM Win32_DiskDrive where PNPDeviceID='" + doubled + "'", "DeviceID"),
              std::vector<std::string>{kDisks[i].file});
  }
  EXPECT_FALSE(all->Interface(3));  // the loop device is no hardware
  EXPECT_EQ(Texts("SELECT * FROM Win32_DiskDrive", "Size")[0], "67108864");
  for (const char* foreign : {"/dev/sda", "\\\\?\\ide#disk#{x}", "\\\\?\\scsi#4&../../etc#{x}", "", "\\\\?\\&"}) {
    EXPECT_EQ(DiskFileOf({}, foreign), foreign);
  }
}

TEST_F(SysfsTest, ControllersComeByKindAndFindTheirPortsByTheirDrivers) {
  EXPECT_EQ(Texts("SELECT * FROM Win32_IDEController", "PNPDeviceID"), (std::vector<std::string>{kSata, kEmptySata}));
  EXPECT_EQ(Texts("select * from Win32_ScsiController", "PNPDeviceID"), (std::vector<std::string>{kNvme, kVirtio}));
  EXPECT_EQ(Texts("SELECT * FROM Win32_SCSIController", "DriverName"),
            (std::vector<std::string>{"nvme", "virtio_scsi"}));
  EXPECT_EQ(Texts("ASSOCIATORS OF {Win32_PnPEntity.DeviceID=\"PCI\\\\VEN_8086&DEV_2922&SUBSYS_11001AF4&REV_02\\\\"
                  "3&11583659&0&FA\"} WHERE ResultClass=Win32_SystemDriver",
                  "Name"),
            std::vector<std::string>{"ahci"});
  // The two controllers of one driver have a port each, though the first has two hosts.
  EXPECT_EQ(PortDriver(0), "ahci");
  EXPECT_EQ(PortDriver(1), "virtio_scsi");
  EXPECT_EQ(PortDriver(2), "ahci");
  EXPECT_EQ(PortDriver(3), "-");
}

// Thin clients have their disk soldered on, as a card behind a host controller that is no mass-storage device.
TEST_F(SysfsTest, AMemoryCardIsAControllerWithOneDisk) {
  tree.AddFunction("0000:00:1a.0", {"0x8086", "0x4dc4", "0", "0"}, "0x080501", "sdhci-pci");
  const std::string card = "0000:00:1a.0/mmc_host/mmc0/mmc0:0001";
  tree.AddDisk(card, "/block/mmcblk0", "", "");
  tree.Link("sys/block/mmcblk0boot0", KernelTree::kBridge + card + "/block/mmcblk0/mmcblk0boot0");
  tree.Link(KernelTree::kBridge + card + "/block/mmcblk0/mmcblk0boot0/device", KernelTree::kBridge + card);
  tree.Put(KernelTree::kBridge + card + "/manfid", "0x000015\n");
  tree.Put(KernelTree::kBridge + card + "/oemid", "0x0100\n");
  tree.Put(KernelTree::kBridge + card + "/name", "8GME4R\n");
  const std::vector<std::string> rows = Texts("SELECT * FROM Win32_SCSIController", "PNPDeviceID");
  ASSERT_EQ(rows.back(), R"(SD\VID_15&OID_0100&PID_8GME4R\4&00D0&0&mmcblk0)");
  ASSERT_EQ(ChildrenOf(rows.back()).size(), 1U);
  const auto list = devices.Open(ChildrenOf(rows.back())[0], kPresentWithInterface, kDiskInterface);
  EXPECT_EQ(DiskFileOf({}, list->Interface(0).value().path), "/dev/mmcblk0");
  EXPECT_EQ(Query("SELECT * FROM Win32_DiskDrive").size(), 4U);
}

TEST_F(SysfsTest, OnlyDisksThatPeopleKnowAreListedAndSharedOnesHaveAController) {
  const std::string subsystem = "sys/devices/virtual/nvme-subsystem/nvme-subsys1";
  tree.Put(subsystem + "/model", "Shared\n");
  tree.Put(subsystem + "/nvme1n1/size", "8\n");
  tree.Link(subsystem + "/nvme1n1/device", subsystem);
  tree.Link("sys/block/nvme1n1", subsystem + "/nvme1n1");
  tree.Link(subsystem + "/nvme1", KernelTree::kBridge + "0000:00:03.0/nvme/nvme1"s);
  const std::string hidden = "0000:00:03.0/nvme/nvme1";
  tree.AddDisk(hidden, "/nvme1c1n1", "", "Shared");
  tree.Put(KernelTree::kBridge + hidden + "/nvme1c1n1/hidden", "1\n");
  const std::string optical = "0000:00:1f.2/ata7/host6/target6:0:0/6:0:0:0";
  tree.AddDisk(optical, "/block/sr0", "", "DVD");
  tree.Put(KernelTree::kBridge + optical + "/type", "5\n");
  const std::string flash = "0000:00:1f.2/spi_master/spi0/spi0.0/mtd/mtd0";
  tree.AddDisk(flash, "/block/mtdblock0", "", "");
  tree.Put(KernelTree::kBridge + flash + "/type", "nor\n");
  tree.AddDisk("0000:00:1f.2/usb1/1-1/host9/target9:0:0/9:0:0:0", "/block/sdc", "Maker", "Stick");
  const std::vector<std::string> onNvme = ChildrenOf(kNvme);
  ASSERT_EQ(onNvme.size(), 2U);
  EXPECT_EQ(onNvme[1], R"(SCSI\Disk&Ven_NVMe&Prod_Shared\4&0018&0&nvme1n1)");
  EXPECT_EQ(ChildrenOf(kEmptySata),
            std::vector<std::string>{R"(USBSTOR\Disk&Ven_Maker&Prod_Stick&Rev_\4&00FA&0&sdc)"});
}

TEST_F(SysfsTest, ADeviceThatComesBackHasItsNodeAgain) {
  const std::string id = ChildrenOf(kNvme).at(0);
  const DeviceNode node = devices.Locate(id);
  std::filesystem::remove(tree.At("sys/block/nvme0n1"));
  EXPECT_EQ(devices.Locate(id), 0U);
  EXPECT_FALSE(devices.InstanceId(node));
  EXPECT_EQ(devices.Open(id, kPresentWithInterface, kDiskInterface), nullptr);
  tree.Link("sys/block/nvme0n1", KernelTree::kBridge + "0000:00:03.0/nvme/nvme0/nvme0n1"s);
  EXPECT_EQ(devices.Locate(id), node);
}

TEST_F(SysfsTest, OneProcessorIsCountedForEachPackage) {
  for (const char* core : {"0", "1", "2", "3"}) {
    tree.Put("sys/devices/system/cpu/cpu"s + core + "/topology/physical_package_id", core[0] < '2' ? "0\n" : "1\n");
  }
  tree.Put("proc/cpuinfo", "processor\t: 0\nvendor_id\t: GenuineIntel\nmodel name\t: Some CPU\n");
  EXPECT_EQ(Texts("SELECT * FROM Win32_PROCESSOR", "Manufacturer"),
            (std::vector<std::string>{"GenuineIntel", "GenuineIntel"}));
}

TEST_F(SysfsTest, TheFirmwareTableEndsWithItsLastStructureOrIsMadeOfWhatEverybodyMayRead) {
  const std::string board = "\2\x08\0\0\0\1\0\0"s + "1234\0\0"s;
  const std::string end = "\x7F\4\1\0\0\0"s;
  const struct {
    std::string file;
    std::string table;
  } kTables[] = {{board + end + std::string(60, '\0'), board + end},
                 {board + end + "\1", board + end},
                 {board + "\4\xFF\0"s, board + "\4\xFF\0"s},  // cut in the middle: its reader's matter
                 {"\2\3\0\0\0\0"s, ""},
                 {"\2\xFF\0\0"s, ""},
                 {"\2", ""},
                 {"", ""}};
  for (const auto& [file, table] : kTables) {
    tree.Put("sys/firmware/dmi/tables/DMI", file);
    EXPECT_EQ(FirmwareTable(), table);
  }
  tree.Put("sys/class/dmi/id/board_vendor", "Maker\n");
  tree.Put("sys/class/dmi/id/board_name", "8054\n");
  tree.Put("sys/class/dmi/id/chassis_type", "3\n");
  const std::string made = FirmwareTable();
  EXPECT_NE(made.find("\2\x08\2\0\1\2\0\0Maker\0"s + "8054\0\0"s), std::string::npos);
  EXPECT_NE(made.find("\3\x09\3\0\0\3\0\0\0\0\0"s), std::string::npos);
  EXPECT_TRUE(Query("SELECT * FROM tmbBIntM", "ROOT\\WMI").empty());
}

TEST_F(SysfsTest, ACardsTemperaturesAreThoseOfItsDriver) {
  tree.AddFunction("0000:02:00.0", {"0x1002", "0x73bf", "0x1002", "0x0e3a"}, "0x030000", "amdgpu");
  EXPECT_EQ(modules.LoadGraphics("atiadlxx.dll", GraphicsInterface::kAdl), nullptr);
  const std::string monitor = KernelTree::kBridge + "0000:02:00.0/hwmon/hwmon3/"s;
  tree.Put(monitor + "temp1_input", "54999\n");
  tree.Put(monitor + "temp2_input", "-\n");
  const auto library = modules.LoadGraphics("atiadlxx.dll", GraphicsInterface::kAdl);
  ASSERT_NE(library, nullptr);
  EXPECT_EQ(library->Cards().at(0).deviceId, 0x73BF);
  EXPECT_EQ(library->ReadTemperature(0, 0), 54);
  EXPECT_FALSE(library->ReadTemperature(0, 1) || library->ReadTemperature(0, 2) || library->ReadTemperature(1, 0));
  EXPECT_EQ(modules.LoadGraphics("nvapi.dll", GraphicsInterface::kNvApi), nullptr);
}

TEST_F(SysfsTest, CardsUnderTheirMakersDriverAreThoseOfItsLibrary) {
  LinuxModules installed(tree.Folders(), PANELGLOW_MADE_UP_GRAPHICS);
  EXPECT_EQ(installed.LoadGraphics("nvapi.dll", GraphicsInterface::kNvApi), nullptr);  // no card of that maker
  tree.AddFunction("0000:02:00.0", {"0x10de", "0x2204", "0", "0"}, "0x030000", "nvidia");
  EXPECT_EQ(LinuxModules(tree.Folders(), "libnone.so").LoadGraphics("", GraphicsInterface::kNvApi), nullptr);
  for (int i = 0; i < 2; ++i) {
    const auto library = installed.LoadGraphics("nvapi.dll", GraphicsInterface::kNvApi);
    ASSERT_NE(library, nullptr);
    ASSERT_EQ(library->Cards().size(), 2U);
    EXPECT_EQ(library->Cards()[0].vendorId, 0x10DE);
    EXPECT_EQ(library->Cards()[0].deviceId, 0x2204);
    EXPECT_EQ(library->ReadTemperature(0, 0), 61);
    EXPECT_FALSE(library->ReadTemperature(0, 1) || library->ReadTemperature(1, 0));
  }
}

TEST_F(SysfsTest, ALibraryIsTriedUnderItsNameHere) {
  EXPECT_TRUE(modules.CanLoad("XML2.dll"));
  for (const char* name : {"storelib-that-is-not-there.dll", "xml2", "../xml2.dll", ""}) {
    EXPECT_FALSE(modules.CanLoad(name)) << name;
  }
}

TEST_F(SysfsTest, WhatIsMalformedIsLeftOutAndNothingWaitsForIt) {
  const std::string sata = KernelTree::kBridge + "0000:00:02.0"s;
  const std::size_t whole = AskEverything();
  const struct {
    const char* what;
    std::function<void()> damage;
    std::size_t lost;
  } kDamages[] = {
      {"an id that is none", [&] { tree.Put(sata + "/vendor", "0x8086x\n"); }, 1},
      {"an id of too many digits", [&] { tree.Put(sata + "/vendor", "0x18086\n"); }, 1},
      {"an attribute of a megabyte", [&] { tree.Put(sata + "/vendor", std::string(1 << 20, '8')); }, 1},
      {"a class that is missing", [&] { std::filesystem::remove(tree.At(sata + "/class")); }, 1},
      {"a pipe for an attribute",
       [&] {
         std::filesystem::remove(tree.At(sata + "/class"));
         EXPECT_EQ(::mkfifo(tree.At(sata + "/class").c_str(), 0600), 0);
       },
       1},
      {"a folder for an attribute",
       [&] {
         std::filesystem::remove(tree.At(sata + "/class"));
         std::filesystem::create_directory(tree.At(sata + "/class"));
       },
       1},
      {"a function's link in a circle",
       [&] {
         const auto link = tree.At("sys/bus/pci/devices/0000:00:03.0");
         std::filesystem::remove(link);
         std::filesystem::create_symlink(link, link);
       },
       1},
      {"a disk's link in a circle",
       [&] {
         const auto link = tree.At("sys/block/sda");
         std::filesystem::remove(link);
         std::filesystem::create_symlink(link, link);
       },
       1},
      {"names that are no places",
       [&] {
         for (const char* name : {"0000:00:zz.0", "0000:00:20.0", "0001:00:02.0", "0000:00:02.8", "x"}) {
           tree.Link("sys/bus/pci/devices/"s + name, sata);
         }
       },
       0},
      {"hosts and slots of nobody",
       [&] {
         tree.Put("sys/class/scsi_host/host77/proc_name", std::string(5000, '\xFF'));
         tree.Put("sys/bus/pci/slots/99999999999/address", "0000:00:03\n");
         tree.Put("sys/bus/pci/slots/3-1/address", "zz");
       },
       0},
      {"bytes that do not print, a large size and half a number",
       [&] {
         const std::string disk = sata + "/ata1/host0/target0:0:0/0:0:0:0";
         tree.Put(disk + "/model", std::string("a\0b\\#\n", 6) + std::string(1 << 20, '\xFE'));
         tree.Put(disk + "/block/sdb/size", "99999999999999999999999\n");
         tree.Put(sata + "/subsystem_vendor", "0x\n");
       },
       0},
      {"a firmware table of a megabyte", [&] { tree.Put("sys/firmware/dmi/tables/DMI", std::string(1 << 20, '\4')); },
       0},
  };
  for (const auto& [what, damage, lost] : kDamages) {
    std::filesystem::remove_all(tree.At("sys"));
    SetUp();
    damage();
    EXPECT_EQ(AskEverything(), whole - lost) << what;
  }
  std::filesystem::remove_all(tree.At("sys"));
  EXPECT_EQ(AskEverything(), 2U);  // the root and the host bridge
}

// Whatever machine this is: its own files may be of any shape.
TEST(SysfsOfThisMachineTest, EveryControllerOfTheRowsIsInTheTree) {
  ManagementError error;
  const auto connection = TheHost().management.Connect("ROOT\\CIMV2", error);
  ASSERT_NE(connection, nullptr);
  for (const char16_t* query : {u"SELECT * FROM Win32_IDEController", u"SELECT * FROM Win32_SCSIController",
                                u"SELECT * FROM Win32_DiskDrive"}) {
    const std::vector<ManagementRow> rows = connection->Query(query).value();
    for (const ManagementRow& row : rows) {
      const auto& id = std::get<ManagementScalar>(row.Find(u"PNPDeviceID")->content);
      EXPECT_NE(TheHost().deviceTree.Locate(Utf8FromWide(std::get<wstring>(id))), 0U);
    }
  }
}

}  // namespace
}  // namespace panelglow::platform::host_linux
