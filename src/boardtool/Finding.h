// What a check has found, and the rules by which it looks.
#pragma once

#include <cstddef>
#include <map>
#include <set>
#include <span>
#include <string>
#include <string_view>
#include <tuple>
#include <utility>
#include <vector>

namespace panelglow::boardtool {

enum class Severity { kNote, kWarning, kError };

struct Rule {
  std::string_view name;  // as in "[unknown-key]" and in a comment that silences it
  Severity severity = Severity::kWarning;
  std::string_view summary;  // what is wrong with what breaks it, in one sentence
};

/// All rules by name. Their page is docs/check-rules.md.
std::span<const Rule> Rules();

/// Throws std::out_of_range for a name that no rule has.
const Rule& RuleOf(std::string_view name);

struct Finding {
  const Rule* rule = nullptr;
  std::string path;
  std::size_t line = 1;  // line and column count from 1
  std::size_t column = 1;
  std::string text;
};

/// Collects findings, each once, and of one rule in one file no more than people read.
class Findings {
 public:
  static constexpr std::size_t kMostOfARule = 50;

  void Add(std::string_view rule, std::string path, std::size_t line, std::size_t column, std::string text);

  /// In the order of files, lines and columns; misspelt sections first. Where a rule found more in a file than are
  /// kept, the last says so.
  [[nodiscard]] std::vector<Finding> Sorted() const;

 private:
  struct OfRule {
    std::set<std::tuple<std::size_t, std::size_t, std::string>> seen;  // line, column, text
    std::size_t more = 0;
  };
  std::map<std::pair<std::string, std::string_view>, OfRule> byFile_;  // path and rule
};

/// "error", "warning", "note".
std::string_view WordOf(Severity severity);

/// A line for each finding, "file:line:column: severity: text [rule]".
std::string FindingsText(const std::vector<Finding>& findings);
std::string FindingsJson(const std::vector<Finding>& findings);
/// The Static Analysis Results Interchange Format, version 2.1.0.
std::string FindingsSarif(const std::vector<Finding>& findings);

/// The one of `known` that is closest to `name` by edits, when it is close enough to be meant and not
/// `name` itself; empty otherwise.
std::string Nearest(std::string_view name, std::span<const std::string> known);

}  // namespace panelglow::boardtool
