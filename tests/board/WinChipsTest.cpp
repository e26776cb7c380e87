// What the Winbond and Nuvoton classes with registers in code do on the ports, request by request.
#include <climits>

#include "board/SuperIoTraffic.h"

namespace panelglow {
namespace {

// ---- requests: the part is at 0x4E, or where it is told to be; its monitor's base is 0x290

std::string Config(const char* device, const std::string& requests, unsigned port = 0x4E) {
  return Each(requests, [&](const std::string& request) {
    return Open(At(port, std::string("07<-") + device + " " + request), port);
  });
}
std::string Monitor(const char* bank, const std::string& requests, unsigned port = 0x4E) {
  return Each(requests, [&](const std::string& request) {
    return Open(At(port, "07<-0B 30<-01 60->02 61->90") + At(0x295, std::string("4E<-") + bank + " " + request),
                port);
  });
}

const std::string kWinDevices = Device(7, "30 = 1\nE5 = 0xB1\nED = 0x12\nF5 = 0x40\nE1 = 4\nE9 = 2\nE6 = 0x20") +
                                Device(8, "30 = 1\nF1 = 0x80\nF3 = 1") +
                                Device(9,
                                       "30 = 7\nF3 = 0x21\nE4 = 0x22\nEA = 0x23\nE5 = 0x24\nF5 = 0x25\nEB = 0x2F\n"
                                       "F4 = 0x2E\nE1 = 0x29\nFA = 0x2A\nF9 = 0x2B\nF0 = 0x2C\nF1 = 8\nE6 = 1") +
                                Device(10, "E0 = 1\nE3 = 4\nE6 = 5\nE9 = 9") +
                                Device(11, "30 = 1\n60 = 0x02\n61 = 0x90") + Device(13, "EC = 0x3C") +
                                Environment(11,
                                            "28 = 0x10\n29 = 0x05\n2A = 0xFF\n3F = 0x03\n47 = 0x90\n4B = 0x40\n"
                                            "59 = 0x03\n5D = 0x20\n4C = 0x80\n04 = 0x7D\n12 = 0x7E\n62 = 0x43\n"
                                            "01 = 0x44\n03 = 0x45\n11 = 0x46\n61 = 0x47\n50 = 0x1F\n51 = 0xC0\n"
                                            "7D = 0x31\n7E = 0x40\n27 = 0x2A\n5E = 0x5E\n75 = 0x75\n02 = 0xF2\n"
                                            "09 = 0x99\n56 = 0x04\n57 = 0xD2\n58 = 0xFF\n",
                                            5);

void ExpectWin(const std::string& name, const std::vector<ChipCase>& cases, unsigned port = 0x4E) {
  Expect(name, SuperIo(port, "0x87, 0x87", kWinDevices), cases);
}

Ask Control(void (Chip::*operation)(int), int fan) {
  return [=](Chip& c) {
    (c.*operation)(fan);
    return 0;
  };
}
Ask EnvironmentRegister(std::uint16_t number) {
  return [=](Chip& c) {
    std::uint8_t value = 0;
    return c.ReadEnvironmentRegister(number, value) ? int{value} : -1;
  };
}
Ask ConfigBit(int number) {
  return [=](Chip& c) {
    bool value = false;
    return c.ReadConfigBit(4, 0x60, number, value) ? int{value} : -1;
  };
}
int Rpm(Chip& c) { return c.TachToRpm(1000, 3) + c.TachToRpm(0, 3); }

TEST(WinChips, ThePowerLedIsConfigurationRegisters) {
  const std::string at2e = SuperIo(0x2E, "0x87, 0x87", kWinDevices);
  const std::string at4e = SuperIo(0x4E, "0x87, 0x87", kWinDevices);
  ExpectLedOf("win", at4e, Config("09", "F3->21"), Config("09", "F3<-80"), "-", Config("09", "F3<-00"),
              Config("09", "F3<-21"));
  ExpectLedOf("nuv_w83667", at4e,
              Config("09", "30->07 E4->22 EA->23") + Config("0D", "EC->3C") + Config("09", "E5->24 F5->25"),
              Config("09", "30<-0A E4<-7F EA<-80") + Config("0D", "EC<-A1"),
              Config("09", "E5<-00 F5<-01 EA<-80") + Config("0D", "EC<-A1"), "",
              Config("09", "30<-07 E4<-22 EA<-23") + Config("0D", "EC<-3C") + Config("09", "E5<-24 F5<-25"));
  ExpectLedOf(
      "nuv_nct5571", at4e, Config("09", "EB->2F F4->2E F5->25 E1->29") + Config("0D", "EC->3C 2D->00"),
      Config("0D", "EC<-11 2D->00 2D<-00"), Config("09", "EB->2F EB<-27 F4->2E F4<-26 F5->25 F5<-2D E1->29 E1<-2B"),
      Config("09", "EB->27 EB<-27 F4->26 F4<-26 F5->2D F5<-2D E1->2B E1<-29") + Config("0D", "EC<-31 2D->00 2D<-00"),
      Config("09", "EB<-2F F4<-2E F5<-25 E1<-29") + Config("0D", "EC<-3C 2D<-00"));
  ExpectLedOf("nuv_nct5572", at2e, Config("07", "E5->B1 ED->12", 0x2E), Config("07", "E5->B1 E5<-B0 ED<-00", 0x2E),
              Config("07", "E5->B0 E5<-70 ED<-00", 0x2E), Config("07", "ED<-80 ED<-40", 0x2E),
              Config("07", "E5<-B1 ED<-12", 0x2E));
  ExpectLedOf("win_w83202g", at4e, Config("09", "F3->21 30->07 FA->2A F9->2B F0->2C"), Config("09", "F3<-29"),
              Config("09", "30<-0B FA<-00 F9<-10 F0<-EF F3<-29"), Config("09", "F3<-09"),
              Config("09", "F3<-21 30<-07 FA<-2A F9<-2B F0<-2C"));
}

const std::string kSavedOfWin = "04->7D 04->7D 12->7E 62->43 01->44 03->45 11->46 61->47";
const std::string kRestoredOfWin = "04<-7D 04<-7D 12<-7E 62<-43 01<-44 03<-45 11<-46 61<-47";

TEST(WinChips, FansAreRegistersOfTheMonitorsBanks) {
  ExpectWin("win", {{Tach(1), 0x10 << 5, Monitor("00", "28->10 47->90 5D->20")},
                    {Tach(2), 5 << 2, Monitor("00", "29->05 47->90 5D->20")},
                    {Tach(3), 0xFFFF, Monitor("00", "2A->FF")},
                    {Tach(4), 3 << 7, Monitor("00", "3F->03 59->03 4C->80")},
                    {Tach(5), 0xFFFF, ""},
                    {Rpm, 1350, ""},
                    {&Chip::RestoreFanState, 1, ""},
                    {Full(1), 1, Monitor("00", kSavedOfWin + " 04<-40 12<-04 62<-40 01<-FF")},
                    {Full(2), 1, Monitor("00", "03<-FF")},
                    {Duty(3, 0x180), 1, Monitor("00", "11<-80")},
                    {Duty(4, 0x180), 1, Monitor("00", "61<-80")},
                    {Duty(5, 0x180), 0, ""},
                    {Manual(false), 1, Monitor("00", kRestoredOfWin)},
                    {Red, -1, ""}});
  // The banks of this model are one: what stands at 0x50 is a temperature's degrees, too.
  ExpectWin("nuv_w83667", {{Manual(true), 1,
                            Monitor("00", kSavedOfWin) + Monitor("09", "50->1F") + Monitor("0A", "50->1F") +
                                Monitor("00", "04->7D 04<-4D 04->4D 04<-41") + Monitor("09", "50->1F 50<-1E") +
                                Monitor("0A", "50->1E 50<-1E")},
                           {&Chip::RestoreFanState, 1,
                            Monitor("00", kRestoredOfWin) + Monitor("09", "50<-1F") + Monitor("0A", "50<-1F")},
                           {Tach(4), 3 << 7, Monitor("00", "3F->03 59->03 4C->80")}});
  ExpectWin("nuv_nct5571",
            {{Manual(true), 1, Monitor("00", "04->7D 12->7E 01->44 03->45 11->46 04->7D 04<-41 12->7E 12<-78")},
             {&Chip::RestoreFanState, 1, Monitor("00", "04<-7D 12<-7E 01<-44 03<-45 11<-46")},
             {Tach(3), 0xFFFF, Monitor("00", "2A->FF")},
             {Tach(4), 0xFFFF, ""},
             {Duty(3, 0x180), 1, Monitor("00", "11<-80")},
             {Duty(4, 0x180), 0, ""}});
  const auto speeds = [](const std::string& pair) {
    return Monitor("05", "08<-80 06<-03 06<-30", 0x2E) + Monitor("06", pair, 0x2E);
  };
  ExpectWin("nuv_nct5572",
            {{Tach(1), 0x4D2, speeds("56->04 57->D2")},
             {Tach(2), 0xFFFF, speeds("58->FF 59->03")},
             {Tach(3), 0xFFFF, ""},
             {Rpm, 1000, ""},
             {Full(2), 1,
              Monitor("00", "04->7D 04->7D", 0x2E) + Monitor("02", "09->99", 0x2E) + Monitor("01", "09->99", 0x2E) +
                  Monitor("02", "02->F2 02<-02", 0x2E) + Monitor("01", "02->02 02<-02", 0x2E) +
                  Monitor("02", "09<-FF", 0x2E)},
             {Duty(1, 0x180), 1, Monitor("01", "09<-80", 0x2E)},
             {&Chip::RestoreFanState, 1,
              Monitor("00", "04<-7D 04<-7D", 0x2E) + Monitor("02", "09<-99", 0x2E) + Monitor("01", "09<-99", 0x2E)}},
            0x2E);
  ExpectWin("win_w83202g", {{Tach(1), 3 << 7, Monitor("00", "3F->03 59->03 4C->80")},
                            {Tach(2), 0xFFFF, ""},
                            {Full(1), 1, Monitor("00", "5E->5E 75->75 5E<-00 75<-02 61<-FF")},
                            {&Chip::RestoreFanState, 1, Monitor("00", "5E<-5E 75<-75")}});
}

TEST(WinChips, ZonesAreDegreesWithTheirFraction) {
  const auto none = [](Chip& c) { return c.MapTemperature(0x80); };
  ExpectWin("win", {{Zone(1), 0x2A, Monitor("00", "27->2A")},
                    {Zone(2), 32, Monitor("01", "50->1F 51->C0")},
                    {Zone(3), 32, Monitor("02", "50->1F 51->C0")},
                    {Zone(4), -1000, ""},
                    {none, 255, ""}});
  Expect("win", SuperIo(0x4E, "0x87, 0x87", Device(11, "30 = 1")),
         {{Zone(1), 255, Open(At(0x4E, "07<-0B 30<-01 60->00 61->00") + At(0x295, "4E<-00 27->FF"))}});
  ExpectWin("nuv_w83667", {{Zone(1), 0x31, Monitor("00", "7D->31 7E->40")}});
  ExpectWin("nuv_nct5572", {{Zone(1), 0x2A, Monitor("00", "27->2A", 0x2E)}}, 0x2E);
}

TEST(WinChips, AGroupIsWokenAndMadeInputsBeforeItsLineIsRead) {
  const auto group = [](const std::string& requests) { return Open(At(0x4E, requests)); };
  ExpectWin("nuv_w83667",
            {{Line(17), 3, group("07<-08 30<-02 F0<-FF F2<-00 F1->80")},
             {[](Chip& c) { return c.ReadLineDirect(10); }, 3, group("07<-08 30<-02 F0<-FF F2<-00 F3->01")},
             {Line(20), 3, group("07<-09 30<-01 E0<-FF E2<-00 E1->29")},
             {[](Chip& c) { return c.ReadLineDirect(20); }, 4, group("07<-09 30<-01 E0<-FF E2<-00 E3->00")},
             {Line(31), 4, group("07<-09 30<-02 E4<-FF E6<-00 E5->24")},
             {Line(43), 3, group("07<-09 30<-04 F0<-FF F2<-00 F1->08")},
             {[](Chip& c) { return c.ReadLineDirect(40); }, 4, group("07<-09 30<-04 F0<-FF F2<-00 E8->00")},
             {Line(55), 3, group("07<-09 30<-08 F4<-FF F6<-00 F5->25")},
             {Line(66), 3, group("07<-07 30<-02 F4<-FF F6<-00 F5->40")},
             {Line(72), 3, group("07<-07 30<-04 E0<-FF E2<-00 E1->04")},
             {Line(84), 3, group("07<-07 30<-08 E4<-FF E6<-00 E5->B1")},
             {Line(91), 3, group("07<-07 30<-10 E8<-FF EA<-00 E9->02")},
             {Line(5), -1, ""},
             {Line(18), -1, ""},
             {Line(100), -1, ""}});
  const std::string keys =
      "chip.win.gpiox.1.logical_device=9\nchip.win.gpiox.1.enable_bit=3\nchip.win.gpiox.1.io_reg=0xE0\n"
      "chip.win.gpiox.1.data_reg=0xE4\nchip.win.gpiox.1.inversion_reg=0xE6\nchip.win.gpiox.1.status_reg=0xE5\n";
  Expect("win", SuperIo(0x4E, "0x87, 0x87", kWinDevices),
         {{Line(11), 3, group("07<-09 30<-08 E0<-FF E6<-00 E4->22")},
          {[](Chip& c) { return c.ReadLineDirect(12); }, 3, group("07<-09 30<-08 E0<-FF E6<-00 E5->24")},
          {Line(21), -1, ""}},
         keys);
  Expect("win", "", {{Line(11), -1, ""}}, "chip.win.gpiox.1.enable_bit=8\n" + keys);
}

TEST(WinChips, ThePowerButtonIsTakenAndGivenBack) {
  ExpectWin("win", {{&Chip::RestorePowerButtonState, 1, ""},
                    {&Chip::SavePowerButtonState, 1, Config("0A", "E0->01 E6->05")},
                    {&Chip::ArmPowerButton, 1, Config("0A", "E0->01 E0<-81 E3->04")},
                    {Pressed, 1, Config("0A", "E3->04")},
                    {&Chip::RestorePowerButtonState, 1, Config("0A", "E0<-01 E6<-05")},
                    {&Chip::RestorePowerButtonState, 1, ""},
                    {&Chip::ArmPowerButton, 1, Config("0A", "E0->01 E6->05 E0->01 E0<-81 E3->04")}});
  ExpectWin("win_w83202g", {{&Chip::SavePowerButtonState, 1, Config("0A", "E0->01 E9->09")}});
  Expect("nuv_nct5572", Ports(0x801, 0x01, 0x13) + Ports(0x803, 0x23, 0x31),
         {{&Chip::SavePowerButtonState, 1, "0802->13 0803->23 0804->31 "},
          {&Chip::ArmPowerButton, 1, "0802->13 0802<-12 0804->31 0804<-30 0803->23 0803<-22 "},
          {Pressed, 1, "0801->01 "},
          {&Chip::RestorePowerButtonState, 1, "0802<-13 0803<-23 0804<-31 "},
          {&Chip::ArmPowerButton, 1,
           "0802->13 0803->23 0804->31 0802->13 0802<-12 0804->31 0804<-30 0803->23 0803<-22 "}});
}

// Every class has keys of its own, its base's count for nothing; without a part the monitor is where its key says.
TEST(WinChips, KeysMoveThePorts) {
  for (const auto& [name, prefix] :
       {std::pair("win", "chip.win."), std::pair("nuv_w83667", "chip.nuv_w83667."),
        std::pair("nuv_nct5571", "chip.nuvo5571."), std::pair("nuv_nct5572", "chip.nuv_nct5572."),
        std::pair("win_w83202g", "chip.win_w83202g.")}) {
    const std::string keys = std::string(prefix) + "cfgbar=0x164E\n" + prefix + "hwmbar=0x2A5\n";
    Expect(name, "",
           {{Zone(3), 256,
             Each("50->FF 51->FF",
                  [](const std::string& request) {
                    return Open(At(0x164E, "07<-0B 30<-01 60->FF 61->FF") + At(0x2A5, "4E<-02 " + request), 0x164E);
                  })}},
           (std::string(name) == "win" ? "" : "chip.win.cfgbar=0x15\nchip.win.hwmbar=0x17\n") + keys);
  }
}

TEST(WinChips, PagedMonitorsAndTheHoodLock) {
  const auto reg = [](const std::string& request) { return At(0x2E, "07<-08") + "08FF<-00 " + request + " "; };
  Expect("win_wpcd376", kEchoingPorts + Ports(0x860, 0x34, 0x12) + Ports(0x86E, 0x35, 0x13) + Ports(0x842, 0xFF),
         {{Tach(1), 0x1234, reg("0860->34") + reg("0861->12")},
          {Tach(8), 0x1335, reg("086E->35") + reg("086F->13")},
          {Duty(3, 0x180), 1, reg("0842->FF") + reg("0842<-9F") + reg("0882<-80") + "500ms "},
          {Full(1), 0, ""},
          {Hood(true, 0, false), 1, At(0x2E, "17->17 17<-57 17->17")},
          {Hood(false, 0, false), 1, At(0x2E, "17->17 17<-97 17->17")},
          {Red, 1, ""},
          {&Chip::RestorePowerLedState, 1, ""},
          {&Chip::SavePowerLedState, 1, At(0x2E, "25<-58 07<-07 F0<-04 F1<-03 F0<-06 F1<-03")},
          {&Chip::AssertPowerLedGreen, 1, "0420<-40 "},
          {&Chip::AssertPowerLedRed, 1, "0420<-10 "},
          {&Chip::DeassertPowerLed, 1, "0420<-00 "},
          {&Chip::RestorePowerLedState, 1, "0420<-40 " + At(0x2E, "25<-40")},
          {&Chip::RestorePowerLedState, 1, ""}});
  Expect("win_wpcd376", "",
         {{Hood(true, 0, false), 0, At(0x2E, "17->FF 17<-FF 17->FF") + Repeated(19, "100ms " + At(0x2E, "17->FF"))}});
  EXPECT_EQ(Expect("win_wpcd376", "", {{Tach(9), 0xFFFF, ""}, {Duty(4, 1), 0, ""}}),
            "\n INVALID FAN TACK INDEX NUMBER 9\n\n INVALID FAN TACK INDEX NUMBER 4\n");
}

TEST(WinChips, APartThatIsToldOfWritesIsToldBeforeAndBehindEach) {
  const std::string bases = At(0x2E, "07<-04 60->60 61->61") + At(0x2E, "07<-08 60->60 61->61");
  const std::string hardware =
      kEchoingPorts + Ports(0x6065, 0x81) + Ports(0x60C1, 0x34, 0x12) + Ports(0x60D2, 0xFF) + Ports(0x60F9, 0x77);
  ExpectConstruction("nuv_npcd378h", hardware, bases);
  const auto write = [](const std::string& request) {
    return "6160<-00 6065->81 6065<-80 6160<-00 " + request + " 6160<-00 6065->80 6065<-81 ";
  };
  Expect("nuv_npcd378h", hardware,
         {{Tach(1), 0x1234, "6160<-00 60C1->34 6160<-00 60C2->12 "},
          {Tach(8), 0xFFFF, "6160<-00 60CF->FF 6160<-00 60D0->FF "},
          {Tach(9), 0xFFFF, ""},
          {Rpm, 1000, ""},
          {Duty(1, 0x180), 1, write("60E1<-80")},
          {Control(&Chip::RestoreFanControl, 2), 0, ""},
          {Control(&Chip::SaveFanControl, 2), 0, "6160<-00 60D2->FF "},
          {Control(&Chip::TakeFanControl, 2), 0, "6160<-00 60D2->FF " + write("60D2<-9F")},
          {Control(&Chip::RestoreFanControl, 2), 0, write("60D2<-FF")},
          {Control(&Chip::TakeFanControl, INT_MAX), 0, ""},
          {EnvironmentRegister(0x398), 0x77, "6160<-03 60F9->77 "},
          {EnvironmentRegister(0x400), -1, ""},
          {ConfigBit(5), 1, At(0x2E, "07<-04 60->60")},
          {ConfigBit(4), 0, At(0x2E, "07<-04 60->60")},
          {ConfigBit(8), -1, ""},
          {Hood(true, 0, true), 1, At(0x2E, "23->23 23<-33 17->17 17<-57 17->17")},
          {Hood(false, 0, true), 1, At(0x2E, "23->23 23<-33 17->17 17<-97 17->17")},
          {Red, -1, ""}});
  ExpectLedOf("nuv_npcd378h", hardware, "6061->FF ", "6061<-1E ", "6061<-1F ", "6061<-00 ", "6061<-FF ");
  Expect("nuv_npcd378h", hardware, {{&Chip::AssertPowerLedGreen, 1, "0420<-1E "}},
         "chip.nuv_npcd378h.gpiobar=0x420\n");
}

TEST(SuperIoWithBases, WhereThereIsNoBaseNothingIsTouched) {
  const std::vector<ChipCase> lamp = {{&Chip::SavePowerLedState, 0, ""},
                                      {&Chip::AssertPowerLedGreen, 0, ""},
                                      {&Chip::AssertPowerLedRed, 0, ""},
                                      {&Chip::DeassertPowerLed, 0, ""},
                                      {&Chip::RestorePowerLedState, 0, ""}};
  for (const std::string& hardware : {std::string(), Ports(0x2E, 0)}) {  // all bases read 0xFFFF, or 0
    for (const char* name : {"nuv_npcd378h", "smsc_sch5327b", "smsc5407", "vt1211"}) {
      Expect(name, hardware, lamp);
    }
    Expect("smsc5407", hardware, {{Zone(1), -1000, ""}});
    Expect("vt1211", hardware, {{Zone(1), -1000, ""}});
    Expect("nuv_npcd378h", hardware,
           {{Tach(1), 0xFFFF, ""},
            {Duty(1, 1), 0, ""},
            {Control(&Chip::SaveFanControl, 1), 0, ""},
            {Control(&Chip::TakeFanControl, 1), 0, ""},
            {EnvironmentRegister(0), -1, ""}});
  }
}

TEST(WinChips, ATakeoverThatIsInterruptedCanBePutBack) {
  // The last register that is put back is the pins', behind the green of the firmware.
  ExpectInterruptedCanBePutBack("win_wpcd376", Ports(0x2E, 0x25) + Ports(0x420, 0x40));
}

// Those that no other test asks for. A part at 0x2E has the base 0x6061 everywhere.
TEST(WinChips, EveryKeyIsRead) {
  const struct {
    const char* name;
    std::string keys;
    ChipCase row;
  } kRows[] = {
      {"nuv_nct5572", "pmbar=0x900", {Pressed, 1, "0901->FF "}},
      {"win_wpcd376",
       "siobar=0x900\nchip.win_wpcd376.cfgbar=0x4E",
       {Duty(1, 1), 1,
        At(0x4E, "07<-08") + "09FF<-00 0940->FF " + At(0x4E, "07<-08") + "09FF<-00 0940<-9F " + At(0x4E, "07<-08") +
            "09FF<-00 0980<-01 500ms "}},
      {"win_wpcd376", "gpiobar=0x430", {&Chip::AssertPowerLedGreen, 1, "0430<-40 "}},
      {"nuv_npcd378h", "cfgbar=0x4E", {ConfigBit(0), 1, At(0x4E, "07<-04 60->FF")}},
      {"nuv_npcd378h", "gpiobar=0", {&Chip::AssertPowerLedGreen, 1, "6061<-1E "}},
  };
  for (const auto& [name, keys, row] : kRows) {
    Expect(name, kEchoingPorts, {row}, std::string("chip.") + name + "." + keys + "\n");
  }
}

}  // namespace
}  // namespace panelglow
