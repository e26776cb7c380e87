// The oldest boards on their machine, with the files that are installed for them: what is said of them is found, what
// is driven moves, and what was taken is given back.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fstream>
#include <sstream>

#include "board/BoardBench.h"
#include "board/OldestBoard.h"
#include "harness/base/Notices.h"
#include "hw/PciDeviceList.h"
#include "hw/SMBIOSDiscovery.h"

namespace panelglow {
namespace {

using ::testing::AllOf;
using ::testing::Ge;
using ::testing::HasSubstr;
using ::testing::Le;
using ::testing::Not;

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
};

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

// A board class that does the steps of a check in ways of its own.
class OwnWays : public MotherBoard {
 public:
  using MotherBoard::MotherBoard;
  int ReadZone(int /*zone*/) override { return 61; }
  int GetZoneHigh(int /*zone*/) override { return 60; }
  int GetZoneLow(int /*zone*/) override { return 62; }
  int ReadProchot(int /*zone*/) override { return 3; }
};

TEST(BoardClasses, ACheckIsMadeOfTheBoardsOwnSteps) {
  BoardBench bench;
  bench.SetFiles("[7D10]\nplatform=generic\nchips=ich\n",
                 "[7D10]\ntest.tempcaution.zone.1.name=Z\ntest.tempcaution.zone.1.prochot=yes\n", "");
  BoardBench::Board();
  OwnWays board("7D10");
  board.LoadZones();
  ZoneCheck check;
  EXPECT_TRUE(board.CheckZone(1, check));
  EXPECT_EQ(std::tuple(check.value, check.high, check.low, check.prochotStatus), std::tuple(61, true, true, 3));
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
  EXPECT_THAT(bench.machine.HardwareState(), AllOf(HasSubstr(" 5C=02 "), HasSubstr(" 30=60 ")));
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

// Line 9 of the board's GPIO word, wired to the network controller's pin: bit 11 of its register, driven with bit 19.
class WiredLine : public platform::sim::Device {
 public:
  explicit WiredLine(platform::sim::Buses& of) : buses(of) {}
  [[nodiscard]] std::vector<platform::sim::AddressRange> PortRanges() const override { return {{0xFA00, 2}}; }
  std::uint8_t ReadPort(std::uint16_t port) override {
    const bool isHigh = (buses.ReadMemory(0xFD0000B9) & 0x08) != 0 && (buses.ReadMemory(0xFD0000BA) & 0x08) != 0;
    return port == 0xFA01 && isHigh ? 0x02 : 0x00;
  }
  [[nodiscard]] std::optional<bool> Signal(std::string_view /*pin*/) const override { return std::nullopt; }
  [[nodiscard]] std::string State() const override { return ""; }

 private:
  platform::sim::Buses& buses;
};

// The network controller's pin is driven low and high, which the line is wired to or not.
TEST(OrchardDesktop, FindsTheCableOfItsNetworkController) {
  const std::string kNic = R"(
[[pci]]
bus = 2
registers = { "0" = 0x165914E4, "8" = 0x02000000, "18" = 0xFD000004, "1C" = 0, "2C" = 0x2A60103C }
description = "Broadcom NetXtreme Gigabit Ethernet #2"
)";
  const std::string kUnreachable = kNic + "[driver]\nrefused = [0x2200A8]\n";
  struct Case {
    const char* key;
    std::string hardware;
    bool isWired;  // to line 9
    const char* answer;
    const char* logged;
  };
  const Case kCases[] = {
      {"", kNic, false, "none", "----INI file has detection disabled (-1)"},
      {"DetectNICDashCableGPI=3\n", "", false, "none", "----DID NOT GET NIC BAR SUCCESSFULLY!"},
      {"DetectNICDashCableGPI=3\n", kUnreachable, false, "none",
       "----NIC Read  addr=0xFD0000B8, 32bit data=0x00000000, Bytes=0"},
      {"DetectNICDashCableGPI=16\n", kNic, false, "none", "  Orchard GPIO_ERROR !!!!!!!!!\n"},
      {"DetectNICDashCableGPI=3\n", kNic, false, "no", "----Failed to detect NIC Dash Cable is asserted (low)!"},
      {"DetectNICDashCableGPI=4\n", kNic, false, "no", "----Failed to detect NIC Dash Cable is de-asserted (high)!"},
      {"DetectNICDashCableGPI=8\n", kNic, true, "no", "----Reporting NIC Dash Cable is NOT installed!"},
      {"DetectNICDashCableGPI=9\n", kNic, true, "yes", "----Reporting NIC Dash Cable is installed."},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.key + c.hardware + c.logged);
    InstalledBench bench("orchard-desktop.toml", "2A60", c.hardware, c.key);
    if (c.isWired) {
      bench.machine.Hardware().Remove("gpio");
      bench.machine.Hardware().Attach("cable", std::make_unique<WiredLine>(bench.machine.Hardware()));
    }
    const auto board = MotherBoard::Instance(".\\mbdetect.ini");
    ASSERT_NE(board, nullptr);
    bool present = false;
    const bool done = board->DetectLegacyDevice(LegacyDevice::kNicDashCable, present);
    EXPECT_STREQ(!done ? "none" : present ? "yes" : "no", c.answer);
    EXPECT_THAT(bench.machine.Output(), HasSubstr(c.logged));
    if (done) {
      EXPECT_THAT(bench.machine.Output(), HasSubstr("NIC PCI address = 0x0200"));
      EXPECT_THAT(bench.machine.Output(), HasSubstr("----NIC Read  addr=0xFD0000B8, 32bit data=0x00000000, Bytes=4"));
      EXPECT_THAT(bench.machine.Output(), HasSubstr("----NIC WRITE addr=0xFD0000B8, 32bit data=0x00080800"));
    }
  }
}

