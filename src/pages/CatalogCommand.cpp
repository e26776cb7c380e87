#include "pages/CatalogCommand.h"

#include <algorithm>
#include <map>
#include <sstream>
#include <stdexcept>

#include "config/XmlEntities.h"

namespace panelglow::pages {

namespace {

using Attributes = std::map<std::string, std::string>;

// Of one element of the catalogue, which stands on one line.
Attributes AttributesOf(const std::string& line) {
  Attributes attributes;
  XmlEntityDecoder entities;
  std::size_t at = line.find(' ', line.find('<'));
  while (at != std::string::npos) {
    const std::size_t equals = line.find("=\"", at);
    const std::size_t end = equals == std::string::npos ? equals : line.find('"', equals + 2);
    if (end == std::string::npos) {
      break;
    }
    attributes[line.substr(at + 1, equals - at - 1)] = entities.Decode(line.substr(equals + 2, end - equals - 2));
    at = end + 1;
  }
  return attributes;
}

std::vector<std::string> Split(const std::string& list) {
  std::vector<std::string> parts;
  std::istringstream in(list);
  for (std::string part; std::getline(in, part, ',');) {
    parts.push_back(part);
  }
  return parts;
}

std::string RangeOf(const Attributes& attributes) {
  const auto text = [&](const char* name) {
    const auto found = attributes.find(name);
    return found == attributes.end() ? std::string() : found->second;
  };
  if (!text("Low").empty()) {
    return "From " + text("Low") + " to " + text("High") + ".";
  }
  return text("EqualToOrGreaterThan").empty() ? "" : text("EqualToOrGreaterThan") + " or more.";
}

// Blanks of any kind and number are one.
std::string Plain(const std::string& text) {
  std::istringstream words(text);
  std::string plain;
  for (std::string word; words >> word;) {
    plain += (plain.empty() ? "" : " ") + word;
  }
  return plain;
}

Option ArgumentOf(Attributes attributes) {
  Option option{{attributes["Name"]}, attributes["Type"], Plain(attributes["Description"])};
  if (option.meaning.empty() || option.meaning.back() != '.') {
    option.meaning += ".";
  }
  for (const std::string& more :
       {RangeOf(attributes), attributes["Value"].empty() ? "" : "Default: " + attributes["Value"] + "."}) {
    option.meaning += more.empty() ? "" : " " + more;
  }
  option.isRequired = attributes["Required"] == "true";
  option.choices = option.value == "boolean" ? std::vector<std::string>{"true", "false"} : Split(attributes["List"]);
  if (!option.choices.empty()) {
    option.values = Values::kChoices;
  } else if (attributes["Value"].substr(0, 2) == ".\\" || attributes["Name"].find("file") != std::string::npos ||
             attributes["Name"].find("File") != std::string::npos) {
    option.values = Values::kFiles;
  }
  return option;
}

// A line of the usage, as "-version=true|false Default is false" or "-locale=<locale>  Default is en_US".
Option RequestOf(const std::string& line) {
  const std::size_t equals = line.find('=');
  const std::size_t end = std::min(line.find(' '), line.size());
  Option option{{line.substr(0, equals)}, line.substr(equals + 1, end - equals - 1), Plain(line.substr(end))};
  if (option.value == "true|false") {
    option.value = "boolean";
    option.values = Values::kChoices;
    option.choices = {"true", "false"};
  } else {
    option.value = option.value.substr(1, option.value.size() - 2);
    option.values = option.value == "filename" ? Values::kFiles : Values::kAnything;
  }
  return option;
}

bool BeginsWith(const std::string& line, std::string_view begin) { return line.compare(0, begin.size(), begin) == 0; }

}  // namespace

Command CommandOfCatalog(std::string_view name, const std::string& catalog, const std::string& usage) {
  Command command;
  command.name = name;
  command.summary = "Checks the front-panel LEDs of this machine: one of its subtests, or questions about them.";
  command.hasEqualsSigns = true;
  std::istringstream elements(catalog);
  for (std::string line; std::getline(elements, line);) {
    line.erase(0, line.find_first_not_of(' '));
    if (BeginsWith(line, "<TEST ")) {
      Attributes test = AttributesOf(line);
      command.verbs.push_back({test["Name"], Plain(test["Description"])});
    } else if (BeginsWith(line, "<ARGUMENT ") && !command.verbs.empty()) {
      command.verbs.back().options.push_back(ArgumentOf(AttributesOf(line)));
    }
  }
  std::istringstream requests(usage);
  for (std::string line; std::getline(requests, line);) {
    if (BeginsWith(line, "-") && line.find('=') != std::string::npos) {
      command.options.push_back(RequestOf(line));
    }
  }
  if (command.verbs.empty() || command.options.empty()) {
    throw std::runtime_error("the program's catalogue or its usage holds no subtests or no parameters");
  }
  for (Option& option : command.options) {
    if (option.names.front() == "-subtest") {
      option.values = Values::kChoices;
      option.meaning = "Which subtest is run, or asked about.";
      for (const Command& verb : command.verbs) {
        option.choices.push_back(verb.name);
      }
    }
  }
  return command;
}

}  // namespace panelglow::pages
