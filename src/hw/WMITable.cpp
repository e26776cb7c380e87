#include "hw/WMITable.h"

namespace panelglow {

namespace {

// The texts of a value: a text or an array of texts; null reads as one empty text, anything else as nothing.
std::vector<std::string> TextsOf(const platform::ManagementValue& value) {
  std::vector<std::string> texts;
  const auto add = [&](const platform::ManagementScalar& scalar, bool inArray) {
    if (const auto* text = std::get_if<wstring>(&scalar)) {
      texts.push_back(platform::CodePageFromWide(*text));
    } else if (!inArray && std::holds_alternative<std::monostate>(scalar)) {
      texts.emplace_back();
    }
  };
  if (const auto* array = std::get_if<platform::ManagementArray>(&value.content)) {
    for (const platform::ManagementScalar& element : *array) {
      add(element, true);
    }
  } else {
    add(std::get<platform::ManagementScalar>(value.content), false);
  }
  return texts;
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
  const std::vector<std::string> texts = TextsOf(*value);
  out = texts.empty() ? std::string() : texts.front();
  return true;
}

}  // namespace panelglow
