// Which chip an operation of a board reaches, and which keys of the files each chip class looks up.
#include <gtest/gtest.h>

#include <climits>
#include <functional>
#include <iterator>
#include <set>
#include <sstream>

#include "board/ChipCases.h"
#include "board/base/SelectedSystem.h"

namespace panelglow {
namespace {

// ---- operations

// Notes what it is asked, with its name in front.
class SpyChip : public Chip {
 public:
  SpyChip(const std::string& chipName, std::string& notes, const bool& answer)
      : Chip(chipName), asked(&notes), isDone(&answer) {}

  bool SavePowerButtonState() override { return Note("button save"); }
  bool ArmPowerButton() override { return Note("button arm"); }
  bool IsPowerButtonPressed(bool& pressed) override { return Note("button pressed", pressed); }
  bool RestorePowerButtonState() override { return Note("button restore"); }

  bool IsPowerLedRedSupported(bool& supported) override { return Note("power has red", supported); }
  bool SavePowerLedState() override { return Note("power save"); }
  bool AssertPowerLedGreen() override { return Note("power green"); }
  bool AssertPowerLedRed() override { return Note("power red"); }
  bool DeassertPowerLed() override { return Note("power off"); }
  bool RestorePowerLedState() override { return Note("power restore"); }
  bool BlinkPowerLedGreen() override { return Note("power blink green"); }
  bool BlinkPowerLedRed() override { return Note("power blink red"); }

  bool IsChargeLedRedSupported(bool& supported) override { return Note("charge has red", supported); }
  bool AssertChargeLedWhite() override { return Note("charge white"); }
  bool DeassertChargeLedWhite() override { return Note("charge white off"); }
  bool AssertChargeLedRed() override { return Note("charge red"); }
  bool DeassertChargeLedRed() override { return Note("charge red off"); }
  bool BlinkChargeLedWhite() override { return Note("charge blink white"); }
  bool BlinkChargeLedRed() override { return Note("charge blink red"); }
  bool SaveChargeLedState() override { return Note("charge save"); }
  bool RestoreChargeLedState() override { return Note("charge restore"); }

  bool IsHdLedRedSupported(bool& supported) override { return Note("drive has red", supported); }
  bool SaveHdLedState() override { return Note("drive save"); }
  bool RestoreHdLedState() override { return Note("drive restore"); }
  bool AssertHdLedRed() override { return Note("drive red"); }
  bool DeassertHdLedRed() override { return Note("drive red off"); }
  bool BlinkHdLedRed() override { return Note("drive blink red"); }

  bool IsWirelessLedSupported(bool& supported) override { return Note("wireless is there", supported); }
  bool SaveWirelessLedState() override { return Note("wireless save"); }
  bool RestoreWirelessLedState() override { return Note("wireless restore"); }
  bool AssertWirelessLed() override { return Note("wireless on"); }
  bool DeassertWirelessLed() override { return Note("wireless off"); }

