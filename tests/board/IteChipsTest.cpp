// What the ITE classes with registers in code do on the ports, request by request.
#include <gmock/gmock.h>

#include <climits>

#include "board/ChipCases.h"
#include "board/chips/ite/Ite8721Chip.h"
#include "board/chips/ite/Ite8772Chip.h"

namespace panelglow {
namespace {

struct ItePart {
  std::string keys = "";
  const char* port = "0x2E";
  const char* lastKey = "0x55";
  const char* version = "0x02";  // third register of the part's id
  const char* monitorBase = "60 = 0x02\n61 = 0x90\n";
};

class IteBench : public KeyBench {
 public:
  explicit IteBench(const ItePart& part = {})
      : KeyBench(
            std::string("[[chip]]\nname = \"s\"\nkind = \"super-io\"\nfamily = \"ite\"\nbase = ") + part.port +
                "\nenter = [0x87, 0x01, 0x55, " + part.lastKey + "]\nchip_id = [0x87, 0x20, " + part.version +
                "]\n[chip.registers]\n26 = 0x30\n27 = 0x31\n"
                "[[chip.device]]\nnumber = 4\n[chip.device.registers]\n30 = 1\n" +
                part.monitorBase +
                "[[chip.device]]\nnumber = 7\n[chip.device.registers]\n62 = 0x0A\n63 = 0x20\nB1 = 0x01\nB2 = 0x02\n"
                "C2 = 0x03\nF8 = 0x16\nF9 = 0x04\nFA = 0x17\nFB = 0x06\n"
                "[chip.environment]\ndevice = 4\n[chip.environment.settings]\n00 = 0x19\n13 = 0x07\n14 = 0xDF\n0B = "
                "0xC9\n"
                "0C = 0x05\n15 = 0x91\n16 = 0xD2\n17 = 0x13\n63 = 0x63\n6B = 0x6B\n73 = 0x73\n"
                "[chip.environment.sensors]\n0D = 0x12\n18 = 0x01\n0E = 0xFF\n19 = 0xFF\n1A = 0x03\n80 = 0x80\n82 = "
                "0x34\n"
                "83 = 0x12\n29 = 0x29\n2A = 0x7E\n2B = 0x7D\n40 = 0x01\n41 = 0x14\n43 = 0x15\n44 = 0x02\n"
                "[chip.environment.intrusion]\nstatus = 1\nstatus_bit = 4\nclear = 0\nclear_bit = 5\nwas_opened = "
                "true\n"
                "[[chip.gpio]]\n[[chip.gpio]]\ninputs = 0x08\n",
            part.keys) {}
};

std::string Monitor(const std::string& accesses) { return Accesses("0295", "0296", accesses); }

// Configuration mode at 0x2E, closed by a bit of register 2, which reads as 0.
std::string Config(const std::string& accesses) {
  return "002E<-87 002E<-01 002E<-55 002E<-55 " + Accesses("002E", "002F", accesses) + "002E<-02 002F->00 002F<-02 ";
}
std::string Led(const std::string& accesses) { return Config("07<-07 " + accesses); }

TEST(IteChip, FansAreRegistersOfTheMonitor) {
  IteBench bench;
  IteChip chip;
  ExpectCases(bench, chip,
              {{Tach(1), 0x112, Monitor("0D->12 18->01")},
               {Tach(2), 0xFFFF, Monitor("0E->FF 19->FF")},
               {Tach(3), 0x300, Monitor("0F->00 1A->03")},
               {Tach(4), 0x80, Monitor("80->80 81->00")},
               {Tach(5), 0x1234, Monitor("82->34 83->12")},
               {&Chip::RestoreFanState, 1, ""},
               {Manual(true), 1,
                Monitor("00->19 13->07 14->DF 0B->C9 0C->05 15->91 16->D2 17->13 13<-77 14<-D7 0B<-09 00<-18")},
               {Manual(true), 1, ""},
               {Duty(1, 300), 1, Monitor("15<-7F")},
               {Duty(3, -5), 1, Monitor("17<-00")},
               {Duty(0, 1), 0, ""},
               {Duty(4, 1), 0, ""},
               {Full(1), 0, ""},
               {Manual(false), 1, Monitor("0B<-C9 0C<-05 15<-91 16<-D2 17<-13 14<-DF 13<-07 00<-19") + "2000ms "},
               {Manual(false), 1, ""}});
  EXPECT_EQ(bench.machine.Output(), "");
  ExpectCases(bench, chip, {{Tach(6), 0xFFFF, ""}});
  EXPECT_EQ(bench.machine.Output(), "\n***** ITE error: invalid fan index 6\n");
  EXPECT_EQ(chip.TachToRpm(0x112, 7), 1350000 / (0x112 * 2));
  EXPECT_EQ(chip.TachToRpm(0, 7) + chip.TachToRpm(0xFFFF, 7), 0);
}

TEST(IteChip, ZonesHaveReadingsAndLowLimits) {
  IteBench bench;
  IteChip chip;
  ExpectCases(bench, chip,
              {{Zone(1), 0x29, Monitor("29->29")},
               {Zone(2), 255, Monitor("2A->7E")},
               {Zone(3), 125, Monitor("2B->7D")},
               {Zone(4), -1255, ""},
               {Limit(1), 0x114, Monitor("41->14 40->01")},
               {Limit(2), 0x15, Monitor("43->15 42->00")},
               {Limit(3), 0x200, Monitor("45->00 44->02")},
               {Limit(INT_MIN), -1000, ""},
               {Line(237), -1, ""}});
  EXPECT_EQ(bench.machine.Output(),
            "\n***** Ite::ReadTemperature CALLED WITH INVALID ZONE NUMBER = 4 (must be 1,2, or 3)\n"
            "\n***** ITE error: invalid temp zone -2147483648\n");
}

TEST(IteChip, TheLedIsALineThatBlinks) {
  IteBench bench;
  IteChip chip;
  ExpectLed(bench, chip, Led,
            {"F8->16 F9->04 26->30 B1->01", "F8<-12 F9<-02", "26<-0C B1<-04 F8<-13 F9<-02", "", "-", "-",
             "F8<-16 F9<-04 26<-30 B1<-01"});
}

TEST(IteChip, TheFilesNameTheLinesAndTheMonitor) {
  IteBench bench(
      {"chip.ite.powerled.color.primary.gpio=57\nchip.ite.powerled.color.secondary.gpio=10\n"
       "chip.ite.hwmbar=0x390\n"});
  IteChip chip;
  ExpectCases(bench, chip,
              {{&Chip::AssertPowerLedGreen, 1, Led("F8<-2F F9<-02")},
               {&Chip::AssertPowerLedRed, 1, Led("26<-0C B1<-04 F8<-08 F9<-02")},
               {Duty(1, 2), 1, Accesses("0395", "0396", "15<-01")}});
}

TEST(Ite8758Chip, TakesItsFansOverUnlessThePartObeysByNature) {
  const std::string saved = "15->91 63->63 16->D2 6B->6B 17->13 73->73 ";
  for (const bool byNature : {false, true}) {
    IteBench bench({.version = byNature ? "0x05" : "0x02"});
    Ite8758Chip chip;
    ExpectCases(bench, chip,
                {{Manual(true), 1, Monitor(saved + (byNature ? "" : "15<-11 16<-12 17<-13"))},
                 {Duty(1, 300), 1, Monitor("63<-FF")},
                 {Duty(2, 101), 1, Monitor("6B<-65")},
                 {Duty(3, INT_MIN), 1, Monitor("73<-00")},
                 {Duty(4, 1), 0, ""},
                 {Tach(3), 0x300, Monitor("0F->00 1A->03")},
                 {Tach(4), 0xFFFF, ""},
                 {&Chip::RestoreFanState, 1, Monitor("15<-91 63<-63 16<-D2 6B<-6B 17<-13 73<-73") + "2000ms "}});
    EXPECT_EQ(bench.machine.Output(), "\n***** ITE_8758 error: invalid fan index 4\n");
  }
}

TEST(Ite8758Chip, TheLedIsOneLine) {
  IteBench bench;
  Ite8758Chip chip;
  ExpectLed(bench, chip, Led, {"F8->16 F9->04", "F8<-12 F9<-02", "F8<-13 F9<-02", "", "-", "-", "F8<-16 F9<-04"});
}

TEST(Ite8721Chip, BlinksOneLineOrTwo) {
  IteBench bench;
  Ite8721Chip chip;
  ExpectLed(bench, chip, Led,
            {"F8->16 F9->04 27->31 B2->02 C2->03 FA->17 FB->06", "F8<-12 F9<-02", "F8<-13 F9<-02", "",
             "27<-30 B2<-00 C2<-00 F8<-12 F9<-02", "27<-30 B2<-00 C2<-00 F8<-12 F9<-03 FA<-13 FB<-02",
             "F8<-16 F9<-04 27<-31 B2<-02 C2<-03 FA<-17 FB<-06"});
}

TEST(Ite8721Chip, HasLinesInPortsAndWatchesTheHood) {
  IteBench bench({.keys = "chip.ite_8721.hwmbar=0x390\n", .monitorBase = "60 = 0x0A\n61 = 0x10\n"});
  Ite8721Chip chip;
  bool opened = true;
  ExpectCases(bench, chip,
              {{Line(23), 3, "0A21->08 "},
               {Line(22), 4, "0A21->08 "},
               {Line(13), 4, "0A20->00 "},
               {Line(INT_MIN), -1, ""},
               {[&](Chip& c) { return c.ReadIntrusionLatch(INT_MAX, false, opened) && !opened; }, 1,
                Accesses("0A15", "0A16", "00->19 00<-39 01->00")}});
}

TEST(Ite8772Chip, DrivesItsSecondAndThirdFan) {
  IteBench bench({.version = "0x05"});
  Ite8772Chip chip;
  ExpectCases(bench, chip,
              {{Tach(2), 0xFFFF, Monitor("0E->FF 19->FF")},
               {Tach(3), 0x300, Monitor("0F->00 1A->03")},
               {Manual(true), 1, Monitor("16->D2 6B->6B 17->13 73->73 16<-12 17<-13")},
               {Duty(2, 300), 1, Monitor("6B<-FF")},
               {Duty(3, 101), 1, Monitor("73<-65")},
               {Manual(false), 1, Monitor("16<-D2 6B<-6B 17<-13 73<-73") + "2500ms "},
               {Tach(1), 0xFFFF, ""},
               {Duty(1, 101), 0, ""}});
  EXPECT_EQ(bench.machine.Output(),
            "***** ITE_8772 error: invalid fan index 1 (only 2,3 supported)"
            "\n***** ITE_8772 error: invalid fan index 1\n");
  ExpectLed(bench, chip, Led,
            {"26->30 F8->16 F9->04 FA->17 FB->06", "F8<-12 F9<-02", "F8<-13 F9<-02", "", "26<-0C F8<-12 F9<-02",
             "26<-0C F8<-12 F9<-03 FA<-13 FB<-02", "26<-30 F8<-16 F9<-04 FA<-17 FB<-06"});
}

// Each class is at its own port, also where the keys of its bases name others; another port has another last key.
TEST(IteFamily, EveryClassHasKeysOfItsOwn) {
  for (const std::string name : {"ite_8758", "ite_8721", "ite_8772"}) {
    const std::string bases = name == "ite_8758" ? "" : "chip.ite_8758.cfgbar=0x111\nchip.ite_8758.hwmbar=0x111\n";
    const std::string own = "chip." + name + ".";
    IteBench bench({.keys = "chip.ite.hwmbar=0x111\nchip.ite.powerled.color.primary.gpio=30\n" + bases + own +
                            "cfgbar=0x4E\n" + own + "gpiobar=0xB00\n",
                    .port = "0x4E",
                    .lastKey = "0xAA"});
    const auto config = [](const std::string& accesses) {
      return "004E<-87 004E<-01 004E<-55 004E<-AA " + Accesses("004E", "004F", accesses) +
             "004E<-02 004F->00 004F<-02 ";
    };
    std::unique_ptr<Chip> chip;
    EXPECT_THAT(
        bench.Traffic([&] { chip = MakeChip(name); }),
        testing::MatchesRegex("([0-9]+ms )?" + config("20->87 21->20 22->02")));  // after the time of the keys
    ExpectCases(bench, *chip,
                {{&Chip::AssertPowerLedGreen, 1, config("07<-07 F8<-18 F9<-02")},
                 {Duty(3, 1), 1, Monitor("73<-01")},
                 {Line(10), name == "ite_8721" ? 3 : -1, name == "ite_8721" ? "0B00->FF " : ""}});
  }
}

}  // namespace
}  // namespace panelglow
