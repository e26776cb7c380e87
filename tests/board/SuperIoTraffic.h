// Super-I/Os as machines' files describe them, and what an access to their registers comes to in requests.
#pragma once

#include <gmock/gmock.h>

#include <algorithm>
#include <cstdio>
#include <memory>
#include <string>
#include <vector>

#include "board/ChipCases.h"

namespace panelglow {

// ---- requests

inline std::string Hex(unsigned port) {
  char text[8];
  std::snprintf(text, sizeof text, "%04X", port);
  return text;
}

/// "F3->21 30<-01": registers behind an index port and the data port above it.
inline std::string At(unsigned index, const std::string& accesses) {
  return Accesses(Hex(index), Hex(index + 1), accesses);
}

inline std::string Repeated(int times, const std::string& requests) {
  std::string text;
  for (int i = 0; i < times; ++i) {
    text += requests;
  }
  return text;
}

/// Between the keys that the Winbond line shares with others.
inline std::string Open(const std::string& requests, unsigned port = 0x4E) {
  return Hex(port) + "<-87 " + Hex(port) + "<-87 " + requests + Hex(port) + "<-AA ";
}

// ---- hardware

inline std::string SuperIo(unsigned port, const std::string& enter, const std::string& devices) {
  return "[[chip]]\nname = \"s\"\nkind = \"super-io\"\nbase = " + std::to_string(port) + "\nenter = [" + enter +
         "]\n" + devices;
}
inline std::string Device(int number, const std::string& registers) {
  return "[[chip.device]]\nnumber = " + std::to_string(number) + "\n[chip.device.registers]\n" + registers + "\n";
}
inline std::string Environment(int device, const std::string& registers, int index) {
  return "[chip.environment]\ndevice = " + std::to_string(device) + "\nindex = " + std::to_string(index) +
         "\ndata = " + std::to_string(index + 1) + "\n[chip.environment.settings]\n" + registers;
}

/// Two ports: the first holds what is written, the second always reads `second`.
inline std::string Ports(unsigned port, int first, int second = 0) {
  return "[[chip]]\nname = \"p" + Hex(port) + "\"\nkind = \"gpio-block\"\nbase = " + std::to_string(port) +
         "\noutputs = 0\ninputs = " + std::to_string(second) + "\ninitial = [" + std::to_string(first) + "]\n";
}

/// An index port and a data port that reads as the index: the base of every device is 0x6061.
inline const std::string kEchoingPorts = "[[chip]]\nname = \"i\"\nkind = \"gpio-block\"\nbase = 0x2E\n";

// ---- what a class does there

inline Ask Hood(bool locks, int line, bool check) {
  return [=](Chip& c) { return locks ? c.LockHood(line, check) : c.UnlockHood(line, check); };
}

/// What was printed.
inline std::string Expect(const std::string& name, const std::string& hardware, const std::vector<ChipCase>& cases,
                          const std::string& keys = "") {
  KeyBench bench(hardware, keys);
  const std::unique_ptr<Chip> chip = MakeChip(name);
  ExpectCases(bench, *chip, cases);
  return bench.machine.Output();
}

inline void ExpectConstruction(const std::string& name, const std::string& hardware, const std::string& requests) {
  KeyBench bench(hardware);
  const std::string traffic = bench.Traffic([&] { MakeChip(name); });
  EXPECT_THAT(traffic, ::testing::HasSubstr(requests)) << name;
  // Nothing else but the waits for the files.
  EXPECT_EQ(std::count(traffic.begin(), traffic.end(), '-'), std::count(requests.begin(), requests.end(), '-'))
      << name;
}

/// As ExpectLed, with the requests themselves, and without the blinks that these classes do not have.
inline void ExpectLedOf(const std::string& name, const std::string& hardware, const std::string& save,
                        const std::string& green, const std::string& red, const std::string& off,
                        const std::string& restore) {
  KeyBench bench(hardware);
  ExpectLed(bench, *MakeChip(name), [](const std::string& requests) { return requests; },
            {save, green, red, off, "-", "-", restore});
}

}  // namespace panelglow
