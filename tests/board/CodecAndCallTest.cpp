// What the audio codec does in its controller's memory, and the firmware's call in the firmware, for each operation.
#include <gmock/gmock.h>

#include <functional>

#include "board/ChipCases.h"
#include "board/chips/firmware/CaslChip.h"
#include "board/chips/generic/GCodecChip.h"
#include "harness/base/CDMException.h"

namespace panelglow {
namespace {

using ::testing::HasSubstr;
using ::testing::ThrowsMessage;
using Operation = bool (Chip::*)();

// ---- the audio codec

constexpr const char* kVerbs =
    "[g_codec]\ncodecgpio.state.set.sequence=0x00171600 0x00171700,0x00171500\n"
    "codecgpio.state.save.sequence=0x001F1600,0x001F1700,0x001F1500\n"
    "codecgpio.state.restore.sequence=0x00271600,0x00271700,0x00271500\n";
constexpr const char* kCodec = "chip = [{name = \"codec\", kind = \"hda-codec\", base = 0xFE0F0000, enable = 5}]\n";

TEST(GCodecChip, AVerbIsSentThroughTheImmediateCommandRegisters) {
  KeyBench bench(kCodec, "chip.codec.hdabar=0xFE0F000F\n", kVerbs);
  GCodecChip chip;
  EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(chip.SendVerb(0x001F1600), 5U); }),
            "FE0F0060<-00000000 FE0F0068->00 FE0F0069->00 FE0F0060<-00161F00 10ms FE0F0068<-01 FE0F0069<-00 "
            "FE0F0068->01 FE0F0069->00 "
            "10ms FE0F0068->02 FE0F0069->00 FE0F0064->05000000 ");
  EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(chip.SendVerb(0x201F1600), 0U); }),  // nobody there
            "FE0F0060<-00000000 FE0F0068->02 FE0F0069->00 FE0F0068<-02 FE0F0069<-00 FE0F0060<-00161F20 10ms "
            "FE0F0068<-01 FE0F0069<-00 "
            "FE0F0068->01 FE0F0069->00 10ms FE0F0068->00 FE0F0069->00 ");
}

TEST(GCodecChip, ABusyControllerCostsFourMoreLooksAtTheStatusInAll) {
  const std::string busy = "10ms FE0F0068->01 FE0F0069->00 ";
  const std::string begin = "FE0F0060<-00000000 FE0F0068->01 FE0F0069->00 ";
  // Memory in the controller's place: its start bit stays as it is written.
  KeyBench bench("", "chip.codec.hdabar=0xFE0F0000\n", kVerbs);
  GCodecChip chip;
  bench.machine.Hardware().WriteMemory(0xFE0F0068, 1);
  EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(chip.SendVerb(1), 0U); }), begin + busy + busy + busy + busy);
  bench.machine.Time().At(bench.machine.Time().Now() + 25'000,
                          [&] { bench.machine.Hardware().WriteMemory(0xFE0F0068, 0); });
  EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(chip.SendVerb(1), 0U); }),
            begin + busy + busy +
                "10ms FE0F0068->00 FE0F0069->00 FE0F0060<-01000000 10ms FE0F0068<-01 FE0F0069<-00 FE0F0068->01 "
                "FE0F0069->00 " +
                busy);
}

TEST(GCodecChip, WithoutADriverALampTakesItsTimeAndDoesNothing) {
  KeyBench bench("driver = {present = false}\n", "chip.codec.hdabar=0xFE0F0000\n", kVerbs);
  GCodecChip chip;
  EXPECT_EQ(bench.Traffic([&] { EXPECT_TRUE(chip.SaveSpeakerLedState() && chip.AssertSpeakerLed()); }), "70ms ");
}

