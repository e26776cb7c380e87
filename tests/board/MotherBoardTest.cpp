// Which board the INI files make of a machine, whose chip serves an LED, and the lock that a board is.
#include "board/MotherBoard.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <set>

#include "board/BoardBench.h"
#include "board/base/SelectedSystem.h"
#include "board/base/mblib_exception.h"
#include "harness/base/CDMException.h"
#include "harness/base/Notices.h"
#include "hw/SMBIOSDiscovery.h"
#include "platform/Host.h"

namespace panelglow {
namespace {

constexpr const char* kLock = "_HalcyonMotherBoardLib";

TEST(ChipTable, EveryNameIsUniqueAndLeadsToItsOwnPlace) {
  std::set<std::string_view> names;
  std::set<std::size_t> places;
  for (const ChipRow& row : ChipRows()) {
    EXPECT_TRUE(names.insert(row.name).second) << row.name;
    EXPECT_EQ(ChipPlaceOf(row.name), row.place) << row.name;
    places.insert(row.place);
    BoardBench bench;
    bench.SetFiles("[Common]\nchip.codec.hdabar=0xFE5C0000\n", "", "");
    IniReader::Instance("7D10", ".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini");
    EXPECT_EQ(row.make()->GetName(), row.name);
  }
  EXPECT_EQ(places.size(), kChipPlaces);
  EXPECT_EQ(*places.rbegin(), kChipPlaces);
  const std::pair<const char*, std::size_t> kPlaces[] = {
      {"", 1},          {"none", 1},      {"G_sio", 1},  {"ich ", 1},  {"ich", 18},         {"intelc200", 19},
      {"g_it8702", 39}, {"g_fintek", 39}, {"g_sio", 39}, {"g_ec", 40}, {"g_ec_it8519", 40}, {"g_codec", 46}};
  for (const auto& [name, place] : kPlaces) {
    EXPECT_EQ(ChipPlaceOf(name), place) << name;
  }
}

TEST(ChipTable, OfTheNamesThatShareAPlaceOneIsBuilt) {
  BoardBench bench;
  const std::string settings =
      "chip.codec.hdabar=0xFE5C0000\nchip.g_ec.ec.set_pwm.cmd=1\nchip.g_ec_it8519.ec.set_pwm.cmd=1\n";
  const std::pair<const char*, const char*> kLists[] = {
      {"g_sio g_ite g_it8702 g_fintek g_ec", "g_fintek g_ec"},
      {"g_sio g_ite g_it8702 g_ec g_ec_it8519", "g_it8702 g_ec_it8519"},
      {"g_sio g_ite", "g_ite none"},
      {"g_sio", "g_sio none"},
      {"", "g_sio g_ec"}};
  for (const auto& [list, built] : kLists) {
    bench.SetFiles("[7D10]\nplatform=generic\n" + settings + "chips=" + list + "\n", "", "");
    const std::unique_ptr<MotherBoard> board = BoardBench::Board();
    EXPECT_EQ(board->GetChip("g_sio").GetName() + " " + board->GetChip("g_ec").GetName(), built) << list;
  }
}

TEST(MotherBoard, TheInitialDataSelectTheClassOrNone) {
  struct Case {
    const char* product;  // of the firmware
    const char* detect;
    const char* board;  // class, system id, chips; or "none"
  };
  const Case kCases[] = {
      {"7D10", "[7D10]\nplatform=Generic\nchip.codec.hdabar=0xFE5C0000\n",
       "generic 32016 g_iospace g_memoryspace"},  // no list: every class
      {"7D10", "[7D10]\nplatform=undef\nchips=, g_IOSPACE ,g_siox,unknown\n", "generic 32016 g_iospace none"},
      {"7D1X", "[7D1X]\nchips=g_memoryspacex\n", "generic 2001 none none"},
      {"7D10", "[7D10]\nchips=undef\nchip.codec.hdabar=0xFE5C0000\n", "generic 32016 g_iospace g_memoryspace"},
      {"7D10", "[7D10]\nplatform=generic ; note\nchips=g_iospace\n", "none"},
      {"7D10", "[7D10]\nplatform=legacy\nchips=g_iospace\n", "none"},
      {"7D10", "[7D10]\nMotherboardClass=Any\nchips=g_iospace\n", "none"},
      {"7D10", "[7D10]\nMotherboardClass=undef\nchips=g_iospace\n", "none"},
      {"7D10", "[7D10]\nplatform=generic\nMotherboardClass=Any\nchips=g_iospace\n", "generic 32016 g_iospace none"},
      {"7D10", "[7D11]\nchips=g_iospace\n", "none"},
      {"0AC8", "[0AC8]\nchips=g_iospace\n", "none"},
      {"A08", "[A08]\nchips=g_iospace\n", "none"},
      {"0aC8", "[0AC8]\nchips=g_iospace\n", "generic 2760 g_iospace none"},
      {"0AC8", "[0AC8]\nplatform=generic\nchips=g_iospace\n", "generic 2760 g_iospace none"},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.product + std::string("\n") + c.detect);
    BoardBench bench;
    bench.SetFiles(c.detect, "", "");
    SMBIOSDiscovery::Instance().productText = c.product;
    const std::unique_ptr<MotherBoard> board = BoardBench::Board("");
    EXPECT_EQ(board == nullptr
                  ? "none"
                  : board->GetClassName() + " " + std::to_string(board->GetSystemId()) + " " +
                        board->GetChip("g_iospace").GetName() + " " + board->GetChip("g_memoryspace").GetName(),
              c.board);
    EXPECT_EQ(bench.machine.IsMutexOwned(kLock), board != nullptr);
  }
}

TEST(MotherBoard, ALedIsServedByTheChipThatTheFilesName) {
  BoardBench bench("chip = [{name = \"p\", kind = \"gpio-block\", base = 0xA20, outputs = 0x0F}]\n");
  const std::string board = "[7D10]\nplatform=generic\nchips=g_iospace\n";
  const std::string chip = "[g_iospace]\nwirelessled.assert.sequence=0xA20:1\nhdled.red.assert.sequence=0xA20:2\n";
  const auto lit = [&](const std::string& settings) {
    bench.SetFiles(board, "[7D10]\n" + settings, chip);
    const std::unique_ptr<MotherBoard> made = BoardBench::Board();
    const bool wireless = made->AssertWirelessLed();
    bench.SetFiles(board, "", chip);  // the chip that was found stays
    return std::string(wireless && made->AssertWirelessLed() ? "wireless " : "") +
           (made->AssertHdLedRed() ? "drive" : "");
  };
  EXPECT_EQ(lit(""), "");
  EXPECT_EQ(lit("test.wirelessled.chip=G_IOSPACE\ntest.hdled.chip=none\n"), "wireless ");
}

TEST(MotherBoard, TheSmallClassesHaveTheirOwnChipsAndPowerLed) {
  struct Case {
    const char* platform;
    const char* systemId;
    const char* name;
    std::vector<const char*> chips;
    const char* ledChip;     // that the power LED asks, whatever the files say
    const char* buttonChip;  // ... and the power button
    const char* zoneChip;    // ... and a zone without one
  };
  BoardBench bench;
  for (const Case& c : {Case{"ich_win", "7D10", "Ich_win", {"win_wpcd376", "ich"}, "win_wpcd376", "ich", "ich"},
                        Case{"SB7sch5", "7D10", "SB7sch5", {"sio", "sbx"}, "sio", "ich", "ich"},
                        Case{"mistral", "7D10", "Thicket", {"ich", "ite", "acpi"}, "ite", "ich", "ite"},
                        Case{"cobble", "7D10", "Cobble", {"adt", "acpi", "ich", "sio"}, "ich", "ich", "ich"},
                        Case{"cbb", "0B1C", "CBB", {"fin"}, "fin", "fin", "ich"},
                        Case{"cbb", "B38", "CBB", {"fin"}, "fin", "fin", "ich"},
                        Case{"cbb", "0B34", "CBB", {"win"}, "win", "win", "ich"},
                        Case{"cbb", "0B44", "CBB", {"win_w83202g"}, "win_w83202g", "win_w83202g", "ich"},
                        Case{"cbb", "7D10", "CBB", {}, "ich", "ich", "ich"}}) {
    SCOPED_TRACE(c.platform + std::string(" ") + c.systemId);
    SMBIOSDiscovery::Instance().productText = c.systemId;
    bench.SetFiles(std::string("[Common]\nplatform=") + c.platform + "\nchips=g_iospace\n",
                   "[Common]\ntest.powerled.chip=ich\ntest.powerbutton.chip=ich\ntest.tempcaution.chip=ich\n"
                   "test.tempcaution.zone.1.name=x\n",
                   "");
    const std::unique_ptr<MotherBoard> board = BoardBench::Board(c.systemId);
    ASSERT_NE(board, nullptr);
    EXPECT_EQ(board->GetClassName(), c.name);
    for (const ChipRow& row : ChipRows()) {
      const bool wanted = std::count(c.chips.begin(), c.chips.end(), row.name) != 0;
      EXPECT_EQ(board->GetChip(std::string(row.name)).GetName(), wanted ? row.name : "none") << row.name;
    }
    // The chips differ in what they save.
    const std::unique_ptr<MotherBoard> other = BoardBench::Board(c.systemId);
    EXPECT_EQ(bench.Traffic([&] { board->SavePowerLedState(); }),
              bench.Traffic([&] { other->GetChip(c.ledChip).SavePowerLedState(); }));
    EXPECT_EQ(bench.Traffic([&] { board->SavePowerButton(); }),
              bench.Traffic([&] { other->GetChip(c.buttonChip).SavePowerButtonState(); }));
    std::vector<TempZone> zones;
    EXPECT_TRUE(board->LoadZones() && board->GetZones(zones));
    ASSERT_EQ(zones.size(), 1U);
    EXPECT_EQ(zones[0].chip, c.zoneChip);
  }
  SMBIOSDiscovery::Instance().productText = "7D10";
}

// Absent hardware reads as ones.
TEST(MotherBoard, TheOldestClassesDriveLedAndButtonThemselves) {
  struct Row {
    std::function<bool(MotherBoard&)> act;
    bool answer;
    const char* traffic;
  };
  struct Case {
    const char* systemId;
    const char* section;
    const char* wanted;
    const char* name;
    bool red;
    std::vector<Row> rows;
  };
  const auto pressed = [](MotherBoard& board) {
    bool value = false;
    return board.IsPowerButtonPressed(value) && value;
  };
  const std::vector<Row> kEventButton = {
      {&MotherBoard::SavePowerButton, true, "0402->FFFF "},
      {&MotherBoard::ArmPowerButton, true, "0402->FFFF 0402<-FEFE "},
      {pressed, true, "0400->FFFF "},
      {&MotherBoard::SavePowerButton, true, ""},  // nothing is kept twice
      {&MotherBoard::RestorePowerButton, true, "0400<-0100 0402<-FFFF "},
      {&MotherBoard::ArmPowerButton, true, "0402->FFFF 0402->FFFF 0402<-FEFE "},
      {&MotherBoard::RestorePowerButton, true, "0400<-0100 0402<-FFFF "},
      {&MotherBoard::RestorePowerButton, true, ""},
  };
  const std::vector<Row> kOrchard = {
      {&MotherBoard::RestorePowerLedState, true, ""},
      {&MotherBoard::SavePowerLedState, true,
       "002E<-25 002F<-58 002E<-07 002F<-07 002E<-F0 002F<-04 002E<-F1 002F<-03 002E<-F0 002F<-06 002E<-F1 "
       "002F<-03 "},
      {&MotherBoard::AssertPowerLedGreen, true, "0420<-40 "},
      {&MotherBoard::AssertPowerLedRed, true, "0420<-10 "},
      {&MotherBoard::DeassertPowerLed, true, "0420<-00 "},
      {&MotherBoard::RestorePowerLedState, true, "0420<-40 002E<-25 002F<-40 "},
      {&MotherBoard::SavePowerButton, true, "0458->FF "},
      {&MotherBoard::ArmPowerButton, true, "0458<-FD F802->FFFF F802<-0000 F801<-01 "},
      {pressed, true, "F801->FF "},
      {&MotherBoard::RestorePowerButton, true, "F801<-01 F802<-FFFF 0458<-FF "},
  };
  const std::vector<Row> kLantern = {
      {&MotherBoard::RestorePowerLedState, true, ""},
      {&MotherBoard::SavePowerLedState, true, "002E<-87 002E<-87 002E<-2A 002F->FF 002F<-FD "},
      {&MotherBoard::AssertPowerLedGreen, false, ""},
      {&MotherBoard::DeassertPowerLed, false, ""},
      {&MotherBoard::RestorePowerLedState, true, "002E<-2A 002F<-FF 002E<-AA "},
  };
  const std::vector<Row> kSaddle = {
      {&MotherBoard::SavePowerLedState, true, "004E<-87 004E<-87 004E<-2A 004F->FF "},
      {&MotherBoard::AssertPowerLedGreen, true, "004E<-2A 004F<-40 "},
      {&MotherBoard::AssertPowerLedRed, false, ""},
      {&MotherBoard::DeassertPowerLed, true, "004E<-2A 004F<-00 "},
      {&MotherBoard::RestorePowerLedState, true, "004E<-2A 004F<-FF 004E<-AA "},
  };
  BoardBench bench;
  for (const Case& c : {Case{"0A58", "A58", "Orchard", "Orchard", true, kOrchard},
                        Case{"A58", "0A58", "Lantern", "Lantern", false, kLantern},
                        Case{"A58", "0A58", "Lantern", "Lantern", false, kEventButton},
                        Case{"2A78", "2A78", "Lantern", "Saddle", false, kSaddle},
                        Case{"2A78", "2A78", "Lantern", "Saddle", false, kEventButton}}) {
    SCOPED_TRACE(c.name);
    SMBIOSDiscovery::Instance().productText = c.systemId;
    bench.SetFiles("[" + std::string(c.section) + "]\nMotherboardClass=" + c.wanted + "\nPowerIOBaseAddr=0x400\n", "",
                   "");
    EXPECT_EQ(BoardBench::Board(c.systemId), nullptr);
    const std::unique_ptr<MotherBoard> board = MotherBoard::Instance(".\\mbdetect.ini");
    ASSERT_NE(board, nullptr);
    EXPECT_EQ(board->GetClassName(), c.name);
    bool red = !c.red;
    EXPECT_TRUE(board->IsPowerLedRedSupported(red));
    EXPECT_EQ(red, c.red);
    for (const Row& row : c.rows) {
      EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(row.act(*board), row.answer) << row.traffic; }), row.traffic);
    }
  }
  bench.SetFiles("[2A78]\nMotherboardClass=Lantern\n", "", "");
  const std::unique_ptr<MotherBoard> unknown = MotherBoard::Instance(".\\mbdetect.ini");
  bench.SetFiles("[2A78]\nMotherboardClass=Lantern\nPowerIOBaseAddr=0x400\n", "", "");
  EXPECT_TRUE(unknown->LoadLegacySettings());  // too late for the button
  EXPECT_EQ(bench.Traffic([&] {
    EXPECT_FALSE(unknown->SavePowerButton() || unknown->ArmPowerButton() || unknown->RestorePowerButton());
  }),
            "");  // nobody knows where the button is
  bench.SetFiles("[2A78]\nMotherboardClass=lantern\n", "", "");
  EXPECT_EQ(MotherBoard::Instance(".\\mbdetect.ini"), nullptr);
  SMBIOSDiscovery::Instance().productText = "7D10";
}

