#include "config/Section.h"

namespace panelglow {

const Record* Section::GetRecord(const std::string& key) const {
  const auto found = records.find(key);
  return found == records.end() ? nullptr : found->second.get();
}

void Section::AddRecord(std::unique_ptr<Record> record) {
  const std::string key = record->GetKey();
  records[key] = std::move(record);
}

std::string Section::ToText() const {
  std::string text = "[" + name + "]\n";
  for (const auto& [key, record] : records) {
    text += record->ToText();
  }
  return text;
}

}  // namespace panelglow
