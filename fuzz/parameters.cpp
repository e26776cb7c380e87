// The command line: each line a parameter, its value against every kind of rule.
#include <array>
#include <cstdint>
#include <memory>

#include "FuzzTarget.h"
#include "harness/CDMArgument.h"
#include "harness/CmdLineParser.h"
#include "harness/base/CDMUtil.h"

namespace panelglow::fuzz {
namespace {

constexpr std::size_t kMostJudged = 3;  // values of an input; five rules take their time

std::unique_ptr<CDMConstraint> RuleOf(CDMArgumentType type) {
  switch (type) {
    case CDMArgumentType::Integer:
      return std::make_unique<CDMConstraint>(-10, 10);
    case CDMArgumentType::Double:
      return std::make_unique<CDMConstraint>(0.5, CDMConstraintType::GreaterThan);
    case CDMArgumentType::LargeInteger:
      return std::make_unique<CDMConstraint>(std::int64_t{5'000'000'000}, CDMConstraintType::LessThan);
    default:
      return std::make_unique<CDMConstraint>(std::string("a,b,true"));
  }
}

void ValidateValue(const std::string& value) {
  for (const CDMArgumentType type : {CDMArgumentType::String, CDMArgumentType::Integer, CDMArgumentType::Boolean,
                                     CDMArgumentType::Double, CDMArgumentType::LargeInteger}) {
    const CDMArgument argument("-a", type, value, value, false, RuleOf(type), false, false);
    const bool passes = argument.Validate(value);
    Check(
        !passes || type != CDMArgumentType::Integer || (CDMUtil::ToInt(value) <= 10 && CDMUtil::ToInt(value) >= -10),
        "an accepted number is in its range");
    Check(argument.GetCatalogEntry(2).starts_with("  <ARGUMENT Name=\"-a\" Type=\""),
          "an entry begins with its name");
    Check(argument.GetHelp().ends_with("\n\t * Required: false"), "a help block ends with the need");
    Check(argument.GetDictionaryEntry("t").starts_with("\nt/-a/Name = TBC\n"),
          "a dictionary entry begins with its key");
  }
}

void Run(std::string_view bytes) {
  std::vector<std::string> words{"program"};
  while (!bytes.empty()) {
    words.push_back(Take(bytes, '\n'));
  }
  std::vector<const char*> argv;
  for (const std::string& word : words) {
    argv.push_back(word.c_str());
  }
  const CmdLineParser parser(static_cast<int>(argv.size()), argv.data());
  std::size_t judged = 0;
  for (const auto& [key, value] : parser.GetParameters()) {
    Check(CDMUtil::ToLower(key) == key, "keys are lower case");
    Check(parser.GetParameter(CDMUtil::ToUpper(key), "other") == value, "a parameter is found in any case");
    if (judged < kMostJudged) {
      ++judged;
      ValidateValue(value);
    }
  }
}

const Registered kTarget("parameters", Run);

}  // namespace
}  // namespace panelglow::fuzz
