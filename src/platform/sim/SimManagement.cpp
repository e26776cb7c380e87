#include "platform/sim/SimManagement.h"

#include "platform/AsciiCase.h"
#include "platform/Text.h"
#include "platform/management/DeviceRows.h"
#include "platform/management/WqlQuery.h"
#include "platform/sim/FirmwareTable.h"

namespace panelglow::platform::sim {

namespace {

using management::kDeviceNameSpace;
using management::kFirmwareNameSpace;

// A call goes down into the firmware and back.
constexpr Microseconds kCallCost_us = 2000;

// A query about devices asks their drivers.
constexpr Microseconds kDeviceQueryCost_us = 3000;

}  // namespace

class SimManagement::Connection : public ManagementConnection {
 public:
  Connection(SimManagement& owner, const Tables& tables, std::string_view nameSpace)
      : owner_(owner),
        tables_(tables),
        reachesDevices_(nameSpace == kDeviceNameSpace),
        reachesFirmware_(nameSpace == kFirmwareNameSpace) {}

  std::optional<std::vector<ManagementRow>> Query(std::u16string_view text) override {
    const std::optional<management::WqlQuery> query = management::ParseWql(Utf8FromWide(text));
    if (!query) {
      return std::nullopt;
    }
    if (!query->resultClass.empty()) {
      return Ask([&] { return owner_.devices_.Associated(*query); });
    }
    const auto table = tables_.find(Lowered(query->className));
    std::optional<std::vector<ManagementRow>> rows =
        table != tables_.end() ? table->second : Ask([&] { return owner_.devices_.Rows(query->className); });
    if (rows && query->condition) {
      std::erase_if(*rows, [&](const ManagementRow& row) { return !management::Fulfils(row, *query->condition); });
    }
    return rows;
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
  template <class Question>
  std::optional<std::vector<ManagementRow>> Ask(Question question) {
    if (!reachesDevices_) {
      return std::nullopt;
    }
    owner_.scheduler_.Spend(kDeviceQueryCost_us);
    return question();
  }

  SimManagement& owner_;
  const Tables& tables_;
  bool reachesDevices_;
  bool reachesFirmware_;
};

SimManagement::SimManagement(const MachineDescription& machine, const DeviceTables& devices, Scheduler& scheduler,
                             FirmwareCall* firmware, std::function<void()> moved)
    : devices_(devices), scheduler_(scheduler), firmware_(firmware), moved_(std::move(moved)) {
  nameSpaces_[std::string(kDeviceNameSpace)];
  Tables& wmi = nameSpaces_["root\\wmi"];
  if (machine.firmware.inManagement) {
    wmi["mssmbios_rawsmbiostables"].push_back(management::FirmwareTableRow(BuildFirmwareTable(machine.firmware)));
  }
  if (firmware_ != nullptr) {
    wmi["tmbbintm"].push_back(firmware_->Instance());
  }
  for (const ManagementTable& table : machine.management) {
    nameSpaces_[Lowered(table.nameSpace)][Lowered(table.className)] = table.rows;
  }
}

std::unique_ptr<ManagementConnection> SimManagement::Connect(std::string_view nameSpace, ManagementError& error) {
  const auto found = nameSpaces_.find(Lowered(management::LocalNameSpace(nameSpace)));
  if (found == nameSpaces_.end()) {
    error = {ManagementStep::kConnect, management::kInvalidNameSpace};
    return nullptr;
  }
  return std::make_unique<Connection>(*this, found->second, found->first);
}

}  // namespace panelglow::platform::sim
