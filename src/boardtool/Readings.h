// What the board library reads of a machine: fans, temperature zones, detected devices.
#pragma once

#include <string>
#include <vector>

#include "board/MotherBoard.h"

namespace panelglow::boardtool {

struct FanReadout {
  int number = 0;
  std::string name;
  std::string chip;
  std::string detected;  // as detection says
  int rpm = kNotRead;
  FanLimits limits;   // of the nominal speed
  std::string state;  // "ok", "too slow", "too fast", "not tested", "cannot be read"
};

struct ZoneReadout {
  int number = 0;
  std::string name;
  std::string chip;
  int degrees = 0;
  int high = kNoLimit;
  int low = kNoLimit;
  std::vector<int> cores;
  std::string state;  // "ok", "too hot", "too cold", "no limit", "skipped", "cannot be read", with "throttled"
};

struct DeviceReadout {
  std::string kind;  // as "Jumpers"
  std::string name;
  std::string chip;
  std::string status;
};

/// Reads each fan once. The fans are loaded by it.
std::vector<FanReadout> ReadFans(MotherBoard& board);

/// Checks each zone once. The zones are loaded already, so that their counters go on.
std::vector<ZoneReadout> ReadZones(MotherBoard& board);

/// Looks for all devices, the hood's switch and lock and the buttons among them.
std::vector<DeviceReadout> ReadDevices(MotherBoard& board);

/// A document over several lines, or one in a line of its own as JSON Lines has it.
enum class JsonForm { kIndented, kLine };

// The same for people and for programs.
std::string FansText(const std::vector<FanReadout>& fans);
std::string ZonesText(const std::vector<ZoneReadout>& zones);
std::string DevicesText(const std::vector<DeviceReadout>& devices);
std::string FansJson(const std::vector<FanReadout>& fans, JsonForm form = JsonForm::kIndented);
std::string ZonesJson(const std::vector<ZoneReadout>& zones, JsonForm form = JsonForm::kIndented);
std::string DevicesJson(const std::vector<DeviceReadout>& devices, JsonForm form = JsonForm::kIndented);

}  // namespace panelglow::boardtool