  bool SaveSpeakerLedState() override { return Note("speaker save"); }
  bool RestoreSpeakerLedState() override { return Note("speaker restore"); }
  bool BlinkSpeakerLed() override { return Note("speaker blink"); }
  bool AssertSpeakerLed() override { return Note("speaker on"); }
  bool DeassertSpeakerLed() override { return Note("speaker off"); }
  bool BlinkMicrophoneLed() override { return Note("microphone blink"); }
  bool AssertMicrophoneLed() override { return Note("microphone on"); }
  bool DeassertMicrophoneLed() override { return Note("microphone off"); }

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

using Act = std::function<bool(MotherBoard&)>;

// The answer, and what is told through the operation's parameter, must be the same here.
Act Asking(bool (MotherBoard::*operation)(bool&)) {
  return [=](MotherBoard& board) {
    bool value = false;
    const bool isKnown = (board.*operation)(value);
    EXPECT_EQ(value, isKnown);
    return isKnown;
  };
}

TEST(MotherBoard, EachOperationReachesTheChipOfItsOwnKeyAndNoOther) {
  BoardBench bench;
  // One chip for each key, from all over the table.
  bench.SetFiles("",
                 "[7D10]\ntest.powerled.chip=FIN\ntest.chargeled.chip=smsc_mec1322\ntest.hdled.chip=g_iospace\n"
                 "test.wirelessled.chip=casl\ntest.speakerled.chip=g_codec\ntest.microphoneled.chip=adt\n"
                 "test.powerbutton.chip=ich\n",
                 "");
  IniReader::Instance("7D10", ".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini");
  const std::pair<Act, const char*> kOperations[] = {
      {Asking(&MotherBoard::IsPowerLedRedSupported), "fin: power has red;"},
      {&MotherBoard::SavePowerLedState, "fin: power save;"},
      {&MotherBoard::AssertPowerLedGreen, "fin: power green;"},
      {&MotherBoard::AssertPowerLedRed, "fin: power red;"},
      {&MotherBoard::DeassertPowerLed, "fin: power off;"},
      {&MotherBoard::RestorePowerLedState, "fin: power restore;"},
      {&MotherBoard::BlinkPowerLedGreen, "fin: power blink green;"},
      {&MotherBoard::BlinkPowerLedRed, "fin: power blink red;"},
      {Asking(&MotherBoard::IsChargeLedRedSupported), "smsc_mec1322: charge has red;"},
      {&MotherBoard::AssertChargeLedWhite, "smsc_mec1322: charge white;"},
      {&MotherBoard::DeassertChargeLedWhite, "smsc_mec1322: charge white off;"},
      {&MotherBoard::AssertChargeLedRed, "smsc_mec1322: charge red;"},
      {&MotherBoard::DeassertChargeLedRed, "smsc_mec1322: charge red off;"},
      {&MotherBoard::BlinkChargeLedWhite, "smsc_mec1322: charge blink white;"},
      {&MotherBoard::BlinkChargeLedRed, "smsc_mec1322: charge blink red;"},
      {&MotherBoard::SaveChargeLedState, "smsc_mec1322: charge save;"},
      {&MotherBoard::RestoreChargeLedState, "smsc_mec1322: charge restore;"},
      {Asking(&MotherBoard::IsHdLedRedSupported), "g_iospace: drive has red;"},
      {&MotherBoard::SaveHdLedState, "g_iospace: drive save;"},
      {&MotherBoard::RestoreHdLedState, "g_iospace: drive restore;"},
      {&MotherBoard::AssertHdLedRed, "g_iospace: drive red;"},
      {&MotherBoard::DeassertHdLedRed, "g_iospace: drive red off;"},
      {&MotherBoard::BlinkHdLedRed, "g_iospace: drive blink red;"},
      {Asking(&MotherBoard::IsWirelessLedSupported), "casl: wireless is there;"},
      {&MotherBoard::SaveWirelessLedState, "casl: wireless save;"},
      {&MotherBoard::RestoreWirelessLedState, "casl: wireless restore;"},
      {&MotherBoard::AssertWirelessLed, "casl: wireless on;"},
      {&MotherBoard::DeassertWirelessLed, "casl: wireless off;"},
      {&MotherBoard::SaveSpeakerLedState, "g_codec: speaker save;"},
      {&MotherBoard::RestoreSpeakerLedState, "g_codec: speaker restore;"},
      {&MotherBoard::BlinkSpeakerLed, "g_codec: speaker blink;"},
      {&MotherBoard::AssertSpeakerLed, "g_codec: speaker on;"},
      {&MotherBoard::DeassertSpeakerLed, "g_codec: speaker off;"},
      {&MotherBoard::BlinkMicrophoneLed, "adt: microphone blink;"},
      {&MotherBoard::AssertMicrophoneLed, "adt: microphone on;"},
      {&MotherBoard::DeassertMicrophoneLed, "adt: microphone off;"},
      {&MotherBoard::SavePowerButton, "ich: button save;"},
      {&MotherBoard::RestorePowerButton, "ich: button restore;"},
      {&MotherBoard::ArmPowerButton, "ich: button arm;"},
      {Asking(&MotherBoard::IsPowerButtonPressed), "ich: button pressed;"},
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
  SpyBoard board;
  EXPECT_FALSE(board.BlinkWirelessLed() || board.IsPanelLedLegacy());
  EXPECT_EQ(board.asked, "");
}

// ---- keys

std::string Under(const std::string& prefix, const std::string& keys) {
  return Each(keys, [&](const std::string& key) { return prefix + key + " "; });
}

// In the layered files, of the classes that others are derived from.
const std::string kFin = Under("chip.fin.",
                               "pmbar hwmbar cfgbar multifunction_select2_register.green "
                               "multifunction_select2_register.red multifunction_select3_register.gpios15_16");
const std::string kFinSelect = Under("chip.fin.", "reg2Agreen reg2Ared reg2B");
const std::string kFinOwn =
    "pmbar hwmbar cfgbar multifunction_select2_register.green multifunction_select2_register.red";
const std::string kLines = Under("test.powerled.gpio.", "primary secondary");
const std::string kIch = Under("chip.ich.", "gpiobar pm.enable.offset pm.status.offset") + kLines;
const std::string kIte = Under("chip.ite.", "hwmbar powerled.color.primary.gpio powerled.color.secondary.gpio");
const std::string kIte8758 = kIte + Under("chip.ite_8758.", "hwmbar cfgbar");
const std::string kBars = "pmbar hwmbar cfgbar";
const std::string kWin = Under("chip.win.", kBars) + Each("1 2 3 4 5 6 7 8 9", [](const std::string& group) {
                           return Under("chip.win.gpiox." + group + ".",
                                        "logical_device enable_bit io_reg data_reg inversion_reg status_reg");
                         });
const std::string kW83667 = kWin + Under("chip.nuv_w83667.", kBars);
const std::string kSio = Under("chip.sio.", "pmbar hwmbar hoodlockoffset");
const std::string kAdt = Under("chip.adt.", "smbusbar smbussar");

// In a section of the chip file.
const std::string kGeneric =
    "fan.save.regs fan.restore_sleep fan.tachs fan.1.tach.reg fan.pwms fan.1.pwm.reg fan.full_speed.data temp.zones "
    "temp.1.read.reg temp.1.limit.reg powerled.ldn powerled.state.regs ";
const std::string kSuperIo =
    kGeneric +
    "config.index.port config.data.port config.mode.enter.sequence config.mode.exit.sequence hwmbar hwmbar.bar.ldn "
    "hwmbar.bar.reg environment.index.reg environment.data.reg gpiobar gpiobar.bar.ldn gpiobar.bar.reg ";
const std::string kBlinks = "powerled.red.blink.sequence powerled.green.blink.sequence ";
const std::string kIteSection = kSuperIo + kBlinks +
                                "fan.1.pwm_ctl.reg fan.2.pwm_ctl.reg fan.3.pwm_ctl.reg powerled.color.primary.gpio "
                                "powerled.color.secondary.gpio ";
const std::string kEc =
    kGeneric +
    Under("ec.", "sc.port data.port read.cmd write.cmd query.cmd ibf.sleeptime obf.sleeptime set_pwm.cmd") +
    "fan.manual_mode.set.sequence fan.manual_mode.reset.sequence " +
    Under("powerled.",
          "red.assert.sequence green.assert.sequence deassert.sequence state.save.sequence state.restore.sequence");
const std::string kLists =
    Each("powerled.green powerled.red chargeled.white chargeled.red hdled.red wirelessled",
         [](const std::string& led) { return led + ".assert.sequence " + led + ".deassert.sequence "; });
const std::string kMuxLists = Each("powerled.green chargeled.green chargeled.red", [](const std::string& led) {
  return Under(led + ".", "assert.sequence deassert.sequence savemux.sequence enablemux.sequence");
});

struct KeyRow {
  const char* chip;
  std::string layered = {};
  std::string section = {};  // of the section that "chip.<name>.data" names
  std::string named = {};    // of the section that is called as the chip, whatever that key says
};

const KeyRow kKeys[] = {
    {"chip"},
    {"adt", kAdt},
    {"adt_sio11", kAdt + Under("chip.adt_sio11.", "smbusbar smbussar")},
    {"acpi", Under("test.tempcaution.processor.1.", "manufacturer familyid mechanism maxtempreg tempprobereg tjmax")},
    {"casl", "chip.casl.data",
     "config.write.command config.read.command wireless.methodtype wireless.powercontrol wireless.assert.command "
     "wireless.deassert.command wireless.devices.buffer"},
    {"ec"},
    {"ec_wpc8763"},
    {"ec_it8512"},
    {"ec_it8518"},
    {"fin", kFin + kFinSelect},
    {"fin_f8000",
     kFin + kFinSelect + Under("chip.fin_f8000.", kFinOwn + " multifunction_select3_register.gpios15_16")},
    {"fin_f71858", kFin + Under("chip.fin_f71858.", kFinOwn)},
    {"fin_f71855", kFin + Under("chip.fin_f71855.", kFinOwn)},
    // Its colours are lists of writes, which a board can replace.
    {"fin_f71863", kFin + kFinSelect + "test.powerled.primary.data_blink test.powerled.secondary.data_blink"},
    {"fin_f71808a", kFin + Under("chip.fin_f71808a.", kFinOwn)},
    {"fin_f71808e", kFin + Under("chip.fin_f71858.", kFinOwn) + Under("chip.fin_f71808e.", kFinOwn)},
    // Built on "ich", with a power management block and a GPIO block of its own.
    {"hudson", kIch + Under("chip.hudson.", "pmbar gpiobar indirectioaddr")},
    {"intelc200", Under("chip.intelc200.", "rcrbbar spibar")},
    {"ich", kIch + "chip.ich.pmbar"},
    {"ite", kIte},
    {"ite_8758", kIte8758},
    {"ite_8721", kIte8758 + Under("chip.ite_8721.", "hwmbar cfgbar gpiobar")},
    {"ite_8772", kIte8758 + Under("chip.ite_8772.", "hwmbar cfgbar")},
    {"mcp", "chip.mcp.pmbar"},
    {"nuv_w83667", kW83667},
    {"nuv_nct5571", kW83667 + Under("chip.nuvo5571.", kBars)},
    {"nuv_nct5572", kW83667 + Under("chip.nuv_nct5572.", kBars)},
    {"sbx", Under("chip.sbx.", "smbusbar pciindex pcidata")},
    {"sb710", Under("chip.Sb710.", "smbusbar pciindex pcidata")},
    {"sio", kSio},
    {"smbus_device", Under("chip.smbus_device.", "smbus_bar smbus_saddr") +
                         "test.powerled.green.data_blink test.powerled.red.data_blink"},
    {"smsc5407"},
    {"win", kWin},
    {"win_w83202g", kWin + Under("chip.win_w83202g.", kBars)},
    {"win_wpcd376", Under("chip.win_wpcd376.", "siobar gpiobar cfgbar")},
    {"vt1211"},
    {"nuv_npcd378h", Under("chip.nuv_npcd378h.", "cfgbar gpiobar")},
    {"smsc_sch5327b", kSio + Under("chip.smsc_sch5327b.", kFinOwn)},
    {"g_fintek", "chip.g_fintek.data", kSuperIo + kBlinks + "fan.manual_mode.set.sequence"},
    {"g_it8702", "chip.g_it8702.data", kIteSection + "config.reg fan_main_control.reg fan_ctl.reg fan_ramp_rate.reg"},
    {"g_ite", "chip.g_ite.data", kIteSection},
    {"g_sio", "chip.g_sio.data", kSuperIo},
    {"g_ec_it8519", "chip.g_ec_it8519.data", kEc},
    {"g_ec", "chip.g_ec.data", kEc},
    {"videochip", Under("test.graphics.1.", "PCI_IDS Temp_Zones Upper_Threshold Lower_Threshold")},
    {"smsc_mec1322", "chip.smsc_mec1322.data test.panelglow.waittime", kMuxLists},
    {"smsc_kbc1126", "chip.smsc_kbc1126.runningaverage"},
    {"g_iospace", "chip.g_iospace.data", kGeneric, kLists},
    {"g_memoryspace", "chip.g_memoryspace.data chip.g_memoryspace.gpiobar chip.own.gpiobar", kGeneric, kLists},
    {"g_codec", "chip.g_codec.data chip.codec.pciloc chip.codec.hdabar",
     kGeneric + Under("codec.", "icw.reg irr.reg ics.reg") + "speakerled.gpio.ldn microphoneled.gpio.ldn " +
         Under("codecgpio.state.", "set.sequence save.sequence restore.sequence")},
};

// What a machine must have for a class to get as far as its last key; and a controller that is always ready.
constexpr const char* kHardware = R"(
libraries = ["nvapi.dll"]
firmware_call = {radio = [{number = 1, offset = 6}], fan = [{speed = 24, duty = 0x60}], temperatures = [41]}
[[chip]]
name = "controller"
kind = "gpio-block"
base = 0x65
outputs = 0
inputs = 0x01
[[firmware.processor]]
[driver.msr]
"1A2" = 0x640000
"19C" = 0x280000
[[pci]]
device = 1
registers = { 0 = 0x1C0310DE, 8 = 0x03000000 }
temperatures = [40]
)";
constexpr const char* kNeeded =
    "chip.own.ec.set_pwm.cmd=1\nchip.codec.hdabar=0xFE5C0000\ntest.graphics.1.PCI_IDS=10DE 1C03\n"
    "test.tempcaution.processor.1.manufacturer=Intel\ntest.tempcaution.processor.1.familyid=6\n"
    "test.tempcaution.processor.1.mechanism=msr\n";

TEST(ChipTable, EveryClassLooksUpItsKeysAndNoOthers) {
  ASSERT_EQ(std::size(kKeys), ChipRows().size());
  for (const KeyRow& row : kKeys) {
    const std::string name = row.chip;
    KeyBench bench(kHardware, "chip." + name + ".data=own\n" + kNeeded);
    SetSelectedSystem({"Intel", 6, "", ""});
    IniReader& reader = IniReader::Instance();
    reader.ForgetLookups();
    const std::unique_ptr<Chip> chip = MakeChip(name);
    chip->Initialize();
    AskEverything(*chip, 0);
    AskEverything(*chip, 1);
    bench.machine.ClearOutput();
    reader.DumpLookups();
    std::set<std::string> lookedUp;
    std::istringstream lines(bench.machine.Output());
    std::string line;
    for (std::getline(lines, line); std::getline(lines, line);) {
      std::string entry = line.substr(0, line.find(" = "));
      lookedUp.insert(entry.starts_with("7D10 ") ? entry.substr(5) : entry.replace(entry.find(' '), 1, "/"));
    }
    std::istringstream keys(row.layered + " " + Under("own/", row.section) + Under(name + "/", row.named));
    EXPECT_EQ(lookedUp, std::set<std::string>(std::istream_iterator<std::string>(keys), {})) << name;
  }
}

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
