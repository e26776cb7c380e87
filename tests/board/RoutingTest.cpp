// Which chip an operation of a board reaches, and that every chip class answers for any number.
#include <gtest/gtest.h>

#include <climits>
#include <functional>

#include "board/ChipCases.h"

namespace panelglow {
namespace {

// ---- operations

// Notes what it is asked, with its name in front.
class SpyChip : public Chip {
 public:
  SpyChip(const std::string& chipName, std::string& notes, const bool& answer)
      : Chip(chipName), asked(&notes), isDone(&answer) {}

  bool ArmPowerButton() override { return Note("button arm"); }
  bool IsPowerLedRedSupported(bool& supported) override { return Note("power has red", supported); }
  bool SavePowerLedState() override { return Note("power save"); }
  bool RestoreChargeLedState() override { return Note("charge restore"); }
  bool AssertHdLedRed() override { return Note("drive red"); }
  bool DeassertWirelessLed() override { return Note("wireless off"); }
  bool BlinkSpeakerLed() override { return Note("speaker blink"); }
  bool AssertMicrophoneLed() override { return Note("microphone on"); }
  bool ReadLatchedPortDword(std::uint16_t port, std::uint32_t mask, bool& value) override {
    return Note("latch read " + std::to_string(port) + " " + std::to_string(mask), value);
  }
  bool ClearLatchedPortDword(std::uint16_t port, std::uint32_t mask) override {
    return Note("latch clear " + std::to_string(port) + " " + std::to_string(mask));
  }

 private:
  bool Note(const std::string& what) {
    *asked += name + ": " + what + ";";
    return *isDone;
  }
  bool Note(const std::string& what, bool& value) {
    value = *isDone;
    return Note(what);
  }

  std::string* asked;
  const bool* isDone;
};

class SpyBoard : public MotherBoard {
 public:
  SpyBoard() : MotherBoard("spy", 0) {
    for (const ChipRow& row : ChipRows()) {
      Put(row.place, std::make_unique<SpyChip>(std::string(row.name), asked, answer));
    }
  }
  std::string asked;
  bool answer = true;
};

// An operation of each key; the others of a LED go the same way, as the workers show.
TEST(MotherBoard, AnOperationReachesTheChipOfItsOwnKeyAndNoOther) {
  BoardBench bench;
  // One chip for each key, from all over the table.
  bench.SetFiles("",
                 "[7D10]\ntest.powerled.chip=FIN\ntest.chargeled.chip=smsc_mec1322\ntest.hdled.chip=g_iospace\n"
                 "test.wirelessled.chip=casl\ntest.speakerled.chip=g_codec\ntest.microphoneled.chip=adt\n"
                 "test.powerbutton.chip=ich\n",
                 "");
  IniReader::Instance("7D10", ".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini");
  bool red = false;
  const std::pair<std::function<bool(MotherBoard&)>, const char*> kOperations[] = {
      {[&](MotherBoard& board) { return board.IsPowerLedRedSupported(red) && red; }, "fin: power has red;"},
      {&MotherBoard::SavePowerLedState, "fin: power save;"},
      {&MotherBoard::RestoreChargeLedState, "smsc_mec1322: charge restore;"},
      {&MotherBoard::AssertHdLedRed, "g_iospace: drive red;"},
      {&MotherBoard::DeassertWirelessLed, "casl: wireless off;"},
      {&MotherBoard::BlinkSpeakerLed, "g_codec: speaker blink;"},
      {&MotherBoard::AssertMicrophoneLed, "adt: microphone on;"},
      {&MotherBoard::ArmPowerButton, "ich: button arm;"},
      {[](MotherBoard& board) { return board.ReadLatchedBit(0x420, 31); }, "chip: latch read 1056 2147483648;"},
      {[](MotherBoard& board) { return board.ClearLatchedBit(0x420, 3); }, "chip: latch clear 1056 8;"},
  };
  for (const auto& [act, asked] : kOperations) {
    for (const bool answer : {true, false}) {
      SpyBoard board;  // whose chips have not been asked for yet
      board.answer = answer;
      EXPECT_EQ(act(board), answer) << asked;
      EXPECT_EQ(board.asked, asked);
    }
  }
}

// ---- numbers

constexpr const char* kNeeded =  // for a class to be built, or to get as far as its registers
    "chip.codec.hdabar=0xFE5C0000\ntest.graphics.1.PCI_IDS=10DE 1C03\n"
    "test.tempcaution.processor.1.manufacturer=Intel\ntest.tempcaution.processor.1.familyid=6\n"
    "test.tempcaution.processor.1.mechanism=msr\n";

// On machines where nobody answers but a controller that is always ready, and where an SMBus host never gets ready
// and a Super-I/O's data port reads as its index, too.
TEST(ChipTable, AnyNumberIsAnsweredInBoundedTime) {
  constexpr platform::sim::Microseconds kMostEach_us = 20'000'000;
  const auto ports = [](const std::string& base, const char* inputs) {
    return "[[chip]]\nname = \"" + base + "\"\nkind = \"gpio-block\"\nbase = " + base + "\n" + inputs;
  };
  const std::string ready = ports("0x65", "outputs = 0\ninputs = 0x01\n");
  const char* const busy = "outputs = 0\ninputs = 0x1A\n";
  for (const std::string& hardware :
       {ready, ready + ports("0xFC00", busy) + ports("0x800", busy) + ports("0xB00", busy) + ports("0x2E", "")}) {
    for (const ChipRow& row : ChipRows()) {
      KeyBench bench(hardware, kNeeded);
      const std::unique_ptr<Chip> chip = MakeChip(std::string(row.name));
      for (const int number : {INT_MIN, -1, 0, 1, 10, 99, INT_MAX}) {
        const platform::sim::Microseconds start = bench.machine.Time().Now();
        AskEverything(*chip, number);
        EXPECT_LT(bench.machine.Time().Now() - start, kMostEach_us) << row.name << " " << number;
      }
    }
  }
}

}  // namespace
}  // namespace panelglow