TEST(GCodecChip, ALampIsThreeVerbsWithTheSavedPinsAndItsOwn) {
  // Registers that never change: always idle, always with the answer 0xABCD0085.
  KeyBench bench(
      "chip = [{name = \"hda\", kind = \"memory-registers\", base = 0xFE0F0000,"
      " initial = [0, 0, 0, 0, 0x85, 0x00, 0xCD, 0xAB, 2, 0]}]\n",
      "chip.codec.hdabar=0xFE0F0000\nchip.g_codec.codec.icw.reg=0\nchip.g_codec.codec.irr.reg=4\n"
      "chip.g_codec.codec.ics.reg=8\n",
      kVerbs);
  bench.machine.Hardware().IgnoreWrites("hda", 0xFE0F0008);
  GCodecChip chip;
  // The verbs, low byte first, and the waits.
  const auto verbs = [&](Operation operation) {
    std::vector<std::string> words;
    CDMUtil::Split(bench.Traffic([&] { EXPECT_TRUE((chip.*operation)()); }), words, " ");
    std::string text;
    for (const std::string& word : words) {
      const bool isVerb = word.rfind("FE0F0000<-", 0) == 0 && word != "FE0F0000<-00000000";
      text += isVerb ? word.substr(10) + " " : word.find("ms") != std::string::npos ? word + " " : "";
    }
    return text;
  };
  std::string blink = "8D161700 10ms 8D171700 10ms ";
  for (int round = 0; round < 51; ++round) {
    blink += round % 2 == 0 ? "85151700 10ms 500ms " : "8D151700 10ms 500ms ";
  }
  EXPECT_EQ(verbs(&Chip::RestoreSpeakerLedState), "");  // nothing is saved yet
  const std::pair<Operation, std::string> kOperations[] = {
      {&Chip::SaveSpeakerLedState, "00161F00 10ms 00171F00 10ms 00151F00 10ms "},
      {&Chip::AssertSpeakerLed, "85161700 10ms 85171700 10ms 84151700 10ms 10ms "},
      {&Chip::DeassertSpeakerLed, "85161700 10ms 85171700 10ms 85151700 10ms 10ms "},
      {&Chip::AssertMicrophoneLed, "8D161700 10ms 8D171700 10ms 85151700 10ms 10ms "},
      {&Chip::DeassertMicrophoneLed, "8D161700 10ms 8D171700 10ms 8D151700 10ms 10ms "},
      {&Chip::BlinkMicrophoneLed, blink},
      {&Chip::RestoreSpeakerLedState, "8516EFAB 10ms 8517EFAB 10ms 8515EFAB 10ms "},
  };
  for (const auto& [operation, traffic] : kOperations) {
    EXPECT_EQ(verbs(operation), traffic);
  }
}

TEST(GCodecChip, AListWithoutExactlyThreeVerbsServesNoLamp) {
  for (const std::string list : {"0x1,0x2", "1,2,3,4", "undef"}) {
    KeyBench bench(kCodec, "chip.codec.hdabar=0xFE0F0000\n",
                   "[g_codec]\ncodecgpio.state.set.sequence=" + list + "\ncodecgpio.state.save.sequence=" + list +
                       "\ncodecgpio.state.restore.sequence=" + list + "\n");
    GCodecChip chip;
    EXPECT_EQ(bench.Traffic([&] {
      EXPECT_FALSE(chip.SaveSpeakerLedState() || chip.RestoreSpeakerLedState() || chip.AssertSpeakerLed() ||
                   chip.DeassertSpeakerLed() || chip.AssertMicrophoneLed() || chip.DeassertMicrophoneLed() ||
                   chip.BlinkSpeakerLed() || chip.BlinkMicrophoneLed());
    }),
              "")
        << list;
  }
}

TEST(GCodecChip, ItsControllerIsFoundByPlaceOrByTheFilesBase) {
  const auto base = [](const std::string& settings) {
    KeyBench bench(
        "pci = [{device = 0x1B, function = 2, registers = {\"10\" = 0xF7F10004, \"14\" = 0}},"
        " {bus = 5, device = 0x1B, function = 2, registers = {\"14\" = 0xE7F10004, \"18\" = 0}}]\n",
        settings, "");
    GCodecChip chip;
    return bench.Traffic([&] { chip.SendVerb(1); }).substr(0, 8);
  };
  EXPECT_EQ(base("chip.codec.pciloc=0x001B0210\nchip.codec.hdabar=0xFE0F0000\n"), "F7F10060");
  EXPECT_EQ(base("chip.codec.pciloc=0x051B0214\n"), "E7F10060");
  EXPECT_EQ(base("chip.codec.pciloc=0x001B0110\nchip.codec.hdabar=0xF0000000\n"), "F0000060");  // nothing there
  for (const char* settings : {"", "chip.codec.hdabar=15\n", "chip.codec.pciloc=0x001B0110\n"}) {
    EXPECT_THAT([&] { base(settings); },
                ThrowsMessage<mblib_exception>("mbdetec.ini missing mandatory entry for codec: chip.codec.hdabar"));
  }
}

// ---- the firmware's call

constexpr const char* kFirmware =
    "[firmware_call]\nheader = [2, 9]\nradio = [{number = 1, offset = 6, on = true}, {number = 2, offset = 18, on ="
    " false}]\nfan = [{speed = 24, duty = 0x60}, {speed = 0, duty = 0x61}]\ntemperatures = [41, 38]\n";

TEST(CaslChip, TheRadiosGoBackToWhatTheListedDevicesWere) {
  const std::pair<std::string, bool> kDevices[] = {
      {"6", true}, {"18, 6", true}, {"18", false}, {"undef", false}, {"4000", false}};
  for (const auto& [devices, on] : kDevices) {
    KeyBench bench(kFirmware, "", "[casl]\nwireless.devices.buffer=" + devices + "\n");
    CaslChip chip;
    EXPECT_EQ(bench.Traffic([&] { EXPECT_TRUE(chip.RestoreWirelessLedState()); }), "");  // nothing is saved yet
    EXPECT_TRUE(chip.SaveWirelessLedState());  // the first operation reads the keys and the header, too
    EXPECT_EQ(bench.Traffic([&] { EXPECT_TRUE(chip.DeassertWirelessLed()); }), "2ms ");
    EXPECT_THAT(bench.machine.HardwareState(), HasSubstr("radio 01 = off\nradio 02 = off\n"));
    EXPECT_TRUE(chip.AssertWirelessLed());
    EXPECT_THAT(bench.machine.HardwareState(), HasSubstr("radio 01 = on\nradio 02 = on\n"));
    EXPECT_TRUE(chip.RestoreWirelessLedState());
    EXPECT_THAT(bench.machine.HardwareState(), HasSubstr(on ? "radio 01 = on" : "radio 01 = off")) << devices;
  }
}

