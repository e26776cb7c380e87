#include "boardtool/Report.h"

#include <array>
#include <cstdio>
#include <list>
#include <nlohmann/json.hpp>
#include <optional>

#include "boardtool/BoardOnMachine.h"
#include "boardtool/CapturedDrivers.h"
#include "boardtool/HostWith.h"
#include "boardtool/Machine.h"
#include "boardtool/Output.h"
#include "boardtool/Readings.h"
#include "boardtool/Rehearsal.h"
#include "boardtool/Table.h"
#include "hw/PciDeviceList.h"
#include "hw/SMBIOSDiscovery.h"
#include "hw/WMIDiscovery.h"
#include "ledtests/DriveSelection.h"
#include "platform/HostInPlace.h"
#include "storage/ControllerNames.h"
#include "storage/MSUtils.h"

namespace panelglow::boardtool {

namespace {

using Json = nlohmann::ordered_json;

std::string Hex4(std::uint32_t number) {
  std::array<char, 16> text{};
  std::snprintf(text.data(), text.size(), "%04X", static_cast<unsigned>(number));
  return text.data();
}

Json JsonOf(const std::vector<CapturedRegister>& registers) {
  Json json = Json::array();
  for (const CapturedRegister& reg : registers) {
    const std::string behind = RegisterOf(reg.access);
    json.push_back({{"place", PlaceOf(reg.access)},
                    {"register", behind},
                    {"value", Hex(reg.access.value, static_cast<int>(2 * reg.access.width))},
                    {"reads", reg.reads}});
  }
  return json;
}

class ReportMaker {
 public:
  explicit ReportMaker(const ReportOptions& options) : folder_(options.folder) {}

  Json Make() {
    report_["simulated"] = IsSimulated();
    Part("identity", [this] { return Identity(); });
    Part("processors", [] { return Processors(); });
    Part("pci", [] { return Pci(); });
    Part("controllers", [this] { return Controllers(); });
    MakeBoard();
    report_["missing"] = missing_;
    report_["complete"] = missing_.empty();
    return report_;
  }

 private:
  template <class Work>
  void Part(const char* name, Work work) {
    try {
      const std::string failure = FailureOf([&] { report_[name] = work(); });
      if (!failure.empty()) {
        Miss(name, failure);
      }
    } catch (int number) {  // as the PCI inventory's failure travels
      Miss(name, "failure " + std::to_string(number));
    }
  }

  void Miss(const std::string& name, const std::string& why) {
    report_[name] = nullptr;
    missing_.push_back({{"part", name}, {"why", why}});
  }

  Json Identity() {
    const SMBIOSDiscovery& firmware = SMBIOSDiscovery::Instance();
    if (MachineId().empty()) {
      throw CannotRun("the firmware tables name no base board product");
    }
    return {{"system_id", MachineId()},
            {"manufacturer", firmware.systemInfo.manufacturer},
            {"product", firmware.systemInfo.productName},
            {"bios", firmware.biosInfo.vendor + " " + firmware.biosInfo.version},
            {"bios_date", firmware.biosInfo.releaseDate}};
  }

  static Json Processors() {
    Json json = Json::array();
    for (const ProcessorInfo& processor : SMBIOSDiscovery::Instance().processors) {
      json.push_back({{"manufacturer", processor.manufacturer},
                      {"version", processor.version},
                      {"family", processor.family},
                      {"cores", processor.coreCount},
                      {"mhz", processor.currentSpeed}});
    }
    if (json.empty()) {
      throw CannotRun("the firmware tables name no processor");
    }
    return json;
  }

  static Json Pci() {
    Json json = Json::array();
    for (const PciDevice& device : PciDeviceList::Instance().Devices()) {
      std::array<char, 16> place{};
      std::snprintf(place.data(), place.size(), "%02X:%02X.%u", static_cast<unsigned>(device.bus),
                    static_cast<unsigned>(device.device), static_cast<unsigned>(device.function));
      json.push_back({{"place", place.data()},
                      {"id", Hex4(device.vendorId) + ":" + Hex4(device.deviceId)},
                      {"subsystem", Hex4(device.subVendorId) + ":" + Hex4(device.subDeviceId)},
                      {"class", Hex(device.classCode, 6)},
                      {"description", device.description}});
    }
    return json;
  }

  Json Controllers() const {
    std::list<HDD_CTRL_INFO> controllers;
    const std::string ini = PathIn(folder_, "msctrl.ini");
    WMIDiscovery& management = WMIDiscovery::Instance();
    MSUtils::DiscoverInfoListIDEController(ini, &management, controllers);
    MSUtils::DiscoverInfoListSCSIController(ini, &management, controllers);
    ControllerNames names(ini);
    Json json = Json::array();
    for (const HDD_CTRL_INFO& controller : controllers) {
      json.push_back({{"name", names.Find(controller.Ids())},
                      {"description", controller.description},
                      {"device", controller.pnpDeviceId},
                      {"disk", FindDiskOf(controller.pnpDeviceId)}});
    }
    return json;
  }