TEST(MotherBoard, TellsPeopleOnceWhatItCannotUse) {
  struct Case {
    const char* detect;
    const char* test;
    const char* chip;
    const char* told = nullptr;  // part of the line; null: nothing is told
    const char* then = nullptr;  // of the next one
  };
  const char* const generic = "[7D10]\nplatform=generic\nchips=g_iospace\n";
  const char* const lamp =
      "[g_iospace]\npowerled.green.assert.sequence=0xA20:1\npowerled.green.deassert.sequence=0xA20:0xFE\n"
      "powerled.red.deassert.sequence=0xA20:0xFE\n";
  const Case kCases[] = {
      {generic, "[7D10]\ntest.powerled.chip=g_iospace\ntest.powerled.redled.support=no\n", lamp},
      {"[7D10]\nplatform=legacy\n", "", ""},
      {"[7D11]\nplatform=generic\n", "[7D10]\na=b\n", "",
       "system id is \"7D10\", and section [7D10] is in .\\mbtest.ini, not in .\\mbdetect.ini; without"},
      {"[7D11]\nplatform=generic\n", "", "", "section [7D10] is not in .\\mbdetect.ini and .\\mbtest.ini; without"},
      {"[7D10]\nplatform=genric\n", "", "", "key \"platform\": there is no board class \"genric\""},
      {"[7D10]\nchips=g_iospace,g_iospce\n", "[7D10]\ntest.powerled.chip=g_iospace\n", lamp,
       "key \"chips\": there is no chip \"g_iospce\""},
      {generic, "", "",
       "The power LED cannot be lit: the key \"test.powerled.chip\" names no chip for it; section [7D10] is in "
       ".\\mbdetect.ini, not in .\\mbtest.ini"},
      {generic, "[7D10]\na=b\n", "", "section [7D10] is in .\\mbdetect.ini and .\\mbtest.ini."},
      {generic, "[7D10]\ntest.powerled.chip=g_iospce\n", "", "cannot be lit: the chip \"g_iospce\" (.\\mbtest.ini, "},
      {"[7D10]\nplatform=generic\nchips=,\n", "[7D10]\ntest.powerled.chip=g_sio\n", "",
       "is not in the list of the key \"chips\""},
      {generic, "[7D10]\ntest.powerled.chip=g_sio\n", "", "cannot be lit: the chip \"g_sio\" (.\\mbtest.ini, "},
      {generic, "[7D10]\ntest.powerled.chip=g_iospace\n", "[g_iospace]\npowerled.green.assert.sequence=undef\n",
       "has nothing for it; without a value in [g_iospace]: powerled.green.assert.sequence, "
       "powerled.green.deassert.sequence, powerled.ldn, powerled.red."},
      {generic, "[7D10]\ntest.powerled.chip=g_iospace\n", "[g_iospace]\npowerled.green.assert.sequence=0xA20:1\n",
       "The power LED cannot be darkened: the chip \"g_iospace\""},
      {generic,
       "[7D10]\ntest.powerled.chip=g_iospace\ntest.powerled.redled.support=maybe\ntest.panelglow.uselegacy=1\n", lamp,
       "key \"test.powerled.redled.support\": \"maybe\" is neither yes nor no; the chip is asked",
       "key \"test.panelglow.uselegacy\": \"1\" is neither yes nor no and counts as no"},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.detect + std::string(c.test) + c.chip);
    BoardBench bench;
    bench.SetFiles(c.detect, c.test, c.chip);
    SMBIOSDiscovery::Instance().productText = "7D10";
    for (int worker = 0; worker < 2; ++worker) {
      if (const std::unique_ptr<MotherBoard> board = BoardBench::Board("")) {
        bool supported = false;
        board->IsPowerLedRedSupported(supported);
        board->IsPanelLedLegacy();
        board->DeassertChargeLedRed();  // never lit here: no matter
        board->AssertPowerLedGreen();
        board->DeassertPowerLed();
      }
    }
    std::vector<std::string> lines;
    CDMUtil::Split(bench.machine.Errors(), lines, "\n");
    ASSERT_EQ(lines.size(), (c.told != nullptr ? 1U : 0U) + (c.then != nullptr ? 1U : 0U)) << bench.machine.Errors();
    for (std::size_t i = 0; i < lines.size(); ++i) {
      EXPECT_THAT(lines[i], ::testing::HasSubstr(i == 0 ? c.told : c.then));
    }
  }
}

