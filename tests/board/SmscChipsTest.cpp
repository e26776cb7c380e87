// What the SMSC and VIA classes with registers in code do on the ports, request by request.
#include "board/SuperIoTraffic.h"

namespace panelglow {
namespace {

// A monitor at 0x480; no other part of the Super-I/O is used.
std::string SmscMonitor(const char* base) {
  return SuperIo(0x164E, "0x55",
                 Device(4, std::string("30 = 1\n") + base) +
                     Environment(4,
                                 "28 = 0x34\n29 = 0x12\n3A = 0x35\n3B = 0x13\n40 = 0xFE\n5C = 0x01\n5D = 0x02\n"
                                 "5E = 0x03\n62 = 0x77\n63 = 0x66\n25 = 0x2A\n26 = 0x80\n27 = 0xF6\n80 = 0x30\n"
                                 "69 = 0x55\nA4 = 0x0F\nA0 = 0x31\nA5 = 0x0D\nA1 = 0x32\nA6 = 0x0C\nA2 = 0x33\n",
                                 0));
}

TEST(SioChips, MonitorLinesHoodLockAndLed) {
  const auto intruder = [](int line) {
    return [=](Chip& c) {
      bool value = true;
      return c.ReadIntrusionLatch(line, false, value) ? int{value} : -1;
    };
  };
  const auto activity = [](int line) {
    return [=](Chip& c) {
      int value = 7;
      return c.ReadLineActivity(line, value) ? 100 + value : value;
    };
  };
  const std::string hardware = SmscMonitor("60 = 0x04\n61 = 0x80") + Ports(0x433, 0xFF, 0x0F) + Ports(0x44B, 0x80) +
                               Ports(0x44D, 0x3D) + Ports(0x451, 0x01, 0x20);
  const std::string printed =
      Expect("sio", hardware + Ports(0x45C, 0, 0x10),
             {{Tach(1), 0x1234, At(0x480, "28->34 29->12")},
              {Tach(5), 0, At(0x480, "34->00 35->00")},
              {Tach(8), 0x1335, At(0x480, "3A->35 3B->13")},
              {Tach(9), 0xFFFF, ""},
              {Duty(2, 0x180), 1, At(0x480, "31<-80")},
              {Duty(0, 0x180), 0, ""},
              {Full(1), 0, ""},
              {Manual(true), 1,
               At(0x480, "40->FE 5C->01 5D->02 5E->03 62->77 63->66 40<-FD 5C<-E1 5D<-E2 5E<-E3 62<-70 63<-00")},
              {&Chip::RestoreFanState, 1, At(0x480, "40<-FE 5C<-01 5D<-02 5E<-03 62<-77 63<-66")},
              {Zone(1), 0x2A, At(0x480, "25->2A")},
              {Zone(2), 255, At(0x480, "26->80")},
              {Zone(3), -10, At(0x480, "27->F6")},
              {Zone(4), 0x30, At(0x480, "80->30")},
              {Zone(5), -1000, ""},
              {Limit(1), 0, At(0x480, "67->00")},
              {Limit(2), 0, At(0x480, "68->00")},
              {Limit(3), 0x55, At(0x480, "69->55")},
              {Limit(4), 0, At(0x480, "83->00")},
              {Line(17), 3, "044B->80 "},
              {Line(36), 4, "044D->3D "},
              {Line(70), 3, "0451->01 "},
              {Line(85), 3, "0452->20 "},
              {Line(86), -1, ""},
              {Line(18), -1, ""},
              {activity(86), -1, ""},
              {intruder(238), 0, ""},
              {intruder(17), 1, "044B->80 "},
              {intruder(9), -1, ""},
              {Hood(true, 17, false), 1, "045D->10 045D<-11 "},
              {Hood(true, 17, true), 0, "045D->10 045D<-11 10ms 044B->80 "},
              {Hood(false, 17, true), 1, "045D->10 045D<-12 10ms 044B->80 "},
              {Red, 1, ""},
              {&Chip::RestorePowerLedState, 1, ""},
              {&Chip::SavePowerLedState, 1, "0433->FF 0433<-FB 0434->0F 0434<-0B "},
              {&Chip::AssertPowerLedGreen, 1, "044D->3D 044D<-3E "},
              {&Chip::AssertPowerLedRed, 1, "044D->3E 044D<-3D "},
              {&Chip::DeassertPowerLed, 1, "044D->3D 044D<-3C "},
              {&Chip::RestorePowerLedState, 1, "0433->FB 0433<-FF 0434->0F 0434<-0F "},
              {&Chip::RestorePowerLedState, 1, ""}});
  EXPECT_EQ(printed, "\n SIO Detection using SIO INTRUDER signal (is a STUB!!!)\n");
  const KeyBench bench(Ports(0x44B, 0x80));
  EXPECT_EQ(activity(17)(*MakeChip("sio")), 101);
  Expect("sio", Ports(0x45C, 0, 0x13), {{Hood(false, 17, false), 0, "045D->13 " + Repeated(39, "75ms 045D->13 ")}});
  Expect("sio", Ports(0x534, 0, 4), {{Hood(true, 17, false), 1, "0535->04 0535<-05 "}, {Line(17), 3, "054B->FF "}},
         "chip.sio.pmbar=0x500\nchip.sio.hoodlockoffset=0x35\n");
  Expect("sio", "", {{Zone(1), -1, At(0x295, "25->FF")}}, "chip.sio.hwmbar=0x295\n");
}

TEST(SioChips, TheSch5327bKeepsItsLedInRuntimeRegisters) {
  const std::string part =
      SuperIo(0x2E, "0x55", Device(10, "60 = 0x06\n61 = 0x00")) + Ports(0x65B, 0x20) + Ports(0x677, 0x11);
  const auto open = [](const std::string& requests) { return "002E<-55 " + requests + "002E<-AA "; };
  ExpectConstruction("smsc_sch5327b", part, open(At(0x2E, "07<-0A 60->06 61->00")));
  ExpectLedOf("smsc_sch5327b", part, open("065B->20 0677->11 "), open("065B<-2E 0677<-00 "),
              open("065B<-2F 0677<-00 "), open("065B<-00 0677<-00 "), open("065B<-20 0677<-11 "));
  Expect("smsc_sch5327b", SmscMonitor("60 = 0x08\n61 = 0x80") + Ports(0xF84B, 0x80),
         {{Manual(true), 1,
           At(0x880, "A4->0F A0->31 A5->0D A1->32 A6->0C A2->33 A4->0F A4<-07 A5->0D A5<-05 A6->0C A6<-04")},
          {Duty(3, 0x180), 1, At(0x880, "A2<-80")},
          {&Chip::RestoreFanState, 1, At(0x880, "A4<-0F A0<-31 A5<-0D A1<-32 A6<-0C A2<-33") + "2000ms "},
          {Line(17), 3, "F84B->80 "},
          {Red, 1, ""}});
  Expect("smsc_sch5327b", part,
         {{&Chip::SavePowerLedState, 1, open("065B->20 0677->11 ")},
          {&Chip::AssertPowerLedGreen, 1, open("065B<-21 0677<-00 ")},
          {&Chip::AssertPowerLedRed, 1, open("065B<-22 0677<-00 ")}},
         "chip.smsc_sch5327b.multifunction_select2_register.green=1\n"
         "chip.smsc_sch5327b.multifunction_select2_register.red=2\n");
  Expect("smsc_sch5327b", part, {{&Chip::SavePowerLedState, 0, ""}}, "chip.smsc_sch5327b.cfgbar=0x4E\n");
}

TEST(SioChips, APartIsLookedForAtBothPlaces) {
  const std::string runtime = Device(10, "30 = 1\n60 = 0x06\n61 = 0x00");
  const std::string ports = Ports(0x647, 0x2B) + Ports(0x65D, 0x17);
  const std::string monitor = Environment(10, "26 = 0x26\n25 = 0x25\n27 = 0x27\n", 0x70);
  const auto base = [](unsigned port) {
    return Hex(port) + "<-55 " + At(port, "07<-0A 60->06 61->00") + Hex(port) + "<-AA ";
  };
  ExpectConstruction("smsc5407", SuperIo(0x2E, "0x55", runtime) + ports, "002E<-55 002F->00 002E<-AA " + base(0x2E));
  const std::string second = SuperIo(0x4E, "0x55", runtime + monitor) + ports;
  ExpectConstruction("smsc5407", second, "002E<-55 002F->FF 002E<-AA " + base(0x4E));
  Expect("smsc5407", second,
         {{Zone(1), 0x26, At(0x670, "26->26")},
          {Zone(2), 0x25, At(0x670, "25->25")},
          {Zone(3), 0x27, At(0x670, "27->27")},
          {&Chip::DeassertPowerLed, 1, ""}});
  ExpectLedOf("smsc5407", second, "0647->2B 065D->17 ", "0647<-27 065D<-14 ", "-", "065D<-17 0647<-2B ",
              "065D<-17 0647<-2B ");

  const std::string via =
      SuperIo(0x4E, "0x87, 0x87",
              Device(8, "60 = 0x05") + Device(10, "60 = 0x06\n61 = 0x10") + Device(11, "60 = 0x0C")) +
      Ports(0x62C, 0x15) + Ports(0xC1F, 0x31, 0x33) + Ports(0xC21, 0x32);
  ExpectConstruction("vt1211", via,
                     "002E<-87 002E<-87 002F->FF 002E<-AA " + Open(At(0x4E, "07<-08 60->05 61->00")) +
                         Open(At(0x4E, "07<-0A 60->06 61->10")) + Open(At(0x4E, "07<-0B 60->0C 61->00")));
  Expect("vt1211", via, {{Zone(1), 0x31, "0C1F->31 "}, {Zone(2), 0x32, "0C21->32 "}, {Zone(3), 0x33, "0C20->33 "}});
  ExpectLedOf("vt1211", via, Open(At(0x4E, "07<-0A 30->00 30<-01") + "062C->15 062C<-12 "), "", "-", "",
              Open("062C<-15 " + At(0x4E, "07<-0A 30<-00")));
}

// Also a part that opens and reads as nobody, and one whose reader is told to end.
TEST(SioChips, APartThatIsLookedForIsClosedAgain) {
  bool isDone = false;
  for (platform::sim::Microseconds step = 0; !isDone; step += 2) {
    KeyBench bench(SuperIo(0x2E, "0x55", "[chip.registers]\n00 = 0xFF\n"));
    bench.EndAfter(step, [&] {
      MakeChip("smsc5407");
      isDone = true;
    });
    EXPECT_THAT(bench.machine.HardwareState(), ::testing::HasSubstr("configuration mode = closed")) << step;
  }
}

TEST(SioChips, ATakeoverThatIsInterruptedCanBePutBack) {
  ExpectInterruptedCanBePutBack("sio", SmscMonitor("60 = 0x04\n61 = 0x80") + Ports(0x433, 0xFF));
  ExpectInterruptedCanBePutBack("vt1211", SuperIo(0x2E, "0x87, 0x87", Device(10, "60 = 0x06")) + Ports(0x61C, 0x15));
}

}  // namespace
}  // namespace panelglow
