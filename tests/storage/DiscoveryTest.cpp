// Which controllers a machine has, their SCSI ports, the questions that are asked for it, and the drives that a test
// takes of them.
#include <gmock/gmock.h>

#include <algorithm>
#include <cstdio>
#include <list>
#include <memory>

#include "ledtests/DriveSelection.h"
#include "storage/MSUtils.h"
#include "storage/StandIn.h"

namespace panelglow::storagetest {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;

using Texts = std::vector<std::string>;

constexpr const char* kFirst = R"(PCI\VEN_8086&DEV_2922&SUBSYS_12345678&REV_02\3&11583659&0&FA)";
constexpr const char* kSecond = R"(PCI\VEN_8086&DEV_2922&SUBSYS_12345678&REV_02\3&11583659&0&FB)";
constexpr const char* kCard = R"(SD\VID_15&OID_5344&PID_SD32G1\4&1)";

std::string Controller(const std::string& name, const std::string& id, const std::string& more = {}) {
  return "[[controller]]\nname = \"" + name + "\"\nid = '" + id + "'\n" + more + "\n";
}

std::string Disk(const std::string& controller, const std::string& id, const std::string& more = {}) {
  return "[[disk]]\nname = '" + id + "'\ncontroller = \"" + controller + "\"\nid = 'IDE\\" + id + "'\n" + more + "\n";
}

// Two IDE-type controllers with equal ids, of one driver that has the ports 1 and 4; a SCSI-type one with a driver
// that it shares with a card reader, and one that no list knows.
const std::string kMachine =
    Controller("second", kSecond,
               "driver = \"storahci\"\nscsi_ports = [4]\ndescription = \"Second\"\nui_number = 9") +
    Controller("first", kFirst, "driver = \"storahci\"\nscsi_ports = [1]\ndescription = \"First\"") +
    Controller("net", R"(PCI\VEN_1111&DEV_2222&SUBSYS_33334444&REV_00\3&1&0&10)", "class = 0x020000") +
    Controller("sas", R"(PCI\VEN_1000&DEV_0072&SUBSYS_30201000&REV_03\3&1&0&08)",
               "kind = \"scsi\"\ndriver = \"StorSAS\"\nscsi_ports = [0]") +
    Controller("root", R"(ROOT\SPACEPORT\0)", "kind = \"scsi\"") +
    Controller("card", kCard, "kind = \"scsi\"\ndriver = \"sdbus\"");

constexpr const char* kIni =
    "[SATA CONTROLLERS]\n0x8086,0x2922,0x5678,0x1234,wind,onboard\n"
    "[SAS CONTROLLERS]\n0x1000,0x72,0x1000,0x3020,wmi,sas-card\n"
    "[NON VOLATILE STORAGE CONTROLLERS]\n0x15,0x5344,SD32G,wmi,card\n";

// "index kind name port ui description" of each, ids by their ends.
Texts Discover(const std::string& ini) {
  std::list<HDD_CTRL_INFO> found;
  MSUtils::DiscoverInfoListIDEController(ini, &WMIDiscovery::Instance(), found);
  MSUtils::DiscoverInfoListSCSIController(ini, &WMIDiscovery::Instance(), found);
  Texts texts;
  for (const HDD_CTRL_INFO& c : found) {
    texts.push_back(std::to_string(c.controllerIndex) + " " + std::to_string(c.interfaceKind) + " " + c.name + " " +
                    std::to_string(c.scsiPort) + " " + std::to_string(c.uiNumber) + " " + c.description + " " +
                    c.pnpDeviceId.substr(c.pnpDeviceId.size() - 2));
  }
  return texts;
}

TEST(Discovery, FindsTheControllersThatAreKnownOrMassStorage) {
  Machine machine(kMachine, kIni);
  // Of kind 8 the port is left as it stands. The card's section is not loaded: something is known already.
  EXPECT_THAT(Discover("msctrl.ini"), ElementsAre("0 3 onboard 1 9 Second FB", "1 3 onboard 4 0 First FA",
                                                  "2 8 sas-card -1 0 Storage controller 08"));
  // Once more in the same process: no port is given out twice, and the index goes on.
  EXPECT_THAT(Discover("msctrl.ini"), ElementsAre("3 3 onboard -1 9 Second FB", "4 3 onboard -1 0 First FA",
                                                  "5 8 sas-card -1 0 Storage controller 08"));
}

TEST(Discovery, WithoutAFileGoesByTheInventoryAloneAndEachMachineOfAProcessHasItsOwn) {
  {
    Machine machine(kMachine, kIni);
    EXPECT_THAT(Discover(""),
                ElementsAre("0 2  1 9 Second FB", "1 2  4 0 First FA", "2 2  0 0 Storage controller 08"));
  }
  Machine machine(Controller("other", R"(PCI\VEN_0001&DEV_0002&SUBSYS_00000000&REV_00\3&1&0&08)"));
  EXPECT_THAT(Discover(""), ElementsAre("0 2  -1 0 Storage controller 08"));
}

TEST(Discovery, LoadsWhatItsFirstControllerNeeds) {
  Machine machine(
      Controller("card", kCard, "kind = \"scsi\"") +
          Controller("sas", R"(PCI\VEN_1000&DEV_0072&SUBSYS_30201000&REV_03\3&1&0&08)", "kind = \"scsi\""),
      kIni);
  EXPECT_THAT(Discover("msctrl.ini"),
              ElementsAre("0 8 card -1 0 Storage controller &1", "1 2  -1 0 Storage controller 08"));
}

TEST(Discovery, LooksControllersUpByTheirIds) {
  Machine machine(kMachine, kIni);
  const HDD_CTRL_INFO* unlisted = MSUtils::AddUnlistedController(0x8086, 0x2922, 0x1234, 0x5678);
  ASSERT_NE(unlisted, nullptr);
  EXPECT_TRUE(unlisted->sataFlag && unlisted->name.empty() && unlisted->interfaceKind == 2);
  EXPECT_EQ(MSUtils::AddUnlistedController(0x1111, 0x2222, 0x3333, 0x4444), nullptr);  // no mass storage
  EXPECT_EQ(MSUtils::AddUnlistedController(0x8086, 0x2922, 0x5678, 0x1234), nullptr);  // no such function
  EXPECT_EQ(MSUtils::LookupController(0x8086, 0x2922, 0x1234, 0x5678, "msctrl.ini"), unlisted);
  EXPECT_EQ(MSUtils::LookupNvsController(0x8086, 0x2922, "whatever", "msctrl.ini"), unlisted);
  EXPECT_EQ(machine.ContentOf("C:\\bench\\tmpmsctrl.ini"), "none");  // something was known, so nothing was loaded
}

TEST(Discovery, TakesIdsApartAtFixedPlaces) {
  struct Case {
    const char* id;
    bool isTaken;
    std::uint32_t vendor = 0;
    std::uint32_t device = 0;
  };
  const Case kCases[] = {
      {R"(sd\VID_15&OID_5344&PID_SD32G1)", true, 0x15, 0x5344},
      {R"(SD\VID_1234567&OID_5344&PID_SD32G1)", true, 0x1234567, 0x5344},
      {R"(SD\VID_123456789&OID_5344)", true, 0xFFFFFFFF, 0x5344},  // more than 32 bits
      {R"(SD\X&)", true},
      {R"(SD\no-separator)", true, 0xE},
      {R"(SD\VID_zz&OID_12)", true, 0, 0x12},
      {R"(pci\VEN_8086&DEV_2922)", true, 0x8086, 0x2922},
      {R"(PCI\VEN_80&DEV_2922&S)", true, 0x80, 0x22},
      {R"(PCI\)", true},
      {R"(SE\VID_15&OID_5344)", false},
      {"PCI", false},
      {"", false},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.id);
    Machine machine(
        std::string("[[management]]\nclass = \"Win32_SCSIController\"\n[[management.row]]\nPNPDeviceID = '") + c.id +
        "'\n");
    CTRL_INFO known;  // the numbers are seen by the record that is known under them
    known.vendorId = c.vendor;
    known.deviceId = c.device;
    MSUtils::CopyControllerListInfo({known});
    EXPECT_EQ(Discover("msctrl.ini").size(), c.isTaken ? 1U : 0U);
  }
}

