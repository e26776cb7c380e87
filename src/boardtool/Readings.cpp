#include "boardtool/Readings.h"

#include <nlohmann/json.hpp>

#include "boardtool/BoardOnMachine.h"
#include "boardtool/Table.h"

namespace panelglow::boardtool {

namespace {

using Json = nlohmann::ordered_json;

std::string Dump(const Json& json, JsonForm form) {
  return json.dump(form == JsonForm::kLine ? -1 : 2, ' ', false, Json::error_handler_t::replace) + "\n";
}

std::string StateOf(const Fan& fan, int rpm) {
  if (!fan.tested || !fan.nominalTest) {
    return "not tested";
  }
  if (rpm == kNotRead) {
    return "cannot be read";
  }
  return rpm < fan.nominal.min ? "too slow" : rpm > fan.nominal.max ? "too fast" : "ok";
}

std::string LimitText(int limit) { return limit == kNoLimit ? "-" : std::to_string(limit); }

Json LimitJson(int limit) { return limit == kNoLimit ? Json() : Json(limit); }

const char* WordOf(bool value) { return value ? "true" : "false"; }

}  // namespace

std::vector<FanReadout> ReadFans(MotherBoard& board) {
  board.LoadFans();
  board.SetActiveReadingSet(static_cast<std::uint32_t>(FanReading::kNominal));
  FailureOf([&] { board.DetectFans(); });
  FailureOf([&] { board.ReadAllFans(); });
  std::vector<Fan> fans;
  board.GetFans(fans);
  std::vector<FanReadout> readouts;
  for (const Fan& fan : fans) {
    const int rpm = fan.readings[static_cast<std::size_t>(FanReading::kNominal)];
    readouts.push_back({fan.index, fan.name, fan.tachChip, fan.detectionStatus, rpm, fan.nominal, StateOf(fan, rpm)});
  }
  return readouts;
}

std::vector<ZoneReadout> ReadZones(MotherBoard& board) {
  std::vector<TempZone> zones;
  board.GetZones(zones);
  std::vector<ZoneReadout> readouts;
  for (std::size_t i = 0; i < zones.size(); ++i) {
    const int number = static_cast<int>(i) + 1;
    ZoneCheck check;
    bool hasLimit = false;
    const std::string failure = FailureOf([&] { hasLimit = board.CheckZone(number, check); });
    std::vector<TempZone> now;
    board.GetZones(now);
    ZoneReadout readout{number,   zones[i].name, zones[i].chip,       check.value,
                        kNoLimit, kNoLimit,      now[i].coreReadings, {}};
    FailureOf([&] {
      readout.high = board.GetZoneHigh(number);
      readout.low = board.GetZoneLow(number);
    });
    const bool isRead = failure.empty() && check.value < kFirstInvalidReading;
    readout.state = board.IsZoneSkipped(number) ? "skipped"
                    : !isRead                   ? "cannot be read"
                    : check.high                ? "too hot"
                    : check.low                 ? "too cold"
                    : hasLimit                  ? "ok"
                                                : "no limit";
    if (check.prochotStatus != 0) {
      readout.state += ", throttled";
    }
    readouts.push_back(std::move(readout));
  }
  return readouts;
}

std::vector<DeviceReadout> ReadDevices(MotherBoard& board) {
  std::vector<DeviceReadout> readouts;
  for (std::size_t i = 0; i < kDeviceKinds; ++i) {
    const auto kind = static_cast<DeviceKind>(i);
    const std::string failure = FailureOf([&] { board.Detect(kind); });
    for (const DEVICE_INFO& device : board.GetDevices(kind)) {
      readouts.push_back({TitleOf(kind), device.name, device.chip, device.status});
    }
    if (!failure.empty()) {
      readouts.push_back({TitleOf(kind), "", "", "ERROR: " + failure});
    }
  }
  bool value = false;
  FailureOf([&] {
    if (board.LoadHoodSwitch() && board.ReadHoodSwitch(value)) {
      readouts.push_back({"Hood", "switch", "", WordOf(value)});
    }
    if (board.ReadHoodLatch(false, value)) {
      readouts.push_back({"Hood", "latch", "", WordOf(value)});
    }
    if (board.LoadHoodLock() && board.ReadHoodLock(value)) {
      readouts.push_back({"Hood", "lock", "", WordOf(value)});
    }
  });
  FailureOf([&] {
    board.LoadButtons();
    for (const TestButton& button : board.GetButtons()) {
      bool pressed = false;
      const bool isRead = board.SelectButton(button.name) && board.ReadButton(pressed);
      readouts.push_back({"Buttons", button.name, button.chip, isRead ? WordOf(pressed) : "ERROR: cannot be read"});
    }
  });
  for (std::size_t i = 0; i < kLegacyDevices; ++i) {
    const auto device = static_cast<LegacyDevice>(i);
    if (board.DetectLegacyDevice(device, value)) {
      readouts.push_back({"Oldest boards", TitleOf(device), "", WordOf(value)});
    }
  }
  return readouts;
}

std::string FansText(const std::vector<FanReadout>& fans) {
  std::vector<std::vector<std::string>> rows{{"fan", "name", "chip", "rpm", "from", "to", "there", "state"}};
  for (const FanReadout& fan : fans) {
    rows.push_back({std::to_string(fan.number), fan.name, fan.chip,
                    fan.rpm == kNotRead ? "-" : std::to_string(fan.rpm), std::to_string(fan.limits.min),
                    std::to_string(fan.limits.max), fan.detected, fan.state});
  }
  return fans.empty() ? "The files name no fans for this board.\n" : TableText(rows);
}

std::string ZonesText(const std::vector<ZoneReadout>& zones) {
  std::vector<std::vector<std::string>> rows{{"zone", "name", "chip", "degrees", "low", "high", "state", "cores"}};
  for (const ZoneReadout& zone : zones) {
    std::string cores;
    for (const int core : zone.cores) {
      cores += (cores.empty() ? "" : " ") + std::to_string(core);
    }
    const bool isRead = zone.degrees < kFirstInvalidReading;
    rows.push_back({std::to_string(zone.number), zone.name, zone.chip, isRead ? std::to_string(zone.degrees) : "-",
                    LimitText(zone.low), LimitText(zone.high), zone.state, cores});
  }
  return zones.empty() ? "The files name no temperature zones for this board.\n" : TableText(rows);
}

std::string DevicesText(const std::vector<DeviceReadout>& devices) {
  std::vector<std::vector<std::string>> rows{{"kind", "name", "chip", "there"}};
  for (const DeviceReadout& device : devices) {
    rows.push_back({device.kind, device.name, device.chip, device.status});
  }
  return devices.empty() ? "The files name no devices for this board.\n" : TableText(rows);
}

std::string FansJson(const std::vector<FanReadout>& fans, JsonForm form) {
  Json json = Json::array();
  for (const FanReadout& fan : fans) {
    json.push_back({{"fan", fan.number},
                    {"name", fan.name},
                    {"chip", fan.chip},
                    {"detected", fan.detected},
                    {"rpm", fan.rpm == kNotRead ? Json() : Json(fan.rpm)},
                    {"min", fan.limits.min},
                    {"max", fan.limits.max},
                    {"state", fan.state}});
  }
  return Dump(json, form);
}

std::string ZonesJson(const std::vector<ZoneReadout>& zones, JsonForm form) {
  Json json = Json::array();
  for (const ZoneReadout& zone : zones) {
    json.push_back({{"zone", zone.number},
                    {"name", zone.name},
                    {"chip", zone.chip},
                    {"degrees", zone.degrees < kFirstInvalidReading ? Json(zone.degrees) : Json()},
                    {"low", LimitJson(zone.low)},
                    {"high", LimitJson(zone.high)},
                    {"cores", zone.cores},
                    {"state", zone.state}});
  }
  return Dump(json, form);
}

std::string DevicesJson(const std::vector<DeviceReadout>& devices, JsonForm form) {
  Json json = Json::array();
  for (const DeviceReadout& device : devices) {
    json.push_back({{"kind", device.kind}, {"name", device.name}, {"chip", device.chip}, {"status", device.status}});
  }
  return Dump(json, form);
}

}  // namespace panelglow::boardtool
