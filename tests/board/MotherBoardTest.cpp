// Which board the INI files make of a machine, whose chip serves an LED, and the lock that a board is.
#include "board/MotherBoard.h"

#include <gtest/gtest.h>

#include <set>

#include "board/BoardBench.h"
#include "board/base/mblib_exception.h"
#include "harness/base/CDMException.h"
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
    if (row.make != nullptr) {
      BoardBench bench;
      bench.SetFiles("[Common]\nchip.codec.hdabar=0xFE5C0000\n", "", "");
      IniReader::Instance("7D10", ".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini");
      EXPECT_EQ(row.make()->GetName(), row.name);
    }
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
