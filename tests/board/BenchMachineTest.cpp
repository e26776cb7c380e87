// The machines that have all of it, with the files that are installed for them: what is said of them is found, what
// is driven moves, and what was taken is given back.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fstream>
#include <sstream>

#include "board/BoardBench.h"
#include "harness/base/Notices.h"
#include "hw/PciDeviceList.h"
#include "hw/SMBIOSDiscovery.h"

namespace panelglow {
namespace {

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::Ge;
using ::testing::HasSubstr;
using ::testing::Le;

std::string TextOf(const std::string& path) {
  const std::ifstream file(std::string(PANELGLOW_SOURCE_DIR) + "/" + path, std::ios::binary);
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

class InstalledBench : public BoardBench {
 public:
  // `systemId` as the machine's firmware has it, which a process asks once.
  InstalledBench(const std::string& name, const char* systemId, const std::string& more = "",
                 const std::string& flatKeys = "")
      : BoardBench(TextOf("machines/" + name) + more) {
    SMBIOSDiscovery::Instance().productText = systemId;
    Notices::Forget();
    PciDeviceList::Forget();
    SetFiles(TextOf("installation/mbdetect.ini") + flatKeys, TextOf("installation/mbtest.ini"),
             TextOf("installation/chip.ini"));
  }

  void Wait(std::uint32_t milliseconds) { platform::TheHost().clock.Sleep(milliseconds); }
};

std::string Found(MotherBoard& board, DeviceKind kind) {
  board.Detect(kind);
  std::string text;
  for (const DEVICE_INFO& device : board.GetDevices(kind)) {
    text += device.name + "=" + device.status + "; ";
  }
  return text;
}

std::string Plugged(MotherBoard& board) {
  board.DetectFans();
  std::vector<Fan> list;
  board.GetFans(list);
  std::string text;
  for (const Fan& fan : list) {
    text += fan.name + "=" + fan.detectionStatus + "; ";
  }
  return text;
}

TEST(BenchDesktop, TellsWhatItHas) {
  InstalledBench bench("bench-desktop.toml", "7CC0");
  const auto board = BoardBench::Board("7CC0");
  EXPECT_EQ(Found(*board, DeviceKind::kJumpers), "Password jumper=true; Boot block jumper=false; ");
  EXPECT_EQ(Found(*board, DeviceKind::kFrontPanel), "Front USB cable=true; Front audio cable=true; ");
  EXPECT_EQ(Found(*board, DeviceKind::kInternalSpeaker), "internal speaker=unknown; ");
  EXPECT_EQ(Found(*board, DeviceKind::kRiser), "");
  board->LoadFans();
  EXPECT_EQ(Plugged(*board), "Processor fan=true; Chassis fan=true; Rear fan=false; ");
  board->LoadHoodSwitch();
  board->LoadHoodLock();
  bool value = false;
  EXPECT_TRUE(board->ReadHoodSwitch(value) && value);
  EXPECT_TRUE(board->ReadHoodLatch(true, value) && value);  // open: cleared, it comes back
  EXPECT_TRUE(board->ReadHoodLock(value) && value);
  EXPECT_EQ(board->LockHood(), 1);
  EXPECT_EQ(board->GetChip("sio").ReadLine(12), Chip::kNotAsserted);
  EXPECT_EQ(board->UnlockHood(), 1);
  EXPECT_EQ(board->GetChip("sio").ReadLine(12), Chip::kAsserted);
  EXPECT_EQ(bench.machine.Errors(), "");
}

TEST(BenchDesktop, ButtonsAreSeenWhileTheyAreHeldAndRememberedBehindIt) {
  InstalledBench bench("bench-desktop.toml", "7CC0");
  const auto board = BoardBench::Board("7CC0");
  board->LoadButtons();
  const auto seen = [&](const char* name) {
    bool pressed = false;
    return board->GetButtonState(name, pressed) && pressed;
  };
  EXPECT_FALSE(seen("Info button") || seen("Power button"));
  bench.Wait(2500);
  EXPECT_TRUE(seen("Info button"));
  bench.Wait(2000);
  EXPECT_FALSE(seen("Info button"));
  EXPECT_TRUE(seen("Power button"));
  EXPECT_FALSE(seen("Power button"));  // the first look has cleared it
}

// A whole fan test: speeds follow the duty in their time, temperatures the fans, and all is given back.
TEST(BenchDesktop, FansFollowTheirDutyAndTemperaturesTheFans) {
  InstalledBench bench("bench-desktop.toml", "7CC0");
  const auto board = BoardBench::Board("7CC0");
  board->LoadFans();
  board->LoadZones();
  EXPECT_TRUE(board->LoadFanGroups() && board->LoadZoneGroups());
  const int warm = board->ReadZone(1);
  board->ReadAllFans();
  board->SaveFanStates();
  board->SetManualFanMode(true);
  board->SetActiveReadingSet(1);
  board->SetAllFansFull();
  board->ReadOneFan(1);
  int early = 0;
  board->GetFanReading(1, FanReading::kFull, early);
  board->WaitForFans();
  board->ReadAllFans();
  bench.Wait(20'000);
  EXPECT_LT(board->ReadZone(1), warm - 5);
  board->SetActiveReadingSet(2);
  board->SetAllFansPwm();
  board->WaitForFans();
  board->ReadAllFans();
  board->SetManualFanMode(false);
  Fan fan;
  EXPECT_TRUE(board->GetFanRecord(1, fan));
  EXPECT_THAT(fan.readings,
              ElementsAre(AllOf(Ge(1600), Le(1800)), AllOf(Ge(3500), Le(3700)), AllOf(Ge(2800), Le(3000))));
  EXPECT_LT(early, 2000);  // it had no time yet
  std::string log;
  board->WriteFanLog([&](const std::string& line) { log += line + "\n"; }, "All");
  EXPECT_THAT(log, HasSubstr("NominalErr=NoErr\n"));
  EXPECT_THAT(log, ::testing::Not(HasSubstr("Min\n")));
  bench.Wait(60'000);
  board->ReadOneFan(1);
  board->GetFanRecord(1, fan);
  EXPECT_THAT(fan.readings[2], AllOf(Ge(1600), Le(1800)));  // the part has it again
  EXPECT_THAT(bench.machine.HardwareState(), HasSubstr(" 96=15"));
}

TEST(BenchDesktop, ZonesAreReadOfTheMonitorAndOfEachCore) {
  InstalledBench bench("bench-desktop.toml", "7CC0");
  const auto board = BoardBench::Board("7CC0");
  board->LoadZones();
  int count = 0;
  EXPECT_TRUE(board->GetZoneCount(count));
  ASSERT_EQ(count, 3);
  ZoneCheck check;
  EXPECT_TRUE(board->CheckZone(1, check));
  EXPECT_THAT(check.value, AllOf(Ge(40), Le(60)));
  EXPECT_FALSE(check.high || check.low);
  EXPECT_TRUE(board->CheckZone(2, check));
  EXPECT_EQ(check.value, 49);  // 42 and 57
  std::vector<TempZone> zones;
  board->GetZones(zones);
  EXPECT_THAT(zones[1].coreReadings, ElementsAre(42, 57));
  EXPECT_EQ(zones[1].thresholdHigh, 90);
  EXPECT_EQ(zones[1].coreHigh, 95);
}

// A board class with a hardware monitor of its own does not ask the files for it.
TEST(BoardClasses, APresetMonitorServesTheZonesThatNameNone) {
  const std::pair<const char*, const char*> kClasses[] = {{"mistral", "ite a"}, {"cobble", "adt a"}};
  for (const auto& [name, chips] : kClasses) {
    BoardBench bench;
    bench.SetFiles(std::string("[7D10]\nplatform=") + name + "\n",
                   "[7D10]\ntest.tempcaution.chip=adt\ntest.tempcaution.zone.1.name=Y\n"
                   "test.tempcaution.zone.2.name=Z\ntest.tempcaution.zone.2.chip=a\n",
                   "");
    const auto board = BoardBench::Board();
    board->LoadZones();
    std::vector<TempZone> zones;
    board->GetZones(zones);
    ASSERT_EQ(zones.size(), 2U);
    EXPECT_EQ(zones[0].chip + " " + zones[1].chip, chips);
  }
}

TEST(OrchardDesktop, ReadsAllByItsFlatKeys) {
  InstalledBench bench("orchard-desktop.toml", "2A60");
  const auto board = MotherBoard::Instance(".\\mbdetect.ini");
  ASSERT_NE(board, nullptr);
  EXPECT_EQ(Plugged(*board), "Processor fan=true; Chassis fan=true; ");
  int rpm = 0;
  EXPECT_TRUE(board->ReadFan(1, rpm));
  EXPECT_THAT(rpm, AllOf(Ge(1150), Le(1200)));  // 100 of 255
  EXPECT_TRUE(board->SaveLegacyFanState() && board->SetLegacyFanFull(1));
  board->WaitForFans();
  EXPECT_TRUE(board->ReadFan(1, rpm));
  EXPECT_THAT(rpm, AllOf(Ge(2990), Le(3010)));
  EXPECT_TRUE(board->SetLegacyFanPwm(1));
  board->WaitForFans();
  EXPECT_TRUE(board->ReadFan(1, rpm));
  EXPECT_THAT(rpm, AllOf(Ge(2350), Le(2450)));
  EXPECT_THAT(bench.machine.HardwareState(), HasSubstr(" 5C=E2 "));
  EXPECT_TRUE(board->RestoreLegacyFanState());
  EXPECT_THAT(bench.machine.HardwareState(), HasSubstr(" 5C=02 "));
  bool present = false;
  using enum LegacyDevice;
  EXPECT_TRUE(board->DetectLegacyDevice(kBootBlockJumper, present) && present);
  EXPECT_TRUE(board->DetectLegacyDevice(kPasswordJumper, present) && !present);
  EXPECT_TRUE(board->DetectLegacyDevice(kHoodSwitchCable, present) && present);
  EXPECT_FALSE(board->DetectLegacyDevice(kCoil, present));  // has no key
  ZoneCheck check;
  EXPECT_TRUE(board->CheckZone(1, check));
  EXPECT_FALSE(check.high);
  for (const int none : {0, 3, -1}) {
    EXPECT_FALSE(board->ReadFan(none, rpm) || board->SetLegacyFanFull(none) || board->SetLegacyFanPwm(none) ||
                 board->DetectLegacyFan(none, present));
  }
}

// The network controller's pin is driven low and high, which the line is wired to or not.
TEST(OrchardDesktop, FindsTheCableOfItsNetworkController) {
  constexpr const char* kNic = R"(
[[pci]]
bus = 2
registers = { "0" = 0x165914E4, "8" = 0x02000000, "18" = 0xFD000004, "1C" = 0, "2C" = 0x2A60103C }
description = "Broadcom NetXtreme Gigabit Ethernet #2"
[[chip]]
name = "nic"
kind = "memory-registers"
base = 0xFD0000B8
initial = [0, 0, 0, 0]
)";
  struct Case {
    const char* key;
    bool done;
    const char* logged;
  };
  const Case kCases[] = {
      {"", false, "----INI file has detection disabled (-1)"},
      {"DetectNICDashCableGPI=3\n", true, "----Failed to detect NIC Dash Cable is asserted (low)!"},
      {"DetectNICDashCableGPI=4\n", true, "----Failed to detect NIC Dash Cable is de-asserted (high)!"},
      {"DetectNICDashCableGPI=16\n", true, "----Reporting NIC Dash Cable is NOT installed!"},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.key);
    InstalledBench bench("orchard-desktop.toml", "2A60", kNic, c.key);
    const auto board = MotherBoard::Instance(".\\mbdetect.ini");
    ASSERT_NE(board, nullptr);
    bool present = true;
    EXPECT_EQ(board->DetectLegacyDevice(LegacyDevice::kNicDashCable, present), c.done);
    EXPECT_EQ(present, !c.done);
    EXPECT_THAT(bench.machine.Output(), HasSubstr(c.logged));
    if (c.done) {
      EXPECT_THAT(bench.machine.Output(), HasSubstr("NIC PCI address = 0x0200"));
      EXPECT_THAT(bench.machine.Output(), HasSubstr("----NIC Read  addr=0xFD0000B8, 32bit data=0x00000000, Bytes=4"));
      EXPECT_THAT(bench.machine.Output(), HasSubstr("----NIC WRITE addr=0xFD0000B8, 32bit data=0x00080800"));
    }
  }
  InstalledBench bench("orchard-desktop.toml", "2A60", "", "DetectNICDashCableGPI=3\nDetectCoilGPI=16\n");
  const auto board = MotherBoard::Instance(".\\mbdetect.ini");
  bool present = false;
  EXPECT_FALSE(board->DetectLegacyDevice(LegacyDevice::kNicDashCable, present));
  EXPECT_THAT(bench.machine.Output(), HasSubstr("----DID NOT GET NIC BAR SUCCESSFULLY!"));
  EXPECT_FALSE(board->DetectLegacyDevice(LegacyDevice::kCoil, present));
  EXPECT_THAT(bench.machine.Output(), HasSubstr("  Orchard GPIO_ERROR !!!!!!!!!\n"));
}

}  // namespace
}  // namespace panelglow