// ---- SCSI ports

TEST(ScsiPorts, AreGivenOutOnceInRisingOrderByTheBeginningOfTheDriversName) {
  std::string ports;
  for (const char* port : {"7", "2", "5"}) {
    ports += Controller(std::string("c") + port, std::string("X\\") + port,
                        std::string("driver = \"StorAHCI\"\nscsi_ports = [") + port + "]");
  }
  const std::string longName(80, 'd');
  Machine machine(ports + Controller("l", "X\\l", "driver = \"" + longName + "\"\nscsi_ports = [3]"));
  MSUtils::UsedScsiPorts used;
  Texts given;
  for (const char* driver :
       {"storahci", "stor", "storahci", "storahci", "storahci", "STORAHCI", "storahcix", "nobody"}) {
    given.push_back(std::to_string(MSUtils::FindScsiPort(driver, used)));
  }
  EXPECT_THAT(given, ElementsAre("2", "2", "5", "7", "-1", "2", "-1", "-1"));
  EXPECT_EQ(MSUtils::FindScsiPort(longName, used), 3);
  Machine empty;
  EXPECT_EQ(MSUtils::FindScsiPort("", used), -1);
}

TEST(ScsiPorts, AreEight) {
  Machine machine(Controller("c", "X\\1", "driver = \"d\"\nscsi_ports = [0, 1, 2, 3, 4, 5, 6, 7]"));
  MSUtils::UsedScsiPorts used;
  for (int port = 0; port < 8; ++port) {
    EXPECT_EQ(MSUtils::FindScsiPort("d", used), port);
  }
  EXPECT_EQ(MSUtils::FindScsiPort("d", used), -1);
}

