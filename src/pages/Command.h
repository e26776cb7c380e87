// What a program takes on its command line, as its manual page and its completions tell it.
#pragma once

#include <string>
#include <vector>

namespace panelglow::pages {

/// What may stand as a value, beyond free text.
enum class Values { kAnything, kChoices, kFiles, kFolders };

struct Option {
  std::vector<std::string> names = {};  // with their hyphens; none for what has a place in the line
  std::string value = {};               // its name for people; empty: the option stands alone
  std::string meaning = {};
  Values values = Values::kAnything;
  std::vector<std::string> choices = {};
  bool isRequired = false;
};

struct Command {
  std::string name = {};
  std::string summary = {};
  std::vector<Option> options = {};
  std::vector<Command> verbs = {};
  bool hasEqualsSigns = false;  // "-name=value" in place of "--name value"
};

}  // namespace panelglow::pages
