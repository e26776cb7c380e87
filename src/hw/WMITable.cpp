#include "hw/WMITable.h"

#include <span>

namespace panelglow {

namespace {

// The first text of a value, which may be an array; empty for null and for values of other types.
std::string TextOf(const platform::ManagementValue& value) {
  const auto* array = std::get_if<platform::ManagementArray>(&value.content);
  const auto* single = std::get_if<platform::ManagementScalar>(&value.content);
  const std::span<const platform::ManagementScalar> scalars =
      array != nullptr ? std::span(*array) : std::span(single, 1);
  for (const platform::ManagementScalar& scalar : scalars) {
    if (const auto* text = std::get_if<wstring>(&scalar)) {
      return platform::CodePageFromWide(*text);
    }
  }
  return {};
}

}  // namespace

bool WMITable::GetValue(const wstring& property, std::string& out, int row) const {
  if (row < 0 || row >= RowCount()) {
    return false;
  }
  const platform::ManagementValue* value = rows[static_cast<std::size_t>(row)].Find(property);
  if (value == nullptr) {
    out.clear();
    return false;
  }
  out = TextOf(*value);
  return true;
}

}  // namespace panelglow
