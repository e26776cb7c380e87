// The rows of one management query, readable in any order and as often as wanted.
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "platform/Management.h"

namespace panelglow {

class WMITable {
 public:
  explicit WMITable(std::vector<platform::ManagementRow> tableRows) : rows(std::move(tableRows)) {}
  virtual ~WMITable() = default;

  [[nodiscard]] int RowCount() const { return static_cast<int>(rows.size()); }

  /// The first text of a property of a row. True when the row has the property or the text is not empty.
  bool GetValue(const wstring& property, std::string& out, int row) const;

 private:
  std::vector<platform::ManagementRow> rows;
};

}  // namespace panelglow
