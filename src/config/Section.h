// A section of an IniBase: records by key, in plain byte order.
#pragma once

#include <map>
#include <memory>
#include <string>
#include <utility>

#include "config/Record.h"

namespace panelglow {

class Section {
 public:
  explicit Section(std::string sectionName) : name(std::move(sectionName)) {}
  virtual ~Section() = default;

  /// Null when there is none of that key (compared with letter case). Owned by the section.
  [[nodiscard]] const Record* GetRecord(const std::string& key) const;

  /// Replaces a record of the same key.
  void AddRecord(std::unique_ptr<Record> record);

  [[nodiscard]] const std::string& GetName() const { return name; }
  [[nodiscard]] std::string ToText() const;

 private:
  std::string name;
  std::map<std::string, std::unique_ptr<Record>> records;
};

}  // namespace panelglow
