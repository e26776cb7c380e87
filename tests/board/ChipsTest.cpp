// The sequence language, and what the chips do on the hardware for each operation.
#include <gmock/gmock.h>

#include "board/BoardBench.h"
#include "board/base/mblib_exception.h"
#include "board/chips/generic/GMemorySpaceChip.h"
#include "board/parts/Sequence.h"

namespace panelglow {
namespace {

TEST(Sequence, ATextIsReadEntryByEntry) {
  struct Case {
    const char* text;
    Sequence sequence;
  };
  const Case kCases[] = {
      {"0x2e:0x01.0x02,0x2f:undef", {{0x2E, {1, 2}}, {0x2F, {}}}},
      {" 10:20 ,, 0xFED80100::0x1FF..3. ", {{10, {20}}, {0xFED80100, {0xFF, 3}}}},
      {"2e:ff", {{0, {0}}}},
      {"undef:.", {{0, {}}}},
      {"-1:-1", {{0xFFFFFFFF, {0xFF}}}},
      {"undef", {}},
      {"", {}},
      {" , ", {}},
  };
  for (const Case& c : kCases) {
    Sequence sequence;
    EXPECT_EQ(ParseSequence(c.text, sequence), !c.sequence.empty()) << c.text;
    EXPECT_EQ(sequence, c.sequence) << c.text;
  }
  EXPECT_EQ(ParseByteList("0x10, 17 ,,0x112 x"), (std::vector<std::uint8_t>{16, 17, 18, 0}));
  for (const char* entry : {"0x2E", "1:2:3", ":", "undef,"}) {
    Sequence sequence;
    const std::string shown = entry == std::string("undef,") ? "undef" : entry;
    EXPECT_THAT([&] { ParseSequence(entry, sequence); },
                ::testing::ThrowsMessage<mblib_exception>("malformed sequence entry: '" + shown +
                                                          "'. should be: 'cmd:data[.data]*,...'"));
  }
}

// ---- LEDs on masked registers

// The two classes with all twelve lists: an own address for each LED, two entries in two of them.
constexpr const char* kSequences =
    "powerled.green.assert.sequence=%0:1\npowerled.green.deassert.sequence=%0:0xFE\n"
    "powerled.red.assert.sequence=%0:2,%8:0x80\npowerled.red.deassert.sequence=%0:0xFD\n"
    "chargeled.white.assert.sequence=%2:4.9\nchargeled.white.deassert.sequence=%2:0xFB\n"
    "chargeled.red.assert.sequence=%2:8\nchargeled.red.deassert.sequence=%2:undef\n"
    "hdled.red.assert.sequence=%4:0x10\nhdled.red.deassert.sequence=%4:0xEF,%8:0x7F\n"
    "wirelessled.assert.sequence=%6:0x20\nwirelessled.deassert.sequence=%6:0x20\n";

std::string SequencesAt(const std::string& base) {
  std::string text = kSequences;
  for (std::size_t at = text.find('%'); at != std::string::npos; at = text.find('%')) {
    text.replace(at, 1, base);
  }
  return text;
}

using Operation = bool (Chip::*)();

struct OperationCase {
  Operation operation;
  const char* ports;
  const char* memory;
};

// Ports hold 0x0F in each latch and 0x30 at the inputs behind; memory holds 0x55 everywhere.
constexpr OperationCase kOperations[] = {
    {&Chip::AssertPowerLedGreen, "0A20<-00 0A21->30 0A20<-31 30ms ", "FE000000->55 FE000000<-55 "},
    {&Chip::AssertPowerLedRed, "0A20<-00 0A21->30 0A20<-32 30ms 0A28<-00 0A29->30 0A28<-B0 30ms ",
     "FE000000->55 FE000000<-57 FE000008->55 FE000008<-D5 "},
    {&Chip::DeassertPowerLed, "0A20<-00 0A21->30 0A20<-30 30ms 0A20<-00 0A21->30 0A20<-30 30ms ",
     "FE000000->57 FE000000<-56 FE000000->56 FE000000<-54 "},
    {&Chip::RestorePowerLedState, "0A20<-00 0A21->30 0A20<-31 30ms ", "FE000000->54 FE000000<-55 "},
    {&Chip::AssertChargeLedWhite, "0A22<-00 0A23->30 0A22<-34 30ms ", "FE000002->55 FE000002<-55 "},
    {&Chip::DeassertChargeLedWhite, "0A22<-00 0A23->30 0A22<-30 30ms ", "FE000002->55 FE000002<-51 "},
    {&Chip::AssertChargeLedRed, "0A22<-00 0A23->30 0A22<-38 30ms ", "FE000002->51 FE000002<-59 "},
    {&Chip::DeassertChargeLedRed, "0A22<-00 0A23->30 0A22<-00 30ms ", "FE000002->59 FE000002<-00 "},
    {&Chip::SaveHdLedState, "0A24->0F 0A28->B0 ", "FE000004->55 FE000008->D5 "},
    {&Chip::AssertHdLedRed, "0A24<-00 0A25->30 0A24<-30 30ms ", "FE000004->55 FE000004<-55 "},
    {&Chip::DeassertHdLedRed, "0A24<-00 0A25->30 0A24<-20 30ms 0A28<-00 0A29->30 0A28<-30 30ms ",
     "FE000004->55 FE000004<-45 FE000008->D5 FE000008<-55 "},
    {&Chip::RestoreHdLedState, "0A24<-0F 0A28<-B0 ", "FE000004<-55 FE000008<-D5 "},
    {&Chip::RestoreHdLedState, "0A24<-0F 0A28<-B0 ", "FE000004<-55 FE000008<-D5 "},
    {&Chip::RestoreWirelessLedState, "", ""},
    {&Chip::SaveWirelessLedState, "0A26->0F ", "FE000006->55 "},
    {&Chip::AssertWirelessLed, "0A26->0F 0A26<-2F 30ms ", "FE000006->55 FE000006<-75 30ms "},
    {&Chip::DeassertWirelessLed, "0A26->2F 0A26<-0F 30ms ", "FE000006->75 FE000006<-55 30ms "},
    {&Chip::SaveWirelessLedState, "0A26->0F ", "FE000006->55 "},
    {&Chip::RestoreWirelessLedState, "0A26<-0F 0A26<-0F ", "FE000006<-55 FE000006<-55 "},
};

std::string PanelHardware() {
  std::string text = "chip = [\n";
  for (const char* digit : {"0", "2", "4", "6", "8"}) {
    text += "{name = \"p" + std::string(digit) + "\", kind = \"gpio-block\", base = 0xA2" + digit +
            ", outputs = 0x0F, inputs = 0x30, initial = [0x0F]},\n";
  }
  return text +
         "{name = \"m\", kind = \"memory-registers\", base = 0xFE000000,"
         " initial = [0x55, 0x55, 0x55, 0x55, 0x55, 0x55, 0x55, 0x55, 0x55]},\n]\n";
}

TEST(MaskedLedChips, EachOperationIsItsListOnTheHardware) {
  BoardBench bench(PanelHardware());
  bench.SetFiles("[7D10]\nplatform=generic\nchips=G_MemorySpace g_IOSPACE\n", "",
                 "[g_iospace]\n" + SequencesAt("0xA2") + "[g_memoryspace]\n" + SequencesAt("0xFE00000"));
  const std::unique_ptr<MotherBoard> board = BoardBench::Board();
  for (const OperationCase& c : kOperations) {
    for (const bool ports : {true, false}) {
      SCOPED_TRACE(c.ports);
      Chip& chip = board->GetChip(ports ? "g_iospace" : "g_memoryspace");
      EXPECT_EQ(bench.Traffic([&] { EXPECT_TRUE((chip.*c.operation)()); }), ports ? c.ports : c.memory);
    }
  }
}

TEST(MaskedLedChips, WithoutItsListAnOperationIsFalseAndTouchesNothing) {
  BoardBench bench;
  bench.SetFiles(
      "[7D10]\nplatform=generic\nchips=g_iospace,g_memoryspace\nchip.g_iospace.hdled.red.assert.sequence=undef\n", "",
      "[g_iospace]\npowerled.green.deassert.sequence=1:1\nhdled.red.assert.sequence=1:1\n"
      "hdled.red.deassert.sequence=1:1\nwirelessled.deassert.sequence=1:1\nbase=g_memoryspace\n"
      "[g_memoryspace]\npowerled.red.assert.sequence=UNDEF\n");
  const std::unique_ptr<MotherBoard> board = BoardBench::Board();
  EXPECT_EQ(bench.Traffic([&] {
    for (const OperationCase& c : kOperations) {
      EXPECT_FALSE((board->GetChip("g_memoryspace").*c.operation)()) << c.ports;
      EXPECT_EQ((board->GetChip("g_iospace").*c.operation)(),
                c.operation == &Chip::DeassertWirelessLed || c.operation == &Chip::DeassertHdLedRed)
          << c.ports;
    }
  }),
            "0001<-00 0002->FF 0001<-01 30ms 0001->FF 0001<-FE 30ms ");
}

TEST(MemorySpaceChip, ALineIsABitOfAWordOfTheGpioBlock) {
  constexpr const char* kBlocks =
      "chip = [{name = \"m\", kind = \"memory-registers\", base = 0xFED80100, initial = [0, 0, 0x02, 0x80]},\n"
      "{name = \"n\", kind = \"memory-registers\", base = 0xFE001000, initial = [0, 0, 0x04, 0x00]}]\n";
  const auto lines = [&](const std::string& settings, const char* driver = "") {
    BoardBench bench(std::string(driver) + kBlocks);
    bench.SetFiles("[7D10]\n" + settings, "", "");
    IniReader::Instance("7D10", ".\\mbdetect.ini", "", "");
    GMemorySpaceChip chip;
    std::string states;
    for (const char* bit : {"1", "0x2", "15", "33", "x"}) {
      states += std::to_string(chip.ReadLineByNames(2, bit, "")) + " ";
    }
    return states;
  };
  EXPECT_EQ(lines(""), "3 4 3 4 4 ");
  EXPECT_EQ(lines("chip.g_memoryspace.gpiobar=0xFE001000\n"), "4 3 4 4 4 ");
  EXPECT_EQ(lines("chip.g_memoryspace.data=block\nchip.block.gpiobar=0xFE001000\n"), "4 3 4 4 4 ");
  EXPECT_EQ(lines("", "driver = {present = false}\n"), "-1 -1 -1 -1 -1 ");
}

// ---- what all chips, and all generic chips, have in common

TEST(Chip, ThePlainChipKnowsThePowerButtonAndLatchedBits) {
  BoardBench bench(
      "chip = [{name = \"s\", kind = \"gpio-block\", base = 0x458, outputs = 0xFF, initial = [0xF2]},\n"
      "{name = \"l\", kind = \"gpio-block\", base = 0xA30, outputs = 0xFF, initial = [0x12]}]\n");
  const std::unique_ptr<MotherBoard> board = BoardBench::Board();
  bool out = false;
  EXPECT_EQ(bench.Traffic([&] { EXPECT_TRUE(board->SavePowerButton() && board->ArmPowerButton()); }),
            "0458->F2 0458<-F1 F802->FFFF F802<-0000 F801<-01 ");
  EXPECT_EQ(bench.Traffic([&] { EXPECT_TRUE(board->IsPowerButtonPressed(out) && out); }), "F801->FF ");
  EXPECT_EQ(bench.Traffic([&] { EXPECT_TRUE(board->RestorePowerButton()); }), "F801<-01 F802<-FFFF 0458<-F2 ");
  EXPECT_EQ(bench.Traffic([&] { EXPECT_TRUE(board->ReadLatchedBit(0xA30, 4)); }),
            "0A30->FFFF1212 250ms 0A30->FFFF1212 0A30<-FFFF1212 0072<-AA 0073<-00 ");
  for (const int bit : {3, -1, 32}) {
    EXPECT_EQ(bench.Traffic([&] { EXPECT_FALSE(board->ReadLatchedBit(0xA30, bit)); }), "0A30->FFFF1212 ");
  }
  Chip& chip = board->GetChip("");
  int rpm = 5;
  EXPECT_TRUE(!chip.ReadFanRpm(1, rpm, 1) && rpm == 0);
  EXPECT_EQ(bench.Traffic([&] { EXPECT_TRUE(chip.ReadLatchedPort(0xA30, 0x02, out) && out); }), "0A30->12 0A30<-12 ");
  EXPECT_EQ(bench.Traffic([&] { EXPECT_TRUE(chip.ReadLatchedPort(0xA30, 0x01, out) && !out); }), "0A30->12 ");
}

// A generic chip that shows what it has read.
class PartsChip : public GChip {
 public:
  PartsChip() : GChip("g_chip") { LoadConfiguration(); }
  using GChip::fullSpeedData;
  using GChip::pwmRegs;
  using GChip::tachRegs;
  using GChip::tempReadRegs;
};

TEST(GChip, NumberedKeysEndAtAGapOrAtTheirCount) {
  BoardBench bench;
  bench.SetFiles("[7D10]\nchip.g_chip.data=parts\n", "",
                 "[parts]\nfan.tachs=2\nfan.1.tach.reg=0x10000\nfan.2.tach.reg=2\nfan.3.tach.reg=3\n"
                 "fan.1.pwm.reg=0x10011\nfan.2.pwm.reg=18\nfan.4.pwm.reg=20\n"
                 "temp.zones=5\ntemp.1.read.reg=7\ntemp.2.read.reg=0\ntemp.3.read.reg=9\n"
                 "fan.full_speed.data=0x17F\n");
  IniReader::Instance("7D10", ".\\mbdetect.ini", "", ".\\chip.ini");
  const PartsChip chip;
  EXPECT_EQ(chip.tachRegs, (std::vector<std::uint32_t>{0x10000, 2}));
  EXPECT_EQ(chip.pwmRegs, (std::vector<std::uint16_t>{0x11, 18}));
  EXPECT_EQ(chip.tempReadRegs, (std::vector<std::uint16_t>{7}));
  EXPECT_EQ(chip.fullSpeedData, 0x7F);
}

}  // namespace
}  // namespace panelglow
