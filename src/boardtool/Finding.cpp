#include "boardtool/Finding.h"

#include <algorithm>
#include <array>
#include <nlohmann/json.hpp>
#include <numeric>
#include <stdexcept>

#include "boardtool/IniOutline.h"

namespace panelglow::boardtool {

namespace {

using Json = nlohmann::ordered_json;

// By name.
constexpr std::array kRules{
    Rule{"base-cycle", Severity::kError, "A chain of base sections comes back to a section that it has been in."},
    Rule{"bit-out-of-range", Severity::kError,
         "A number does not fit into the register, port or mask that it is for."},
    Rule{"blink-rate", Severity::kWarning, "An LED blinks faster or slower than an eye takes for blinking."},
    Rule{"board-fails", Severity::kError, "The files name a board that cannot be built."},
    Rule{"byte-order-mark", Severity::kError, "A mark in front of the first line hides what stands in it."},
    Rule{"caption-missing", Severity::kWarning, "A button's caption has no text in a language."},
    Rule{"comment-in-value", Severity::kWarning, "A comment behind a value leaves its blank in the value."},
    Rule{"config-keys", Severity::kError, "A Super-I/O lacks a key by which its configuration is opened or left."},
    Rule{"controller-line", Severity::kError, "A line of the storage controllers is not what it should be."},
    Rule{"crossed-limits", Severity::kError, "A lowest value is above the highest."},
    Rule{"duplicate-button", Severity::kWarning, "A button, or its definition, stands twice."},
    Rule{"duplicate-key", Severity::kWarning, "A key stands twice in a section; the first counts."},
    Rule{"duplicate-section", Severity::kWarning, "A section stands twice; the first counts."},
    Rule{"file-missing", Severity::kError, "A file of the installation is missing or cannot be read."},
    Rule{"file-too-large", Severity::kError, "A file is larger than any file of an installation can be."},
    Rule{"icon-missing", Severity::kError, "A button's icon is missing or is no picture."},
    Rule{"inverted-mask", Severity::kError, "A mask is the opposite of what its list needs."},
    Rule{"led-not-lit", Severity::kError, "No board of the files lights a LED that a test asks for."},
    Rule{"led-without-chip", Severity::kError, "An LED has keys, and none that names its chip."},
    Rule{"malformed-sequence", Severity::kError, "An entry of a sequence is no command with its data."},
    Rule{"message-format", Severity::kError, "A text has a place for something that the program does not give."},
    Rule{"message-texts", Severity::kError, "A message file holds texts that no run finds, or shows as others."},
    Rule{"misspelt-section", Severity::kWarning,
         "A section is used by nothing, and mostly one of another name is meant."},
    Rule{"no-file-text", Severity::kError, "A file holds bytes that are no text."},
    Rule{"not-a-number", Severity::kError, "A number is none and counts as 0."},
    Rule{"not-saved", Severity::kWarning, "A blink changes a register that is not put back."},
    Rule{"on-without-off", Severity::kError, "An LED can be lit and not darkened."},
    Rule{"same-bit", Severity::kError, "Two LEDs hang on one bit."},
    Rule{"schema", Severity::kError, "An XML file does not fit its schema."},
    Rule{"stray-line", Severity::kWarning, "A line is neither a section, nor a key with its value, nor a comment."},
    Rule{"too-many-machines", Severity::kNote, "Only the first machines of a file were tried."},
    Rule{"unknown-base", Severity::kError, "A base names a section that there is not."},
    Rule{"unknown-button", Severity::kError, "A button has no definition, or one of no known function."},
    Rule{"unknown-chip", Severity::kError, "A name stands for no chip, or for one that the board has not."},
    Rule{"unknown-class", Severity::kError, "A name stands for no class of boards."},
    Rule{"unknown-controller", Severity::kError, "A drive LED names a controller that msctrl.ini does not have."},
    Rule{"unknown-key", Severity::kWarning, "Nothing reads a key of this name."},
    Rule{"unknown-section", Severity::kError, "A chip's data names a section that there is not."},
    Rule{"unreadable", Severity::kWarning, "A value cannot be used as it stands."},
    Rule{"unused-key", Severity::kNote, "The board of a section does not read this key."},
    Rule{"unused-section", Severity::kNote, "No board of the files uses a section of chip.ini."},
    Rule{"value-too-long", Severity::kError, "A value is cut at 254 characters."},
    Rule{"wrong-separator", Severity::kError, "A list goes on behind the mark of a comment."},
    Rule{"xml", Severity::kError, "A file is not well-formed XML."},
    Rule{"yes-or-no", Severity::kWarning, "A value should be yes or no."},
};

constexpr const char* kVersion = "2.1.0";

}  // namespace

std::span<const Rule> Rules() { return kRules; }

const Rule& RuleOf(std::string_view name) {
  const auto found = std::find_if(kRules.begin(), kRules.end(), [&](const Rule& rule) { return rule.name == name; });
  if (found == kRules.end()) {
    throw std::out_of_range("there is no rule " + std::string(name));
  }
  return *found;
}

void Findings::Add(std::string_view rule, std::string path, std::size_t line, std::size_t column, std::string text) {
  OfRule& known = byFile_[{std::move(path), RuleOf(rule).name}];
  std::tuple<std::size_t, std::size_t, std::string> finding{line, column, std::move(text)};
  if (known.seen.contains(finding)) {
    return;
  }
  if (known.seen.size() < kMostOfARule) {
    known.seen.insert(std::move(finding));
  } else {
    ++known.more;
  }
}

std::vector<Finding> Findings::Sorted() const {
  std::vector<Finding> sorted;
  for (const auto& [place, known] : byFile_) {
    const auto& [path, rule] = place;
    for (const auto& [line, column, text] : known.seen) {
      sorted.push_back({&RuleOf(rule), path, line, column, text});
    }
    if (known.more > 0) {
      sorted.back().text += " (and " + std::to_string(known.more) + " more like this in the file)";
    }
  }
  // What a misspelt header does not reach shows in many other lines.
  const auto follows = [](const Finding& finding) { return finding.rule->name != "misspelt-section"; };
  std::stable_sort(sorted.begin(), sorted.end(), [&](const Finding& a, const Finding& b) {
    return std::tuple(follows(a), std::tie(a.path, a.line, a.column)) <
           std::tuple(follows(b), std::tie(b.path, b.line, b.column));
  });
  return sorted;
}

std::string_view WordOf(Severity severity) {
  return severity == Severity::kError ? "error" : severity == Severity::kWarning ? "warning" : "note";
}

std::string FindingsText(const std::vector<Finding>& findings) {
  std::string text;
  for (const Finding& finding : findings) {
    text += finding.path + ":" + std::to_string(finding.line) + ":" + std::to_string(finding.column) + ": " +
            std::string(WordOf(finding.rule->severity)) + ": " + finding.text + " [" +
            std::string(finding.rule->name) + "]\n";
  }
  return text;
}

std::string FindingsJson(const std::vector<Finding>& findings) {
  Json json = Json::array();
  for (const Finding& finding : findings) {
    json.push_back({{"file", finding.path},
                    {"line", finding.line},
                    {"column", finding.column},
                    {"severity", std::string(WordOf(finding.rule->severity))},
                    {"rule", std::string(finding.rule->name)},
                    {"text", finding.text}});
  }
  return json.dump(2, ' ', false, Json::error_handler_t::replace) + "\n";
}

std::string FindingsSarif(const std::vector<Finding>& findings) {
  Json rules = Json::array();
  for (const Rule& rule : kRules) {
    rules.push_back({{"id", std::string(rule.name)},
                     {"shortDescription", {{"text", std::string(rule.summary)}}},
                     {"defaultConfiguration", {{"level", std::string(WordOf(rule.severity))}}}});
  }
  Json results = Json::array();
  for (const Finding& finding : findings) {
    results.push_back(
        {{"ruleId", std::string(finding.rule->name)},
         {"level", std::string(WordOf(finding.rule->severity))},
         {"message", {{"text", finding.text}}},
         {"locations",
          Json::array({{{"physicalLocation",
                         {{"artifactLocation", {{"uri", finding.path}}},
                          {"region", {{"startLine", finding.line}, {"startColumn", finding.column}}}}}}})}});
  }
  const Json json{{"$schema", "https://json.schemastore.org/sarif-2.1.0.json"},
                  {"version", kVersion},
                  {"runs", Json::array({{{"tool", {{"driver", {{"name", "panelglow-board"}, {"rules", rules}}}}},
                                         {"results", results}}})}};
  return json.dump(2, ' ', false, Json::error_handler_t::replace) + "\n";
}

std::string Nearest(std::string_view name, std::span<const std::string> known) {
  constexpr std::size_t kLongest = 120;  // longer names are no misspelling
  if (name.size() > kLongest) {
    return {};
  }
  std::size_t best = std::max<std::size_t>(2, name.size() / 4) + 1;
  std::string nearest;
  std::vector<std::size_t> row(name.size() + 1);
  for (const std::string& other : known) {
    if (LoweredName(other) == LoweredName(name)) {
      continue;
    }
    const std::size_t difference =
        other.size() > name.size() ? other.size() - name.size() : name.size() - other.size();
    if (difference >= best) {
      continue;
    }
    std::iota(row.begin(), row.end(), std::size_t{0});
    for (std::size_t i = 1; i <= other.size(); ++i) {
      std::size_t diagonal = std::exchange(row[0], i);
      for (std::size_t j = 1; j <= name.size(); ++j) {
        const std::size_t replaced = diagonal + (other[i - 1] == name[j - 1] ? 0 : 1);
        diagonal = std::exchange(row[j], std::min({row[j] + 1, row[j - 1] + 1, replaced}));
      }
    }
    if (row.back() < best) {
      best = row.back();
      nearest = other;
    }
  }
  return nearest;
}

}  // namespace panelglow::boardtool