  // The board's driver is captured from here on, so that each register that is read is told.
  void MakeBoard() {
    platform::Host& machine = platform::TheHost();
    MakeLeds(machine);
    CapturedDrivers drivers(machine.drivers);
    platform::Host captured = HostWith(machine, {.drivers = &drivers});
    const platform::HostInPlace inPlace(captured);
    std::optional<BoardOnMachine> board;
    Json registers = Json::object();
    Part("board", [&]() -> Json {
      board.emplace(folder_);
      registers["building"] = JsonOf(drivers.Take());
      return {{"class", board->Board().GetClassName()}, {"chips", board->Chips()}};
    });
    const auto reading = [&](const char* name, const std::function<std::string(MotherBoard&)>& read) {
      Part(name, [&]() -> Json {
        if (!board) {
          throw CannotRun("there is no board");
        }
        Json json = Json::parse(read(board->Board()));
        registers[name] = JsonOf(drivers.Take());
        return json;
      });
    };
    reading("fans", [](MotherBoard& one) { return FansJson(ReadFans(one)); });
    reading("zones", [](MotherBoard& one) {
      one.LoadZones();
      return ZonesJson(ReadZones(one));
    });
    reading("devices", [](MotherBoard& one) { return DevicesJson(ReadDevices(one)); });
    Part("registers", [&]() -> Json {
      if (!board) {
        throw CannotRun("there is no board");
      }
      return registers;
    });
  }

  void MakeLeds(platform::Host& machine) {
    Part("leds", [&]() -> Json {
      const BoardFiles names = BoardFilesIn(folder_);
      const std::vector<IniOutline> files = ReadBoardFiles(names);
      RehearsalWish wish;
      wish.withSources = false;
      const BoardPlan plan = Rehearse(files, names, MachineId(), machine, wish);
      Json json = Json::array();
      for (const LedPlan& led : plan.leds) {
        std::string chosen;
        for (const IniEntry* const entry : plan.found) {
          if (LoweredName(entry->key) == led.led->chipKey) {
            chosen = entry->value + " (" + boardtool::PlaceOf(files, *entry) + ")";
          }
        }
        json.push_back({{"led", std::string(led.led->id)},
                        {"lit", led.IsLit()},
                        {"blinks_by_itself", led.blinksByItself},
                        {"chip", chosen}});
      }
      return json;
    });
  }

  std::string folder_;
  Json report_ = Json::object();
  Json missing_ = Json::array();
};

std::string TextOf(const Json& value) {
  if (value.is_string()) {
    return value.get<std::string>();
  }
  if (value.is_boolean()) {
    return value.get<bool>() ? "yes" : "no";
  }
  return value.is_null() ? "-" : value.dump(-1, ' ', false, Json::error_handler_t::replace);
}

// Objects are lines, lists of objects are tables with their keys as headings.
std::string SectionText(const Json& value) {
  std::string text;
  if (value.is_object()) {
    for (const auto& [key, one] : value.items()) {
      text += one.is_array() && !one.empty() && one.front().is_object() ? key + ":\n" + SectionText(one)
                                                                        : key + ": " + TextOf(one) + "\n";
    }
    return text;
  }
  if (!value.is_array()) {
    return TextOf(value) + "\n";
  }
  std::vector<std::vector<std::string>> rows;
  for (const Json& one : value) {
    std::vector<std::string> heading;
    std::vector<std::string> row;
    for (const auto& [key, field] : one.items()) {
      heading.push_back(key);
      row.push_back(TextOf(field));
    }
    if (rows.empty()) {
      rows.push_back(std::move(heading));
    }
    rows.push_back(std::move(row));
  }
  return rows.empty() ? "none\n" : TableText(rows);
}

std::string ReportText(const Json& report) {
  std::string text;
  for (const auto& [name, value] : report.items()) {
    if (name == "missing" || name == "complete" || name == "simulated" || value.is_null()) {
      continue;
    }
    text += (text.empty() ? "" : "\n") + std::string("== ") + name +
            (report["simulated"].get<bool>() && name == "identity" ? " (of a simulated machine)" : "") + "\n" +
            SectionText(value);
  }
  if (report["complete"].get<bool>()) {
    return text + "\nThis report is complete.\n";
  }
  text += "\nThis report is incomplete:\n";
  for (const Json& missing : report["missing"]) {
    text += "  " + missing["part"].get<std::string>() + ": " + missing["why"].get<std::string>() + "\n";
  }
  return text;
}

}  // namespace

int Report(const ReportOptions& options) {
  RequireReadable(BoardFilesIn(options.folder));
  const Json report = ReportMaker(options).Make();
  Print(options.json ? report.dump(2, ' ', false, Json::error_handler_t::replace) + "\n" : ReportText(report));
  return report["complete"].get<bool>() ? 0 : 1;
}

}  // namespace panelglow::boardtool