TEST(CaslChip, ALatchedReadSwitchesTheRadiosWhenTheFirstDeviceIsNotAsWanted) {
  KeyBench bench(kFirmware, "", "[casl]\nwireless.devices.buffer=6\nwireless.powercontrol=1\n");
  CaslChip chip;
  const std::tuple<int, bool, const char*> kSteps[] = {
      {1, false, "on"}, {0, true, "off"}, {0, false, "off"}, {2, true, "off"}, {1, true, "on"}};
  for (const auto& [wanted, isChanged, state] : kSteps) {
    bool changed = !isChanged;
    EXPECT_TRUE(chip.ReadLatchedPort(0, wanted, changed));
    EXPECT_EQ(changed, isChanged) << wanted;
    EXPECT_THAT(bench.machine.HardwareState(), HasSubstr(std::string("radio 01 = ") + state + "\nradio 02 = off\n"));
  }
}

TEST(CaslChip, FansAndTemperaturesAreItemsOfCountedRecords) {
  KeyBench bench(kFirmware);
  CaslChip chip;
  int value = 7;
  EXPECT_FALSE(chip.ReadFanRpm(1, value, 100) || chip.ReadFanRpm(2, value, 100) || value != 7);
  EXPECT_TRUE(chip.ReadFanRpm(0, value, 100) && value == 2400);
  EXPECT_TRUE(chip.ReadVirtualTemperature(1, false, value) && value == 38);
  EXPECT_FALSE(chip.ReadVirtualTemperature(3, false, value) || chip.ReadVirtualTemperature(-1, false, value));
  const std::pair<std::function<bool()>, const char*> kDuties[] = {
      {[&] { return chip.SetFanPwm(1, 300); }, "fan 0 duty = 60\nfan 1 duty = FE\n"},
      {[&] { return chip.SetFanPwm(0, -3); }, "fan 0 duty = 01\nfan 1 duty = FE\n"},
      {[&] { return chip.SetFanPwmPercent(1, 50); }, "fan 0 duty = 01\nfan 1 duty = 7F\n"},
      {[&] { return chip.SetFanFullSpeed(0); }, "fan 0 duty = FE\nfan 1 duty = 7F\n"}};
  for (const auto& [set, duties] : kDuties) {
    EXPECT_TRUE(set());
    EXPECT_THAT(bench.machine.HardwareState(), HasSubstr(duties));
  }
}

TEST(CaslChip, WhatAnEarlierRecordLeftBehindTheLastFanIsNoFan) {
  KeyBench bench(std::string(kFirmware) + "fault = \"stale-record\"\n");
  int value = 0;
  EXPECT_TRUE(CaslChip().ReadFanRpm(0, value, 100));
  EXPECT_FALSE(CaslChip().ReadFanRpm(2, value, 100) || CaslChip().ReadFanRpm(-1, value, 100));
}

TEST(CaslChip, AFailingCallSaysAtWhichStep) {
  const std::pair<const char*, const char*> kFaults[] = {{"wrong-signature", "tmbWMI call (1,1279869254)"},
                                                         {"short-data", "WMI call Return Size Discovery"},
                                                         {"get-method", "WMI call GetMethod"},
                                                         {"get-class", "WMI call Get tmbBIntM"},
                                                         {"spawn-parameters", "WMI call Spawn Parameters"},
                                                         {"get-input-class", "WMI call Get tmbBDataIn"},
                                                         {"spawn-input", "WMI call Spawn tmbBDataIn"},
                                                         {"populate-input", "WMI call Populate tmbBDataIn"},
                                                         {"put-input", "WMI call Put tmbBDataIn"},
                                                         {"execute", "WMI call Execute Method"},
                                                         {"get-output", "WMI call Get OutData"},
                                                         {"query-output", "WMI call Query OutData"},
                                                         {"", "WMI call tmbBIntM Query"}};  // no such interface
  for (const auto& [fault, text] : kFaults) {
    KeyBench bench(*fault == '\0' ? "" : kFirmware + ("fault = \"" + std::string(fault) + "\"\n"));
    try {
      CaslChip().AssertWirelessLed();
      ADD_FAILURE() << text;
    } catch (const CDMException& failure) {
      failure.Report();
    }
    EXPECT_EQ(bench.machine.Output(),
              "LogMessage 8 995174 \"" + std::string(text) + " failed.\" \"\"\nTestFailed 995174 \"\"\n");
  }
}

}  // namespace
}  // namespace panelglow
