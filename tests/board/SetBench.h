// Fans, zones and devices with chips that only note what is asked of them, and answer what a test tells them.
#pragma once

#include <map>
#include <memory>
#include <string>
#include <vector>

#include "board/BoardBench.h"
#include "board/base/mblib_exception.h"
#include "board/sets/ChipFinder.h"

namespace panelglow {

class NotedChip : public Chip {
 public:
  NotedChip(std::string chipName, std::string& noted) : Chip(std::move(chipName)), notes(noted) {}

  bool ReadFanRpm(int fan, int& rpm, int multiplier) override {
    Note("rpm " + std::to_string(fan) + "x" + std::to_string(multiplier));
    if (fan > 8 || breaks) {
      throw mblib_exception("no fan " + std::to_string(fan));
    }
    rpm = speeds.count(fan) == 0 ? 0 : speeds[fan];
    return rpm > 0;
  }
  bool SaveFanState() override { return Note("save"); }
  bool RestoreFanState() override {
    Note("restore");
    if (breaks) {
      throw mblib_exception(name + " broke");
    }
    return true;
  }
  bool SetManualFanMode(bool on) override {
    manualFanMode = on;
    return Note(on ? "manual" : "automatic");
  }
  bool SetFanFullSpeed(int fan) override { return Note("full " + std::to_string(fan)); }
  bool SetFanPwmPercent(int fan, int percent) override {
    return Note(std::to_string(percent) + "% " + std::to_string(fan));
  }
  void SaveFanControl(int fan) override { Note("keep " + std::to_string(fan)); }
  void TakeFanControl(int fan) override { Note("take " + std::to_string(fan)); }
  void RestoreFanControl(int fan) override { Note("give " + std::to_string(fan)); }

  bool ReadTemperature(int zone, int& value) override { return Temperature("temperature", zone, value); }
  bool ReadProcessorTemperature(int zone, int& value, bool allCores, const std::string& /*zone*/) override {
    return Temperature(allCores ? "cores" : "core", zone, value);
  }
  bool ReadVirtualTemperature(int zone, bool /*flag*/, int& value) override {
    return Temperature("virtual", zone, value);
  }
  [[nodiscard]] std::vector<int> GetCoreTemperatures() const override { return cores; }
  bool ReadThreshold(int /*zone*/, int& value) override { return Take(threshold, value); }
  bool ReadLowLimitTemperature(int /*zone*/, int& value) override { return Take(lowLimit, value); }
  int MapTemperature(int raw) override { return raw == 0x80 ? 300 : raw; }
  int CountCards() override { return 2; }
  bool ReadEnvironmentRegister(std::uint16_t reg, std::uint8_t& value) override {
    value = static_cast<std::uint8_t>(environment);
    return Note("environment " + std::to_string(reg)) && environment >= 0;
  }

  int ReadLine(int line) override {
    Note("line " + std::to_string(line));
    return lines.count(line) == 0 ? kNoSuchLine : lines[line];
  }
  int ReadLineByNames(std::uint32_t offset, const std::string& bit, const std::string& clear) override {
    Note("bit " + std::to_string(offset) + "." + bit + "/" + clear);
    return kAsserted;
  }
  bool ReadLineActivity(int line, int& value) override {
    value = lines.count(line) == 0 ? -1 : lines[line];
    return value != -1;
  }
  int ReadDashCable(int line, const std::string& idList) override {
    Note("dash " + std::to_string(line) + " " + idList);
    return line == 5 || line == 6 ? LineState(line == 5) : kNoSuchLine;
  }
  int ReadRegister(int reg) override { return reg == 3 ? 0x42 : 0; }
  bool ReadConfigBit(std::uint8_t ldn, std::uint8_t reg, int bit, bool& value) override {
    value = true;
    return Note("config " + std::to_string(ldn) + " " + std::to_string(reg) + "." + std::to_string(bit));
  }
  bool ReadIntrusionLatch(int line, bool clearFirst, bool& value) override {
    value = true;
    return Note("latch " + std::to_string(line) + (clearFirst ? " cleared" : "")) && line != 9;
  }
  bool LockHood(int line, bool check) override { return Note("lock " + std::to_string(line) + (check ? "!" : "")); }
  bool UnlockHood(int line, bool check) override {
    return Note("unlock " + std::to_string(line) + (check ? "!" : ""));
  }
  bool ReadLatchedPort(std::uint16_t port, std::uint32_t mask, bool& value) override {
    value = true;
    return Note("status " + std::to_string(port) + "&" + std::to_string(mask));
  }
  bool ReadLatchedPortDword(std::uint16_t port, std::uint32_t mask, bool& value) override {
    value = true;
    return Note("latched " + std::to_string(port) + "&" + std::to_string(mask));
  }

  std::map<int, int> speeds;  // by fan
  std::map<int, int> lines;   // states; others are not there
  std::vector<int> readings;  // taken one by one; when none is left a read fails
  std::vector<int> cores;
  int threshold = -1;  // -1: not told
  int lowLimit = -1;
  int environment = -1;
  bool breaks = false;

 private:
  bool Note(const std::string& what) {
    notes += name + ":" + what + " ";
    return true;
  }
  bool Temperature(const std::string& how, int zone, int& value) {
    Note(how + " " + std::to_string(zone));
    if (breaks) {
      throw mblib_exception(name + " broke");
    }
    if (readings.empty()) {
      return false;
    }
    value = readings.front();
    readings.erase(readings.begin());
    return true;
  }
  static bool Take(int from, int& value) {
    value = from == -1 ? value : from;
    return from != -1;
  }

  std::string& notes;
};

class SetBench {
 public:
  /// `test` is what the test file says; the detection file is empty.
  explicit SetBench(const std::string& test) {
    bench.SetFiles("", "[7D10]\n" + test, "");
    IniReader::Instance("7D10", ".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini");
  }

  NotedChip& operator[](const std::string& name) {
    std::unique_ptr<NotedChip>& chip = chips[name];
    if (!chip) {
      chip = std::make_unique<NotedChip>(name, notes);
    }
    return *chip;
  }

  /// "a" to "z" and the chips with ways of their own; every other name is the plain chip.
  ChipFinder Finder() {
    return [this](const std::string& name) -> Chip& {
      const bool isKnown = name.size() == 1 || name == "acpi" || name == "videochip" || name == "casl" ||
                           name == "ich" || name == "sio";
      return isKnown ? static_cast<Chip&>((*this)[name]) : plain;
    };
  }

  /// What the chips were asked since the last call.
  std::string Notes() { return std::exchange(notes, ""); }

  BoardBench bench;

 private:
  std::string notes;
  std::map<std::string, std::unique_ptr<NotedChip>> chips;
  Chip plain;
};

}  // namespace panelglow
