// The platform's management instrumentation: namespaces, queries, rows with typed properties.
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include "platform/Text.h"

namespace panelglow::platform {

/// One element of a property. std::monostate is the null value; 64-bit integers come as text, as the genuine service
/// gives them.
using ManagementScalar = std::variant<std::monostate, bool, std::int8_t, std::uint8_t, std::int16_t, std::uint16_t,
                                      std::int32_t, std::uint32_t, float, double, wstring>;

using ManagementArray = std::vector<ManagementScalar>;

struct ManagementValue {
  std::variant<ManagementScalar, ManagementArray> content;
};

/// A row of a query's answer. Property names are compared without regard to ASCII case.
class ManagementRow {
 public:
  void Set(std::u16string_view property, ManagementValue value);

  /// Null when the row has no such property.
  [[nodiscard]] const ManagementValue* Find(std::u16string_view property) const;

 private:
  std::map<wstring, ManagementValue> properties_;  // by lowered name
};

/// A call of a method of an object, with one object as parameter ("InData") and one as result ("OutData").
struct ManagementCall {
  wstring className;   // of the object
  wstring objectPath;  // which object of the class, by its "__RELPATH"
  wstring method;
  wstring inputClass;  // class of the parameter object
  ManagementRow input;
};

/// The steps of a call, in order; kNone: all succeeded.
enum class ManagementCallStep {
  kNone,
  kGetMethod,
  kGetClass,
  kSpawnParameters,
  kGetInputClass,
  kSpawnInput,
  kPopulateInput,
  kPutInput,
  kExecute,
  kGetOutput,
  kQueryOutput,
};

struct ManagementCallResult {
  ManagementCallStep failedAt = ManagementCallStep::kNone;
  ManagementRow output;
};

/// A connected namespace.
class ManagementConnection {
 public:
  virtual ~ManagementConnection() = default;

  /// The rows of a query, in the service's order; nothing when the query failed.
  virtual std::optional<std::vector<ManagementRow>> Query(std::u16string_view query) = 0;

  virtual ManagementCallResult Call(const ManagementCall& call) = 0;
};

/// The steps at which a connection can fail, in order.
enum class ManagementStep { kInitialize, kCreateLocator, kConnect, kSetSecurity };

struct ManagementError {
  ManagementStep step = ManagementStep::kConnect;
  std::uint32_t code = 0;
};

class Management {
 public:
  virtual ~Management() = default;

  /// Connects to a namespace such as "ROOT\CIMV2". Null, with the reason in `error`, on failure.
  virtual std::unique_ptr<ManagementConnection> Connect(std::string_view name_space, ManagementError& error) = 0;
};

}  // namespace panelglow::platform