TEST(MotherBoard, KeepsWhatItFoundOutForLaterReaders) {
  BoardBench bench;
  ProcessorInfo processor;
  processor.manufacturer = " AMD  ";
  processor.family = 0x6B;
  SMBIOSDiscovery::Instance().processors = {processor};
  BoardBench::Board("0B1C");
  const SelectedSystem system = GetSelectedSystem();
  EXPECT_EQ(system.processorManufacturer + "/" + system.detectIniPath + "/" + system.section,
            "AMD/.\\mbdetect.ini/0B1C");
  EXPECT_EQ(system.processorFamily, 0x6BU);
}

TEST(MotherBoard, SupportIsYesOrNoByTheFilesAndOtherwiseTheChips) {
  BoardBench bench;
  const std::string board = "[7D10]\nplatform=generic\nchips=g_iospace\n";
  using Ask = bool (MotherBoard::*)(bool&);
  const std::pair<const char*, Ask> kKeys[] = {
      {"test.powerled.redled.support", &MotherBoard::IsPowerLedRedSupported},
      {"test.chargeled.redled.support", &MotherBoard::IsChargeLedRedSupported},
      {"test.hdled.red.support", &MotherBoard::IsHdLedRedSupported},
      {"test.wirelessled.support", &MotherBoard::IsWirelessLedSupported},
  };
  for (const auto& [key, ask] : kKeys) {
    for (const auto& [answer, known, supported] :
         {std::tuple{"No", true, false}, {"YES", true, true}, {"maybe", false, true}}) {
      bench.SetFiles(board + key + "=" + answer + "\n", "", "");
      bool out = std::string(answer) != "YES";
      EXPECT_EQ(((*BoardBench::Board()).*ask)(out), known) << key << answer;
      EXPECT_EQ(out, supported) << key << answer;
    }
  }
  for (const auto& [answer, legacy] : {std::pair{"Yes", true}, {"no", false}, {"", false}}) {
    bench.SetFiles(board + "test.panelglow.uselegacy=" + answer + "\n", "", "");
    EXPECT_EQ(BoardBench::Board()->IsPanelLedLegacy(), legacy);
  }
}

