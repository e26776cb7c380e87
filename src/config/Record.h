// One "key = value" line of an IniBase section.
#pragma once

#include <string>
#include <utility>

namespace panelglow {

class Record {
 public:
  Record(std::string recordKey, std::string recordValue) : key(std::move(recordKey)), value(std::move(recordValue)) {}
  virtual ~Record() = default;
  Record(const Record&) = default;
  Record& operator=(const Record&) = default;

  [[nodiscard]] const std::string& GetKey() const { return key; }
  [[nodiscard]] const std::string& GetValue() const { return value; }
  [[nodiscard]] std::string ToText() const { return key + " = " + value + "\n"; }

 private:
  std::string key;
  std::string value;
};

}  // namespace panelglow
