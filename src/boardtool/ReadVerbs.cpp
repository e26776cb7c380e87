#include "boardtool/ReadVerbs.h"

#include <algorithm>
#include <functional>

#include "boardtool/BoardOnMachine.h"
#include "boardtool/Output.h"
#include "boardtool/Readings.h"
#include "config/XmlObject.h"
#include "platform/Host.h"

namespace panelglow::boardtool {

namespace {

constexpr std::uint32_t kBetweenReadings_ms = 1000;
constexpr std::uint32_t kLook_ms = 50;

// Waits; false when the watching is to end.
bool WaitForNext(const Person& person, std::uint32_t wait_ms) {
  for (std::uint32_t waited_ms = 0; waited_ms < wait_ms; waited_ms += kLook_ms) {
    if (StopRequest::IsMade() || (person.isThere && person.hasPressedKey())) {
      return false;
    }
    platform::TheHost().clock.Sleep(kLook_ms);
  }
  return true;
}

// Documents that follow one another are lines, so that a program can part them.
JsonForm FormOf(const ReadOptions& options) { return options.watch ? JsonForm::kLine : JsonForm::kIndented; }

// Reads and shows, once or again and again. Returns what the last reading did.
int Show(const ReadOptions& options, const Person& person, std::uint32_t between_ms,
         const std::function<int()>& read) {
  if (options.watch && options.rounds <= 0 && !person.isThere && IsSimulated()) {
    throw WrongCall("nobody is at the terminal who could end it: give --rounds");
  }
  int code = read();
  for (int round = 1; options.watch && (options.rounds <= 0 || round < options.rounds); ++round) {
    if (!WaitForNext(person, between_ms)) {
      break;
    }
    code = read();
  }
  return code;
}

void WriteLogs(const std::string& path, const std::function<void(const LineSink&)>& writeText,
               const std::function<void(XmlObject&)>& writeResults) {
  if (path.empty()) {
    return;
  }
  std::string text;
  writeText([&](const std::string& line) { text += line + "\n"; });
  XmlObject results;
  results.name = "results";
  writeResults(results);
  if (!platform::TheHost().files.Write(path, text) || !results.SaveToFile(path + ".xml", false, false)) {
    throw CannotRun("the log " + path + " cannot be written");
  }
}

template <class Readouts>
int CodeOf(const Readouts& readouts) {
  const bool isGood = std::all_of(readouts.begin(), readouts.end(), [](const auto& readout) {
    return readout.state == "ok" || readout.state == "not tested" || readout.state == "no limit" ||
           readout.state == "skipped";
  });
  return isGood ? 0 : 1;
}

}  // namespace

int Fans(const ReadOptions& options, const Person& person) {
  BoardOnMachine machine(options.folder);
  Say("reads the fans; one that the files say turns only with a duty is given it for as long as it is looked for.");
  const int code = Show(options, person, kBetweenReadings_ms, [&] {
    const std::vector<FanReadout> fans = ReadFans(machine.Board());
    Print(options.json ? FansJson(fans, FormOf(options)) : FansText(fans));
    return CodeOf(fans);
  });
  WriteLogs(
      options.logFile, [&](const LineSink& line) { machine.Board().WriteFanLog(line, "panelglow-board"); },
      [&](XmlObject& results) { machine.Board().WriteFanResults(results); });
  return code;
}

int Zones(const ReadOptions& options, const Person& person) {
  constexpr std::uint32_t kSecond_ms = 1000;
  BoardOnMachine machine(options.folder);
  Say("reads the temperatures; nothing but index registers is written.");
  const std::string failure = FailureOf([&] { machine.Board().LoadZones(); });
  if (!failure.empty()) {
    throw CannotRun("the temperature zones cannot be loaded: " + failure);
  }
  int rate_s = 1;
  machine.Board().GetProbeRate(rate_s);
  const int code = Show(options, person, static_cast<std::uint32_t>(std::clamp(rate_s, 1, 3600)) * kSecond_ms, [&] {
    const std::vector<ZoneReadout> zones = ReadZones(machine.Board());
    Print(options.json ? ZonesJson(zones, FormOf(options)) : ZonesText(zones));
    return CodeOf(zones);
  });
  WriteLogs(
      options.logFile, [&](const LineSink& line) { machine.Board().WriteZoneLog(line); },
      [&](XmlObject& results) { machine.Board().WriteZoneResults(results); });
  return code;
}

int Detect(const ReadOptions& options, const Person& person) {
  BoardOnMachine machine(options.folder);
  Say("reads lines; the latched bit of a button is cleared by reading it.");
  return Show(options, person, kBetweenReadings_ms, [&] {
    const std::vector<DeviceReadout> devices = ReadDevices(machine.Board());
    Print(options.json ? DevicesJson(devices, FormOf(options)) : DevicesText(devices));
    const bool isGood = std::none_of(devices.begin(), devices.end(),
                                     [](const DeviceReadout& device) { return device.status.starts_with("ERROR"); });
    return isGood ? 0 : 1;
  });
}

}  // namespace panelglow::boardtool
