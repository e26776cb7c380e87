#include "pages/CliCommand.h"

namespace panelglow::pages {

namespace {

// "TEXT:{text,json}" names a value and lists all there are.
void ReadValue(const std::string& type, Option& option) {
  const std::size_t open = type.find('{');
  const std::size_t close = type.find('}', open);
  if (open != std::string::npos && close != std::string::npos) {
    option.values = Values::kChoices;
    option.choices = CLI::detail::split(type.substr(open + 1, close - open - 1), ',');
  }
  option.value = type.substr(0, type.find_first_of(":{"));
  if (option.value == "FILE") {
    option.values = Values::kFiles;
  } else if (option.value == "FOLDER") {
    option.values = Values::kFolders;
  }
}

Option OptionOf(const CLI::Option& from) {
  Option option;
  for (const std::string& name : from.get_snames()) {
    option.names.push_back("-" + name);
  }
  for (const std::string& name : from.get_lnames()) {
    option.names.push_back("--" + name);
  }
  if (from.get_items_expected_max() != 0 || option.names.empty()) {
    ReadValue(from.get_type_name(), option);
  }
  if (option.names.empty()) {
    option.value = from.get_name(true);
  }
  option.meaning = from.get_description();
  if (!from.get_default_str().empty()) {
    option.meaning += " (default: " + from.get_default_str() + ")";
  }
  option.isRequired = from.get_required();
  return option;
}

}  // namespace

Command CommandOf(const CLI::App& app) {
  Command command;
  command.name = app.get_name();
  command.summary = app.get_description();
  for (const CLI::Option* const option : app.get_options()) {
    command.options.push_back(OptionOf(*option));
  }
  for (const CLI::App* const verb : app.get_subcommands({})) {
    command.verbs.push_back(CommandOf(*verb));
  }
  return command;
}

}  // namespace panelglow::pages
