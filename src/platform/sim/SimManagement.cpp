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

}  // namespace

class SimManagement::Connection : public ManagementConnection {
 public:
  explicit Connection(const Tables& tables) : tables_(tables) {}

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

  ManagementCallResult Call(const ManagementCall& /*call*/) override { return {ManagementCallStep::kGetClass, {}}; }

 private:
  const Tables& tables_;
};

SimManagement::SimManagement(const MachineDescription& machine) {
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
  for (const ManagementTable& table : machine.management) {
    nameSpaces_[Lower(table.nameSpace)][Lower(table.className)] = table.rows;
  }
}

std::unique_ptr<ManagementConnection> SimManagement::Connect(std::string_view nameSpace, ManagementError& error) {
  const auto found = nameSpaces_.find(Lower(nameSpace));
  if (found == nameSpaces_.end()) {
    error = {ManagementStep::kConnect, 0x8004100E};  // the namespace does not exist
    return nullptr;
  }
  return std::make_unique<Connection>(found->second);
}

}  // namespace panelglow::platform::sim
