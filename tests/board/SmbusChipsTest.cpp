// What the classes behind an SMBus do on its host's ports, request by request.
#include "board/AnsweringBench.h"
#include "board/SuperIoTraffic.h"
#include "board/chips/sensor/SmbusDeviceChip.h"

namespace panelglow {
namespace {

// A byte of a device behind an SMBus host.
std::string Smbus(const std::string& host, const char* address, const std::string& requests, const char* status,
                  const std::string& control = "07") {
  return Each(requests, [&](const std::string& word) {
    const std::string start = host + "2<-" + address + " " + host + "3<-" + word.substr(0, 2) + " ";
    const std::string end = "20ms " + host + "1->" + status + " ";
    return word[2] == '<'
               ? start + host + "4" + word.substr(2) + " " + host + "0<-06 " + end
               : start + host + "0<-07 " + end + host + "4" + word.substr(2) + " " + host + "0->" + control + " ";
  });
}

// ---- monitors

TEST(AdtChips, ARegisterIsATransaction) {
  const auto bus = [](const std::string& requests) { return Smbus("FC0", "2D", requests, "80"); };
  const std::string printed = Expect(
      "adt", Ports(0xFC00, 0, 0x80) + Ports(0xFC04, 0x43),
      {{Tach(1), 0x4343, bus("28->43 29->43")},
       {Tach(4), 0x4343, bus("2E->43 2F->43")},
       {Tach(5), 0xFFFF, ""},
       {Zone(3), 0x43, bus("27->43")},
       {Zone(4), -1000, ""},
       {Duty(0, 0x180), 0, ""},
       {Manual(true), 1,  // a written byte is the next one read: the host has but one data register
        bus("40->43 5C->43 5D->43 5E->43 30->43 31->43 32->43 62->43 63->43 40->43 40<-40 5C<-E0 5D<-E0 5E<-E0 "
            "62->E0 62<-E7 63<-77")},
       {Duty(3, 0x180), 1, bus("32<-80")},
       {&Chip::RestoreFanState, 1, bus("40<-43 5C<-43 5D<-43 5E<-43 30<-43 31<-43 32<-43 62<-43 63<-43")}});
  EXPECT_EQ(printed, "LogMessage 14 20000 \"Invalid PWM index specified\" \"\"\n");
  const auto reg = [](int number) { return [=](Chip& c) { return c.ReadRegister(number); }; };
  const auto bus11 = [](const std::string& requests) { return Smbus("080", "5C", requests, "80"); };
  Expect("adt_sio11", Ports(0x800, 0, 0x80) + Ports(0x804, 0x43),
         {{reg(0x1A), 0x43, bus11("1A->43")},
          {reg(256), 0, ""},
          {&Chip::SaveFanState, 1,
           bus11("40->43 5C->43 5D->43 5E->43 30->43 31->43 32->43 62->43 63->43 64->43 65->43 66->43 38->43 39->43 "
                 "3A->43")}});
}

TEST(AdtChips, WithoutAnAnswerNothingIsSavedOrTakenOver) {
  const auto failed = [](const std::string& requests) { return Smbus("FC0", "2D", requests, "00"); };
  const std::string save = failed("40->42 5C->42 5D->42 5E->42 30->42 31->42 32->42 62->42 63->42");
  Expect("adt", Ports(0xFC00, 0) + Ports(0xFC04, 0x42),
         {{Zone(1), -1255, failed("25->42")},
          {Manual(true), 0, save},
          {&Chip::SaveFanState, 0, save},
          {&Chip::RestoreFanState, 1, ""}});
  Expect("adt", "", {{Zone(1), 255, Smbus("0B0", "2C", "25->FF", "FF", "FF")}},
         "chip.adt.smbusbar=0xB00\nchip.adt.smbussar=0x2C\n");
}

TEST(AdtChips, ATransactionThatFailsIsTheLastWriteAndIsPutBack) {
  KeyBench bench(Ports(0xFC01, 0x80) + Ports(0xFC04, 0x42));  // the status alone; nobody is at the control register
  const auto failing = [&bench](int transaction, const Ask& ask) {  // of 20 ms each, from 1 on
    return [=, &machine = bench.machine](Chip& chip) {
      for (const auto& [ms, status] : {std::pair(-10, 0x00U), std::pair(10, 0x80U)}) {
        machine.Time().At(machine.Time().Now() + (20 * transaction + ms) * 1000,
                          [&, value = status] { machine.Hardware().WritePort(0xFC01, 1, value); });
      }
      return ask(chip);
    };
  };
  const auto ok = [](const std::string& requests) { return Smbus("FC0", "2D", requests, "80", "FF"); };
  const auto failed = [](const std::string& requests) { return Smbus("FC0", "2D", requests, "00", "FF"); };
  const std::string taken = ok("40->42 40<-40 5C<-E0 5D<-E0 5E<-E0 62->E0 62<-E7 63<-77");
  const std::string restored = ok("40<-42 5C<-42 5D<-42 5E<-42 30<-42 31<-42 32<-42 62<-42 63<-42");
  ExpectCases(bench, *MakeChip("adt"),
              {{failing(2, Tach(1)), 0xFFFF, ok("28->42") + failed("29->42")},
               {failing(1, Duty(1, 0x42)), 0, failed("30<-42")},
               {failing(12, Manual(true)), 0,
                ok("40->42 5C->42 5D->42 5E->42 30->42 31->42 32->42 62->42 63->42 40->42 40<-40") +
                    failed("5C<-E0") + ok("62->E0") + restored},
               {Manual(false), 1, ""},
               {failing(3, failing(5, Manual(true))), 0,
                ok("40->42 40<-40") + failed("5C<-E0") + ok("62->E0") + failed("40<-42")},
               {Manual(true), 1, taken},
               {Manual(true), 1, ""},
               {failing(2, Manual(false)), 0, ok("40<-42") + failed("5C<-42")},
               {Manual(true), 1, taken},
               {failing(1, Manual(false)), 0, failed("40<-42")},
               {Manual(false), 1, restored}});
}

// ---- an LED

const std::string kSmbusKeys = "chip.smbus_device.smbus_bar=0xB00\nchip.smbus_device.smbus_saddr=0x58\n";

std::string Bus(const std::string& requests) { return Smbus("0B0", "58", requests, "80", "00"); }

TEST(SmbusDeviceChip, ThePowerLedIsCommandsOfADevice) {
  AnsweringBench bench(Answers{{0xB00, {0}}, {0xB01, {0x80}}, {0xB04, {0x11, 0x12, 0x13}}}, kSmbusKeys, false);
  SmbusDeviceChip chip;
  ExpectCases(bench, chip,
              {{&Chip::RestorePowerLedState, 0, ""},
               {&Chip::SavePowerLedState, 1, Bus("03->11 03->12 04->13")},
               {&Chip::SavePowerLedState, 1, ""},
               {&Chip::BlinkPowerLedGreen, 1, Bus("03<-C4")},
               {&Chip::BlinkPowerLedRed, 1, Bus("03<-40 04<-05")},
               {&Chip::RestorePowerLedState, 1, Bus("03<-11 03<-12 04<-13")},
               {&Chip::RestorePowerLedState, 0, ""}});
}

// One that is never ready costs five looks, and ends the operation.
TEST(SmbusDeviceChip, TheFirstFailureEndsAnOperation) {
  AnsweringBench bench(Answers{{0xB00, {0}}, {0xB01, {0x1A}}, {0xB04, {0}}},
                       kSmbusKeys + "test.powerled.green.data_blink=0x20:1,9:2\n", false);
  SmbusDeviceChip chip;
  std::string looks = "20ms 0B01->1A ";
  looks = looks + looks + looks + looks + looks;
  ExpectCases(bench, chip,
              {{&Chip::SavePowerLedState, 0, "0B02<-58 0B03<-09 0B00<-07 " + looks + "0B04->00 0B00->00 "},
               {&Chip::BlinkPowerLedGreen, 0, "0B02<-58 0B03<-09 0B04<-02 0B00<-06 " + looks},
               {&Chip::RestorePowerLedState, 0, ""}});

  // What was read before the failure is put back.
  AnsweringBench half(Answers{{0xB00, {0}}, {0xB01, {0x80, 0x80, 0x00, 0x80}}, {0xB04, {0x11}}}, kSmbusKeys, false);
  SmbusDeviceChip part;
  EXPECT_FALSE(part.SavePowerLedState());
  ExpectCases(half, part,
              {{&Chip::RestorePowerLedState, 0, Bus("03<-11 03<-11")}, {&Chip::RestorePowerLedState, 0, ""}});

  AnsweringBench none;
  SmbusDeviceChip nowhere;
  ExpectCases(none, nowhere, {{&Chip::SavePowerLedState, 0, ""}, {&Chip::BlinkPowerLedRed, 0, ""}});
  EXPECT_NE(none.machine.Errors().find("\"chip.smbus_device.smbus_bar\""), std::string::npos);
}

}  // namespace
}  // namespace panelglow