// Zones are checked in parts, and a reading is counted once however often it is judged; what has no line or no port
// is not there, and that is no answer.
TEST(OldestBoards, ReadFansAndZonesOfTheMonitorByTheirFlatKeys) {
  constexpr const char* kMonitor = R"(
[[chip]]
name = "monitor"
kind = "indexed-registers"
base = 0x290
registers = { "20" = 0x02, "21" = 0xEE, "22" = 0x0F, "23" = 0xFF, "27" = 71, "96" = 0, "A3" = 9, "B3" = 9, "C3" = 9 }
)";
  const std::string kKeys =
      "MaximumFans=2 ; of three\nFan1Name=A\nFan1TachIndex=0x20\nFan1PWM=40\nFan2Name=B\nFan2TachIndex=0x22x\n"
      "Fan3Name=C\nMaxTempZones=2\nTSensor1Name=Y\nTSensor1Skip=Yes\nTSensor1Index=0x27\nTSensor1ThresholdHigh=60\n"
      "TSensor1ThresholdFix=70\nTSensor1ThresholdLow=72\nTSensor1ThresholdAdj=5\nTSensor2Name=Z\nTSensor2Index=39\n"
      "DetectCoilGPI=-1 ; none\nDetectPCIRiserGPI=16\n";
  for (const char* const id : {"A58", "2A78"}) {
    BoardBench bench(kMonitor);
    SMBIOSDiscovery::Instance().productText = id;
    const std::string section = "[" + std::string(id) + "]\nMotherboardClass=Lantern\n" + kKeys;
    bench.SetFiles(section, "", "");
    bool present = false;
    EXPECT_FALSE(MotherBoard::Instance(".\\mbdetect.ini")->DetectLegacyFan(1, present));
    EXPECT_THAT(bench.machine.Errors(), AllOf(HasSubstr("key \"SuperIOBaseAddr\": there is no port"),
                                              HasSubstr("key \"Fan2TachIndex\": \"0x22x\" counts as 0x22"),
                                              Not(HasSubstr("; ")), Not(HasSubstr("does not fit"))));
    bench.SetFiles(section + "SuperIOBaseAddr=0x290\nSuperIOBaseData=0x291\n", "", "");
    const auto made = MotherBoard::Instance(".\\mbdetect.ini");
    auto& board = dynamic_cast<OldestBoard&>(*made);
    EXPECT_TRUE(board.DetectLegacyFan(1, present) && present);
    EXPECT_TRUE(board.DetectLegacyFan(2, present) && !present);
    int rpm = 0;
    EXPECT_TRUE(board.ReadFan(1, rpm) && rpm == 2000);
    EXPECT_TRUE(board.SetLegacyFanPwm(1) && board.SetLegacyFanFull(2));
    EXPECT_THAT(bench.machine.HardwareState(), HasSubstr("96=FF A3=66 B3=FF C3=09"));
    EXPECT_FALSE(board.DetectLegacyDevice(LegacyDevice::kCoil, present));
    EXPECT_EQ(bench.machine.Output(), "");
    EXPECT_FALSE(board.DetectLegacyDevice(LegacyDevice::kPciRiser, present));
    EXPECT_EQ(bench.machine.Output(), "  Orchard GPIO_ERROR !!!!!!!!!\n");
    int value = 0;
    bool isBeyond = false;
    for (int round = 0; round < 2; ++round) {
      EXPECT_TRUE(board.ReadLegacyZone(1, value) && value == 71);
      EXPECT_TRUE(board.IsLegacyZoneHigh(1, isBeyond) && isBeyond && board.IsLegacyZoneHigh(1, isBeyond));
      EXPECT_TRUE(board.IsLegacyZoneLow(1, isBeyond) && isBeyond && board.IsLegacyZoneLow(1, isBeyond));
    }
    EXPECT_TRUE(board.ReadLegacyZone(2, value));
    EXPECT_FALSE(board.IsLegacyZoneHigh(2, isBeyond) || board.IsLegacyZoneLow(2, isBeyond));  // no limits
    std::vector<TempZone> zones;
    board.GetZones(zones);
    ASSERT_EQ(zones.size(), 2U);
    EXPECT_EQ(std::tuple(zones[0].consecutiveHigh, zones[0].consecutiveLow, zones[0].thresholdAdj),
              std::tuple(2, 2, 5));
    EXPECT_TRUE(board.IsZoneSkipped(1) && !board.IsZoneSkipped(2));
    EXPECT_TRUE(board.GetProbeRate(value) && value == 30);
    EXPECT_TRUE(board.GetRetriesOnInvalid(value) && value == 1);
  }
}

}  // namespace
}  // namespace panelglow