TEST(MotherBoard, BoardsOfSeveralThreadsAreOneAtATimeAndOneThreadMayNestThem) {
  BoardBench bench;
  platform::sim::Scheduler& time = bench.machine.Time();
  std::string order;
  auto outer = BoardBench::Board();
  auto inner = BoardBench::Board();
  const platform::ThreadHandle worker = platform::TheHost().threads.Start("worker", [&] {
    order += "asks ";
    const auto board = BoardBench::Board();
    order += "has ";
  });
  time.SleepFor(1'000'000);
  inner.reset();
  time.SleepFor(1'000'000);
  order += "given up ";
  outer.reset();
  EXPECT_TRUE(platform::TheHost().threads.Wait(worker, 1000));
  EXPECT_EQ(order, "asks given up has ");
  EXPECT_FALSE(bench.machine.IsMutexOwned(kLock));
}

TEST(MotherBoard, AChipFileThatIsMissingOrBadFailsTheBoardAndLeavesItsLockFree) {
  BoardBench bench;
  bench.SetFiles("[7D10]\nplatform=generic\nchips=g_iospace\n", "", "[g_iospace]\nhdled.red.assert.sequence=0xA20\n");
  EXPECT_THROW(BoardBench::Board(), mblib_exception);
  EXPECT_FALSE(bench.machine.IsMutexOwned(kLock));
  bench.machine.DiskFiles().Hide(".\\chip.ini");
  try {
    BoardBench::Board();
    FAIL() << "a board without chip file";
  } catch (const CDMException& failure) {
    failure.Report();
  }
  EXPECT_EQ(bench.machine.Output(), "LogMessage 7 70 \".\\chip.ini\" \"\"\nTestFailed 990431 \"\"\n");
}

}  // namespace
}  // namespace panelglow
