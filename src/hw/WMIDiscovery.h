// The one door to the platform's management instrumentation: a connection to a namespace, and the rows of its queries
// kept in tables by name. Not locked: callers take turns.
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "hw/WMITable.h"
#include "platform/Management.h"

namespace panelglow {

class WMIDiscovery {
 public:
  /// The shared connection to "ROOT\CIMV2", made at first use. Throws a std::string when it cannot be made; the next
  /// call tries again.
  static WMIDiscovery& Instance();

  /// Gives the shared connection and its tables up; for a process that runs one machine after the other, as tests do.
  static void Forget();

  /// Connects to a namespace. Throws a std::string on failure.
  explicit WMIDiscovery(const std::string& nameSpace);
  virtual ~WMIDiscovery() = default;
  WMIDiscovery(const WMIDiscovery&) = delete;
  WMIDiscovery& operator=(const WMIDiscovery&) = delete;

  /// Runs a query and keeps its rows as the current table. Returns their number; a failing query has none.
  int RunQuery(const wstring& query);

  /// A text of the current table; false when there is no such row or property.
  bool GetCurrentValue(const wstring& property, std::string& out, int row);

  /// Runs a query and keeps its rows under a name, in place of what stood there.
  void RunNamedQuery(const wstring& tableName, const wstring& query);

  /// Makes sure that a table of all rows of a class exists, under the class's name.
  void GetTable(const wstring& className);

  /// -1 when there is no table of that name.
  int RowCount(const wstring& tableName) const;
  bool GetValue(const wstring& tableName, const wstring& property, std::string& out, int row) const;

  /// The number in `property` of the query's first row; `out` stays as it is when there is none.
  void QueryNumber(const wstring& query, const wstring& property, double& out);

  /// The bytes of an array property of a class; each further row replaces those of the one before. 0, or -1 when the
  /// query failed or a row has no such property.
  int GetBinaryProperty(const wstring& className, const wstring& property, std::vector<std::uint8_t>& destination);

  /// Calls a method of an object.
  platform::ManagementCallResult Call(const platform::ManagementCall& call);

 private:
  std::vector<platform::ManagementRow> Rows(const wstring& query);

  std::unique_ptr<platform::ManagementConnection> services;
  std::unique_ptr<WMITable> currentTable;
  std::map<wstring, std::unique_ptr<WMITable>> tables;
};

}  // namespace panelglow
