#include "platform/sim/SimManagement.h"

#include <algorithm>
#include <cctype>
#include <sstream>

#include "platform/Text.h"
#include "platform/sim/FirmwareTable.h"

namespace panelglow::platform::sim {

namespace {

std::string Lower(std::string_view text) {
  std::string lowered(text);
  std::transform(lowered.begin(), lowered.end(), lowered.begin(),
                 [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
  return lowered;
}

constexpr std::string_view kFirmwareNameSpace = "root\\wmi";
constexpr std::string_view kThisMachine = "\\\\.\\";  // may stand in front of a namespace

// A call goes down into the firmware and back.
constexpr Microseconds kCallCost_us = 2000;

}  // namespace

class SimManagement::Connection : public ManagementConnection {
 public:
  Connection(SimManagement& owner, const Tables& tables, bool reachesFirmware)
      : owner_(owner), tables_(tables), reachesFirmware_(reachesFirmware) {}

  // "SELECT ... FROM class": whole tables only; a condition is a query that this service does not understand.
  std::optional<std::vector<ManagementRow>> Query(std::u16string_view query) override {
    std::istringstream words(Lower(Utf8FromWide(query)));
    std::string word;
    std::string previous;
    std::string className;
    bool select = false;
    while (words >> word) {
      select = select || word == "select";
      if (!className.empty()) {
        return std::nullopt;
      }
      if (previous == "from") {
        className = word;
      }
      previous = word;
    }
    const auto table = tables_.find(className);
    if (!select || table == tables_.end()) {
      return std::nullopt;
    }
    return table->second;
  }

  ManagementCallResult Call(const ManagementCall& call) override {
    if (!reachesFirmware_ || owner_.firmware_ == nullptr) {
      return {ManagementCallStep::kGetMethod, {}};  // the class does not exist here
    }
    owner_.scheduler_.Spend(kCallCost_us);
    ManagementCallResult result = owner_.firmware_->Call(call);
    owner_.moved_();
    return result;
  }

 private:
  SimManagement& owner_;
  const Tables& tables_;
  bool reachesFirmware_;
};

SimManagement::SimManagement(const MachineDescription& machine, Scheduler& scheduler, FirmwareCall* firmware,
                             std::function<void()> moved)
    : scheduler_(scheduler), firmware_(firmware), moved_(std::move(moved)) {
  nameSpaces_["root\\cimv2"];
  Tables& wmi = nameSpaces_["root\\wmi"];
  if (machine.firmware.inManagement) {
    const std::vector<std::uint8_t> table = BuildFirmwareTable(machine.firmware);
    ManagementRow row;
    row.Set(u"Size", {ManagementScalar(static_cast<std::uint32_t>(table.size()))});
    ManagementArray bytes(table.begin(), table.end());
    row.Set(u"SMBiosData", {std::move(bytes)});
    wmi["mssmbios_rawsmbiostables"].push_back(std::move(row));
  }
  if (firmware_ != nullptr) {
    wmi["tmbbintm"].push_back(firmware_->Instance());
  }
  for (const ManagementTable& table : machine.management) {
    nameSpaces_[Lower(table.nameSpace)][Lower(table.className)] = table.rows;
  }
}

std::unique_ptr<ManagementConnection> SimManagement::Connect(std::string_view nameSpace, ManagementError& error) {
  if (nameSpace.substr(0, kThisMachine.size()) == kThisMachine) {
    nameSpace.remove_prefix(kThisMachine.size());
  }
  const auto found = nameSpaces_.find(Lower(nameSpace));
  if (found == nameSpaces_.end()) {
    error = {ManagementStep::kConnect, 0x8004100E};  // the namespace does not exist
    return nullptr;
  }
  return std::make_unique<Connection>(*this, found->second, found->first == kFirmwareNameSpace);
}

}  // namespace panelglow::platform::sim