// ---- the questions

class NotedManagement : public platform::Management {
 public:
  NotedManagement(platform::Management& own, Texts& notes) : own_(own), notes_(notes) {}
  std::unique_ptr<platform::ManagementConnection> Connect(std::string_view name,
                                                          platform::ManagementError& error) override {
    notes_.push_back("connect " + std::string(name));
    return std::make_unique<Connection>(own_.Connect(name, error), notes_);
  }

 private:
  struct Connection : platform::ManagementConnection {
    Connection(std::unique_ptr<platform::ManagementConnection> connection, Texts& allNotes)
        : own(std::move(connection)), notes(allNotes) {}
    std::optional<std::vector<platform::ManagementRow>> Query(std::u16string_view query) override {
      notes.emplace_back(query.begin(), query.end());
      return own->Query(query);
    }
    platform::ManagementCallResult Call(const platform::ManagementCall& call) override { return own->Call(call); }
    std::unique_ptr<platform::ManagementConnection> own;
    Texts& notes;
  };
  platform::Management& own_;
  Texts& notes_;
};

// Every question to the management service that a discovery and the look-up of a drive put.
Texts Asked(const std::string& description, const std::string& ini, const std::string& disk) {
  Machine machine(description, ini);
  Texts asked;
  NotedManagement management(machine.sim.TheMachine().management, asked);
  machine.Use({.management = &management});
  Discover("msctrl.ini");
  MSUtils::GetDriveHandleStrUsingDevInstId(disk);
  return asked;
}

TEST(Discovery, AsksTheseQuestionsInThisOrder) {
  const std::string ide = Controller("ide", kFirst, "driver = \"storahci\"\nscsi_ports = [1]");
  const std::string card = Controller("card", kCard, "kind = \"scsi\"");
  const std::string sas = Controller("sas", R"(PCI\VEN_1000&DEV_0072&SUBSYS_30201000&REV_03\3&1&0&08)",
                                     "kind = \"scsi\"\nscsi_ports = [0]\ndriver = \"" + std::string(40, 'd') + "\"");
  const std::string lists =
      "[SATA CONTROLLERS]\n0x8086,0x2922,0x5678,0x1234,wind,a\n[SAS CONTROLLERS]\n0x1000,0x72,0x1000,0x3020,scsi,b\n"
      "[NON VOLATILE STORAGE CONTROLLERS]\n1,2,x,scsi,y\n0x15,0x5344,SD32G,wmi,c\n";
  const std::string drive = R"(SELECT * FROM Win32_DiskDrive where PNPDeviceID='IDE\\DISK\\5&1')";
  EXPECT_THAT(
      Asked(ide + card + sas, lists, R"(IDE\DISK\5&1)"),
      ElementsAre(
          "connect ROOT\\CIMV2", "SELECT * FROM Win32_IDEController",
          R"(ASSOCIATORS OF {Win32_PnPEntity.DeviceID="PCI\\VEN_8086&DEV_2922&SUBSYS_12345678&REV_02\\3&11583659&0&FA"} WHERE ResultClass=Win32_SystemDriver)",
          "SELECT * FROM Win32_SCSIController", drive));
  // A card that comes first has the list of its kind loaded, which asks for each line of the interface "wmi".
  EXPECT_THAT(Asked(card, lists, R"(IDE\DISK\5&1)"),
              ElementsAre("connect ROOT\\CIMV2", "SELECT * FROM Win32_IDEController",
                          "SELECT * FROM Win32_SCSIController", "SELECT * FROM Win32_SCSIController", drive));
}

TEST(Discovery, TakesTheLastDriveOfAnId) {
  Machine machine(
      "[[management]]\nclass = \"Win32_DiskDrive\"\n[[management.row]]\nPNPDeviceID = 'a\\b'\nDeviceID = \"one\"\n"
      "[[management.row]]\nPNPDeviceID = 'a\\b'\nDeviceID = \"two\"\n[[management.row]]\nPNPDeviceID = 'c'\n");
  EXPECT_EQ(MSUtils::GetDriveHandleStrUsingDevInstId("a\\b"), "two");
  EXPECT_EQ(MSUtils::GetDriveHandleStrUsingDevInstId("c"), "");
  EXPECT_EQ(MSUtils::GetDriveHandleStrUsingDevInstId("d"), "");
  EXPECT_EQ(WMIDiscovery::Instance().RowCount(u"HDDs"), 0);
}

