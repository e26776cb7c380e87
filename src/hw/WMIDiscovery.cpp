#include "hw/WMIDiscovery.h"

#include <mutex>
#include <optional>
#include <type_traits>
#include <utility>

#include "harness/base/CDMUtil.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

std::string FailureText(const platform::ManagementError& error) {
  const std::string code = CDMUtil::ToHexString(static_cast<int>(error.code));
  std::string text;
  switch (error.step) {
    case platform::ManagementStep::kInitialize:
      text = "Failed to initialize COM library. Error code = 0x" + code;
      break;
    case platform::ManagementStep::kCreateLocator:
      text = "Failed to create IWbemLocator object. Err code = 0x" + code;
      break;
    case platform::ManagementStep::kConnect:
      text = "Could not connect. Error code = 0x" + code;
      break;
    case platform::ManagementStep::kSetSecurity:
      text = "Could not set proxy blanket. Error code = 0x" + code;
      break;
  }
  return "WMIDiscovery Error: " + text + "\n";
}

// A number by its own type; a text, as 64-bit integers come, by its digits; nothing for null.
std::optional<double> NumberOf(const platform::ManagementScalar& scalar) {
  return std::visit(
      [](const auto& value) -> std::optional<double> {
        using Value = std::decay_t<decltype(value)>;
        if constexpr (std::is_same_v<Value, std::monostate>) {
          return std::nullopt;
        } else if constexpr (std::is_same_v<Value, wstring>) {
          return static_cast<double>(CDMUtil::ToInt64(CDMUtil::ToString(std::u16string_view(value))));
        } else {
          return static_cast<double>(value);
        }
      },
      scalar);
}

// The low byte of an integer; 0 for anything else.
std::uint8_t ByteOf(const platform::ManagementScalar& scalar) {
  return std::visit(
      [](const auto& value) -> std::uint8_t {
        if constexpr (std::is_integral_v<std::decay_t<decltype(value)>>) {
          return static_cast<std::uint8_t>(value);
        } else {
          return 0;
        }
      },
      scalar);
}

}  // namespace

namespace {

struct Shared {
  std::mutex guard;
  std::unique_ptr<WMIDiscovery> connection;  // by guard
};

Shared& TheShared() {
  static Shared shared;
  return shared;
}

}  // namespace

WMIDiscovery& WMIDiscovery::Instance() {
  Shared& shared = TheShared();
  {
    const std::lock_guard<std::mutex> lock(shared.guard);
    if (shared.connection) {
      return *shared.connection;
    }
  }
  auto connection = std::make_unique<WMIDiscovery>("ROOT\\CIMV2");  // not under the lock: others run meanwhile
  const std::lock_guard<std::mutex> lock(shared.guard);
  if (!shared.connection) {
    shared.connection = std::move(connection);
  }
  return *shared.connection;
}

void WMIDiscovery::Forget() {
  Shared& shared = TheShared();
  const std::lock_guard<std::mutex> lock(shared.guard);
  shared.connection.reset();
}

WMIDiscovery::WMIDiscovery(const std::string& nameSpace) {
  platform::ManagementError error;
  services = platform::TheHost().management.Connect(nameSpace, error);
  if (!services) {
    throw FailureText(error);
  }
}

std::vector<platform::ManagementRow> WMIDiscovery::Rows(const wstring& query) {
  return services->Query(query).value_or(std::vector<platform::ManagementRow>{});
}

int WMIDiscovery::RunQuery(const wstring& query) {
  currentTable = std::make_unique<WMITable>(Rows(query));
  return currentTable->RowCount();
}

bool WMIDiscovery::GetCurrentValue(const wstring& property, std::string& out, int row) {
  return currentTable != nullptr && currentTable->GetValue(property, out, row);
}

void WMIDiscovery::RunNamedQuery(const wstring& tableName, const wstring& query) {
  tables[tableName] = std::make_unique<WMITable>(Rows(query));
}

void WMIDiscovery::GetTable(const wstring& className) {
  if (tables.count(className) == 0) {
    RunNamedQuery(className, u"SELECT * FROM " + className);
  }
}

int WMIDiscovery::RowCount(const wstring& tableName) const {
  const auto found = tables.find(tableName);
  return found == tables.end() ? -1 : found->second->RowCount();
}

bool WMIDiscovery::GetValue(const wstring& tableName, const wstring& property, std::string& out, int row) const {
  const auto found = tables.find(tableName);
  return found != tables.end() && found->second->GetValue(property, out, row);
}

void WMIDiscovery::QueryNumber(const wstring& query, const wstring& property, double& out) {
  const std::vector<platform::ManagementRow> rows = Rows(query);
  const platform::ManagementValue* value = rows.empty() ? nullptr : rows.front().Find(property);
  if (value == nullptr) {
    return;
  }
  std::optional<double> number;
  if (const auto* array = std::get_if<platform::ManagementArray>(&value->content)) {
    number = array->empty() ? std::nullopt : NumberOf(array->front());
  } else {
    number = NumberOf(std::get<platform::ManagementScalar>(value->content));
  }
  out = number.value_or(out);
}

int WMIDiscovery::GetBinaryProperty(const wstring& className, const wstring& property,
                                    std::vector<std::uint8_t>& destination) {
  const std::optional<std::vector<platform::ManagementRow>> rows = services->Query(u"SELECT * FROM " + className);
  if (!rows) {
    return -1;
  }
  for (const platform::ManagementRow& row : *rows) {
    const platform::ManagementValue* value = row.Find(property);
    if (value == nullptr) {
      return -1;
    }
    if (const auto* array = std::get_if<platform::ManagementArray>(&value->content)) {
      destination.clear();
      for (const platform::ManagementScalar& element : *array) {
        destination.push_back(ByteOf(element));
      }
    }
  }
  return 0;
}

platform::ManagementCallResult WMIDiscovery::Call(const platform::ManagementCall& call) {
  return services->Call(call);
}

}  // namespace panelglow
