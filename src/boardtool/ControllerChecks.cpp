#include "boardtool/ControllerChecks.h"

#include <algorithm>
#include <array>
#include <string>
#include <vector>

#include "harness/base/CDMUtil.h"
#include "storage/ControllerSection.h"

namespace panelglow::boardtool {

namespace {

constexpr std::array kInterfaces{"csmi", "scsi", "wind", "stor", "sto2", "cssc", "cswn", "wmi"};

struct Form {
  std::string_view section;
  std::size_t ids;  // numbers in front
  std::size_t fields;
};
constexpr std::array<Form, 3> kForms{{{kSataSection, 4, 6}, {kSasSection, 4, 6}, {kNvsSection, 2, 5}}};

const Form* FormOf(std::string_view section) {
  const auto found = std::find_if(kForms.begin(), kForms.end(), [&](const Form& form) {
    return LoweredName(form.section) == LoweredName(section);
  });
  return found == kForms.end() ? nullptr : &*found;
}

// Fields between commas; a comma within quotes belongs to its field.
std::vector<std::string> FieldsOf(const std::string& line) {
  std::vector<std::string> fields(1);
  bool isQuoted = false;
  for (const char c : line) {
    if (c == '"') {
      isQuoted = !isQuoted;
    } else if (c == ',' && !isQuoted) {
      fields.emplace_back();
    } else {
      fields.back() += c;
    }
  }
  for (std::string& field : fields) {
    field = CDMUtil::Trim(field);
  }
  return fields;
}

void CheckLine(const IniOutline& file, const Form& form, const std::string& text, std::size_t line,
               std::size_t column, Findings& findings) {
  const auto add = [&](std::string_view rule, const std::string& what) {
    findings.Add(rule, file.path, line, column, what);
  };
  const std::vector<std::string> fields = FieldsOf(text);
  if (fields.size() != form.fields) {
    add("controller-line", "a line of this section has " + std::to_string(form.fields) + " fields, this one has " +
                               std::to_string(fields.size()));
    return;
  }
  for (std::size_t i = 0; i < form.ids; ++i) {
    constexpr std::int64_t kMostOfAWord = 0xFFFF;
    if (!CDMUtil::IsInteger(fields[i])) {
      add("not-a-number", "\"" + fields[i] + "\" stands where an id belongs");
    } else if (CDMUtil::ToInt64(fields[i]) > kMostOfAWord || CDMUtil::ToInt64(fields[i]) < 0) {
      add("bit-out-of-range", "an id has 16 bits: \"" + fields[i] + "\"");
    }
  }
  const std::string interface = CDMUtil::ToLower(fields[form.fields - 2]);
  if (std::find(kInterfaces.begin(), kInterfaces.end(), interface) == kInterfaces.end()) {
    add("controller-line", "\"" + interface + "\" is no interface and counts as csmi");
  }
  const std::string& name = fields.back();
  if (name.empty() || name != CDMUtil::ToLower(name)) {
    add("controller-line", name.empty() ? "a controller without a name is found by none"
                                        : "\"" + name + "\" is found by no test: a name stands in lower case");
  }
}

}  // namespace

std::vector<std::string> ControllerNamesIn(const IniOutline& file) {
  std::vector<std::string> names;
  const auto add = [&](const std::string& line) { names.push_back(FieldsOf(line.substr(0, line.find(';'))).back()); };
  for (const IniStrayLine& line : file.strays) {
    add(line.text);
  }
  for (const IniEntry& entry : file.entries) {
    add(entry.key + "=" + entry.value);
  }
  return names;
}

void CheckControllers(const IniOutline& file, Findings& findings) {
  std::string section;
  std::size_t next = 0;
  const auto sectionAt = [&](std::size_t line) {
    for (next = 0; next < file.sections.size() && file.sections[next].line < line; ++next) {
      section = file.sections[next].name;
    }
    return FormOf(section);
  };
  if (file.sections.empty()) {
    findings.Add("unknown-section", file.path, 1, 1, "the file has no section of controllers");
  }
  for (const IniSection& one : file.sections) {
    if (FormOf(one.name) == nullptr) {
      findings.Add("unknown-section", file.path, one.line, one.column,
                   "[" + one.name + "] is no section of controllers: nothing in it counts");
    }
  }
  for (const IniStrayLine& line : file.strays) {
    if (const Form* const form = sectionAt(line.line)) {
      CheckLine(file, *form, line.text, line.line, line.column, findings);
    }
  }
  for (const IniEntry& entry : file.entries) {
    if (const Form* const form = FormOf(entry.section)) {
      CheckLine(file, *form, entry.key + "=" + entry.value, entry.line, entry.column, findings);
    }
  }
}

}  // namespace panelglow::boardtool
