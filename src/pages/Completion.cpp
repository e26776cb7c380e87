#include "pages/Completion.h"

#include <algorithm>
#include <cctype>
#include <iterator>
#include <set>

namespace panelglow::pages {

namespace {

std::string Joined(const std::vector<std::string>& words, std::string_view between) {
  std::string joined;
  for (const std::string& word : words) {
    joined += (joined.empty() ? "" : std::string(between)) + word;
  }
  return joined;
}

// In single quotes, for all three shells.
std::string Quoted(std::string_view text) {
  std::string quoted = "'";
  for (const char c : text) {
    quoted += c == '\'' ? "'\\''" : std::string(1, c);
  }
  return quoted + "'";
}

// The first sentence. A full stop within a word, as in "chip.ini", ends none.
std::string Brief(std::string_view text) {
  text = text.substr(0, text.find_first_of(";\n"));
  text = text.substr(0, text.find(". "));
  return std::string(text.substr(0, text.size() - (text.ends_with('.') ? 1 : 0)));
}

// What the shell reads as `text`: whatever would mean something to it is behind a backslash.
std::string Word(std::string_view text) {
  std::string word;
  for (const char c : text) {
    const bool isPlain = std::isalnum(static_cast<unsigned char>(c)) != 0 || std::string_view("-_./").find(c) < 4;
    word += isPlain ? std::string(1, c) : std::string("\\") + c;
  }
  return word;
}

std::string Words(const std::vector<std::string>& choices) {
  std::vector<std::string> words;
  std::transform(choices.begin(), choices.end(), std::back_inserter(words), Word);
  return Joined(words, " ");
}

// As Quoted, of a text that stands between brackets or colons of zsh.
std::string ZshText(std::string_view text) {
  std::string plain;
  for (const char c : Brief(text)) {
    plain += c == '[' || c == ']' || c == ':' ? std::string("\\") + c : std::string(1, c);
  }
  return plain;
}

std::string FunctionOf(const Command& command) {
  std::string name = "_" + command.name;
  std::replace(name.begin(), name.end(), '-', '_');
  return name;
}

// All options of the command and of its verbs; one that several have is there once, as the first has it.
std::vector<Option> AllOptions(const Command& command) {
  std::vector<Option> all;
  std::set<std::string> seen;
  const auto add = [&](const Command& from) {
    for (const Option& option : from.options) {
      if (!option.names.empty() && seen.insert(option.names.back()).second) {
        all.push_back(option);
      }
    }
  };
  add(command);
  for (const Command& verb : command.verbs) {
    add(verb);
  }
  return all;
}

std::vector<std::string> NamesOf(const Command& command, std::string_view end) {
  std::vector<std::string> names;
  for (const Option& option : command.options) {
    for (const std::string& name : option.names) {
      names.push_back(name + std::string(end));
    }
  }
  return names;
}

std::vector<std::string> VerbsOf(const Command& command) {
  std::vector<std::string> names;
  for (const Command& verb : command.verbs) {
    names.push_back(verb.name);
  }
  return names;
}

// Bash reads them twice: as this list, and as a part of the line that is typed.
std::string BashWords(std::vector<std::string> choices) {
  std::transform(choices.begin(), choices.end(), choices.begin(), Word);
  return Words(choices);
}

std::string BashValues(const Option& option) {
  switch (option.values) {
    case Values::kChoices:
      return "COMPREPLY=($(compgen -W " + Quoted(BashWords(option.choices)) + " -- \"$word\"))";
    case Values::kFiles:
      return "compopt -o filenames 2>/dev/null; COMPREPLY=($(compgen -f -- \"$word\"))";
    case Values::kFolders:
      return "compopt -o filenames 2>/dev/null; COMPREPLY=($(compgen -d -- \"$word\"))";
    case Values::kAnything:
      break;
  }
  return "COMPREPLY=()";
}

// The branch for the value behind each option that takes one.
std::string BashBranches(const Command& command) {
  std::string out;
  for (const Option& option : AllOptions(command)) {
    if (!option.value.empty()) {
      out += "    " + Joined(option.names, "|") + ")\n      " + BashValues(option) + "\n      return ;;\n";
    }
  }
  return out;
}

std::string ZshAction(const Option& option) {
  switch (option.values) {
    case Values::kChoices:
      return "(" + Words(option.choices) + ")";
    case Values::kFiles:
      return "_files";
    case Values::kFolders:
      return "_files -/";
    case Values::kAnything:
      break;
  }
  return " ";
}

std::string ZshArguments(const Command& command, bool hasEqualsSigns) {
  std::string out;
  for (const Option& option : command.options) {
    const std::string value = ":" + ZshText(option.value) + ":" + ZshAction(option);
    if (option.names.empty()) {
      out += " \\\n    " + Quoted("*" + value);
    }
    for (const std::string& name : option.names) {
      // "=-": the value follows the sign in the same word.
      out += " \\\n    " + Quoted(name +
                                  (option.value.empty() ? ""
                                   : hasEqualsSigns     ? "=-"
                                                        : "") +
                                  "[" + ZshText(option.meaning) + "]" + (option.value.empty() ? "" : value));
    }
  }
  return out;
}

std::string FishValues(const Option& option) {
  switch (option.values) {
    case Values::kChoices:
      return " -x -a " + Quoted(Words(option.choices));
    case Values::kFiles:
      return " -r -F";
    case Values::kFolders:
      return " -x -a '(__fish_complete_directories)'";
    case Values::kAnything:
      break;
  }
  return " -x";
}

std::string FishOptions(const Command& command, const std::string& program, const std::string& condition) {
  std::string out;
  for (const Option& option : command.options) {
    if (option.names.empty()) {
      continue;
    }
    out += "complete -c " + program + condition;
    for (const std::string& name : option.names) {
      out += name.compare(0, 2, "--") == 0 ? " -l " + name.substr(2) : " -s " + name.substr(1);
    }
    out += (option.value.empty() ? "" : FishValues(option)) + " -d " + Quoted(Brief(option.meaning)) + "\n";
  }
  return out;
}

// "-name=value" is one word for fish.
std::string FishWords(const Command& command, const std::string& condition) {
  std::string out;
  for (const Option& option : command.options) {
    const std::string& name = option.names.front();
    const std::string begin = "complete -c NAME" + condition + " -a ";
    const std::string description = " -d " + Quoted(Brief(option.meaning)) + "\n";
    for (const std::string& choice : option.choices.empty() ? std::vector<std::string>{""} : option.choices) {
      out += begin + Quoted(name + "=" + Word(choice)) + description;
    }
    if (option.values == Values::kFiles) {
      out += "complete -c NAME -n " + Quoted("string match -q -- '" + name + "=*' (commandline -ct)") + " -a " +
             Quoted(name + "=(__fish_complete_path (string replace -- '" + name + "=' '' (commandline -ct)))") + "\n";
    }
  }
  return out;
}

}  // namespace

std::string BashCompletionOf(const Command& command) {
  const std::string function = FunctionOf(command);
  std::string out =
      function + "() {\n  local word=${COMP_WORDS[COMP_CWORD]} before=${COMP_WORDS[COMP_CWORD-1]} verb= i\n";
  if (command.hasEqualsSigns) {
    // The sign is a word of its own for bash.
    out +=
        "  if [ \"$word\" = = ]; then\n    word=\n"
        "  elif [ \"$before\" = = ]; then\n    before=${COMP_WORDS[COMP_CWORD-2]}\n"
        "  else\n    before=\n  fi\n"
        "  for ((i = 1; i + 2 < ${#COMP_WORDS[@]}; ++i)); do\n"
        "    if [ \"${COMP_WORDS[i]}\" = -subtest ]; then verb=${COMP_WORDS[i+2]}; fi\n  done\n";
  } else {
    out += "  for ((i = 1; i < COMP_CWORD; ++i)); do\n    case ${COMP_WORDS[i]} in\n";
    if (!command.verbs.empty()) {
      out += "    " + Joined(VerbsOf(command), "|") + ") verb=${COMP_WORDS[i]} ;;\n";
    }
    out += "    esac\n  done\n";
  }
  out += "  case $before in\n" + BashBranches(command) + "  esac\n";
  const std::string end = command.hasEqualsSigns ? "=" : "";
  const std::string own = Joined(NamesOf(command, end), " ");
  out += command.hasEqualsSigns ? "  compopt -o nospace 2>/dev/null\n" : "  compopt -o filenames 2>/dev/null\n";
  const std::string files = command.hasEqualsSigns ? "" : " -f";
  out += "  case $verb in\n";
  for (const Command& verb : command.verbs) {
    out += "    " + verb.name + ") COMPREPLY=($(compgen" + files + " -W " +
           Quoted(own + " " + Joined(NamesOf(verb, end), " ")) + " -- \"$word\")) ;;\n";
  }
  const std::string verbs = command.hasEqualsSigns ? "" : " " + Joined(VerbsOf(command), " ");
  const bool takesFiles = command.verbs.empty() && !command.hasEqualsSigns;
  out += "    *) COMPREPLY=($(compgen" + std::string(takesFiles ? " -f" : "") + " -W " + Quoted(own + verbs) +
         " -- \"$word\")) ;;\n  esac\n}\ncomplete -F " + function + " " + command.name + "\n";
  return out;
}

std::string ZshCompletionOf(const Command& command) {
  std::string out = "#compdef " + command.name + "\n\n" + FunctionOf(command) + "() {\n";
  if (command.verbs.empty()) {
    return out + "  _arguments" + ZshArguments(command, false) + "\n}\n\n" + FunctionOf(command) + " \"$@\"\n";
  }
  out += "  local verb word\n  for word in ${words[2,CURRENT-1]}; do\n    case $word in\n";
  for (const Command& verb : command.verbs) {
    out += "    " + (command.hasEqualsSigns ? "-subtest=" + verb.name : verb.name) + ") verb=" + verb.name + " ;;\n";
  }
  out += "    esac\n  done\n  case $verb in\n";
  for (const Command& verb : command.verbs) {
    out += "  " + verb.name + ")\n    _arguments" + ZshArguments(command, command.hasEqualsSigns) +
           ZshArguments(verb, command.hasEqualsSigns) +
           (command.hasEqualsSigns ? "" : " \\\n    " + Quoted("*:file:_files")) + " ;;\n";
  }
  out += "  *)\n    _arguments" + ZshArguments(command, command.hasEqualsSigns) +
         (command.hasEqualsSigns ? "" : " \\\n    " + Quoted("*:verb:(" + Joined(VerbsOf(command), " ") + ")")) +
         " ;;\n  esac\n}\n\n" + FunctionOf(command) + " \"$@\"\n";
  return out;
}

std::string FishCompletionOf(const Command& command) {
  std::string out;
  if (command.hasEqualsSigns) {
    out = "complete -c NAME -f\n" + FishWords(command, "");
    for (const Command& verb : command.verbs) {
      out += FishWords(verb, " -n " + Quoted("string match -q -- '*-subtest=" + verb.name + "*' (commandline)"));
    }
    for (std::size_t at = 0; (at = out.find("-c NAME", at)) != std::string::npos;) {
      out.replace(at, 7, "-c " + command.name);
    }
    return out;
  }
  if (!command.verbs.empty()) {
    out = "complete -c " + command.name + " -n __fish_use_subcommand -f\n";
  }
  out += FishOptions(command, command.name, "");
  for (const Command& verb : command.verbs) {
    out += "complete -c " + command.name + " -n __fish_use_subcommand -a " + verb.name + " -d " +
           Quoted(verb.summary.substr(0, verb.summary.find(';'))) + "\n" +
           FishOptions(verb, command.name, " -n '__fish_seen_subcommand_from " + verb.name + "'");
  }
  return out;
}

}  // namespace panelglow::pages