// ---- the selection of drives

TEST(DriveSelection, TakesControllersWithADiskByNameAllOrAny) {
  const std::string machine = kMachine + Disk("first", "CD", "interface_path = \"\"") + Disk("first", "D1") +
                              Disk("second", "CD2", "interface_path = \"\"") + Disk("sas", "D2");
  const std::string sas = R"(PCI\VEN_1000&DEV_0072&SUBSYS_30201000&REV_03\3&1&0&08)";
  const std::string name(127, 'n');
  struct Case {
    std::string selection;
    Texts found;
    bool anyIsOne = false;
    std::string sasName = "sas-card";
  };
  const Case kCases[] = {
      {"all", {kFirst, sas}},
      {"any", {kFirst}, true},
      {"any", {}},  // is a name where nothing else is said
      {"sas-card", {sas}},
      {"sas-card,onboard,sas-card,nobody", {kFirst, sas, sas}},
      {"SAS-CARD, onboard", {}},  // exactly
      {"", {}},
      {name, {sas}, false, name},
      {name, {sas}, false, name + "cut off"},
      {name + "n", {sas}, false, name},
      {name.substr(1), {}, false, name},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.selection);
    Machine host(machine,
                 "[SATA CONTROLLERS]\n0x8086,0x2922,0x5678,0x1234,wind,onboard\n"
                 "[SAS CONTROLLERS]\n0x1000,0x72,0x1000,0x3020,scsi," +
                     c.sasName + "\n");
    EXPECT_EQ(getCntrlListForHDD(c.selection, "msctrl.ini", c.anyIsOne), c.found);
  }
  Machine host(machine, kIni);
  EXPECT_EQ(FindControllerDetails(0x8086, 0x2922, 0x1234, 0x5678, "msctrl.ini"), "onboard");
  EXPECT_EQ(FindControllerDetails(0x8086, 0x2922, 0x5678, 0x1234, "msctrl.ini"), "");
  EXPECT_EQ(FindControllerDetails(0x8086, 0x2922, 0x1234, 0x5678, ""), "");
}

// The file is read once for all of them; what a reading writes to the log is written for each.
TEST(DriveSelection, ReadsTheNamesOnceForAllControllers) {
  std::string machine;
  std::string sata = "[SATA CONTROLLERS]\n";
  for (int i = 0; i < 20; ++i) {
    char id[64];
    std::snprintf(id, sizeof id, R"(PCI\VEN_0001&DEV_%04X&SUBSYS_00000000&REV_00\3&1&0&%02X)", i, i);
    machine += Controller("c" + std::to_string(i), id) + Disk("c" + std::to_string(i), "D" + std::to_string(i));
    sata += "1," + std::to_string(i) + ",0,0," + (i == 7 ? "stor" : "scsi") + ",name" + std::to_string(i % 3) + "\n";
  }
  Machine host(machine, sata + "[SAS CONTROLLERS]\n0,0,0,0,scsi,x\n");
  EXPECT_EQ(getCntrlListForHDD("name1,name1", "msctrl.ini", false).size(), 14U);
  const std::string log = host.sim.Output();
  EXPECT_EQ(static_cast<int>(std::count(log.begin(), log.end(), '\n')), 21);
  EXPECT_THAT(log, HasSubstr("Could not find storelib.dll"));
}

TEST(DriveSelection, EndsOnATreeWithACircleAndOnOneWithVeryManyChildren) {
  Machine machine;
  Tree tree;
  machine.Use({.tree = &tree});
  const auto controller = tree.Add(0, {.id = "C"});
  const auto first = tree.Add(controller, {.id = "A"});
  const auto second = tree.Add(controller, {.id = "B"});
  for (const auto next : {first, second, controller}) {
    tree.At(second).sibling = next;
    EXPECT_EQ(FindDiskOf("C"), "");
  }
  tree.At(controller).child = controller;  // its own child
  EXPECT_EQ(FindDiskOf("C"), "");
  const auto wide = tree.Add(0, {.id = "W"});
  for (int i = 0; i < 100'000; ++i) {
    tree.Add(wide, {.id = "W\\" + std::to_string(i)});
  }
  tree.devices.back().diskPath = "disk";
  EXPECT_EQ(FindDiskOf("W"), "W\\99999");
}

}  // namespace
}  // namespace panelglow::storagetest
