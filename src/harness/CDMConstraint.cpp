#include "harness/CDMConstraint.h"

#include <algorithm>
#include <array>
#include <sstream>
#include <vector>

#include "harness/CatalogAttribute.h"
#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {

constexpr std::array<std::string_view, 5> kTypeWords{"string", "integer", "boolean", "double", "largeinteger"};

// By CDMConstraintType: the catalogue's attribute, and the words of the help.
struct ComparisonTexts {
  const char* attribute;
  std::string_view help;
};
constexpr std::array<ComparisonTexts, 6> kComparisons{{
    {"Equal", "equal to "},
    {"DifferentThan", "different than "},
    {"GreaterThan", "greater than "},
    {"EqualToOrGreaterThan", "equal to or greater than "},
    {"EqualToOrLessThan", "equal to or less than "},
    {"LessThan", "less than "},
}};

constexpr std::string_view kHelpLine = "\n\t - Value must be ";

constexpr const char* kNoNumber = "invalidString";

double DoubleOf(const std::string& text) {
  std::istringstream stream(text);
  double value = 0;
  stream >> value;
  return value;
}

}  // namespace

std::string_view WordOf(CDMArgumentType type) {
  const auto index = static_cast<std::size_t>(type);
  return index < kTypeWords.size() ? kTypeWords[index] : std::string_view();
}

CDMConstraint::CDMConstraint(int low, int high)
    : intLow(low), intHigh(high), isRange(true), valueType(CDMArgumentType::Integer) {}
CDMConstraint::CDMConstraint(double low, double high)
    : doubleLow(low), doubleHigh(high), isRange(true), valueType(CDMArgumentType::Double) {}
CDMConstraint::CDMConstraint(std::int64_t low, std::int64_t high)
    : longLow(low), longHigh(high), isRange(true), valueType(CDMArgumentType::LargeInteger) {}
CDMConstraint::CDMConstraint(int value, CDMConstraintType type)
    : intValue(value), comparison(type), valueType(CDMArgumentType::Integer) {}
CDMConstraint::CDMConstraint(double value, CDMConstraintType type)
    : doubleValue(value), comparison(type), valueType(CDMArgumentType::Double) {}
CDMConstraint::CDMConstraint(std::int64_t value, CDMConstraintType type)
    : longValue(value), comparison(type), valueType(CDMArgumentType::LargeInteger) {}
CDMConstraint::CDMConstraint(const std::string& allowed) : list(allowed) {}

bool CDMConstraint::IsInList(const std::string& value) const {
  std::vector<std::string> allowed;
  CDMUtil::Split(list, allowed, ",");
  return std::any_of(allowed.begin(), allowed.end(),
                     [&](const std::string& entry) { return CDMUtil::EqualIgnoreCase(entry, value); });
}

template <class Number>
bool CDMConstraint::Compare(Number value, Number low, Number high, Number single) const {
  if (isRange) {
    return low <= value && value <= high;
  }
  switch (comparison) {
    case CDMConstraintType::Equal:
      return value == single;
    case CDMConstraintType::DifferentThan:
      return value != single;
    case CDMConstraintType::GreaterThan:
      return value > single;
    case CDMConstraintType::EqualToOrGreaterThan:
      return value >= single;
    case CDMConstraintType::EqualToOrLessThan:
      return value <= single;
    case CDMConstraintType::LessThan:
      return value < single;
  }
  return false;
}

bool CDMConstraint::Check(const std::string& value) const {
  if (!list.empty()) {
    return IsInList(value);
  }
  switch (valueType) {
    case CDMArgumentType::Integer:
      return CDMUtil::IsInteger(value) && Compare(CDMUtil::ToInt(value), intLow, intHigh, intValue);
    case CDMArgumentType::Double:
      return CDMUtil::IsDouble(value) && Compare(DoubleOf(value), doubleLow, doubleHigh, doubleValue);
    case CDMArgumentType::LargeInteger:
      return CDMUtil::IsInteger(value) && Compare(CDMUtil::ToInt64(value), longLow, longHigh, longValue);
    default:
      return false;
  }
}

// The one of the three that the rule's type has; `none` where there are no numbers.
std::string CDMConstraint::TextOf(int integer, double real, std::int64_t large, const char* none) const {
  switch (valueType) {
    case CDMArgumentType::Integer:
      return CDMUtil::ToString(integer);
    case CDMArgumentType::Double:
      return CDMUtil::ToString(real);
    case CDMArgumentType::LargeInteger:
      return CDMUtil::ToString(large);
    default:
      return none;
  }
}

std::string CDMConstraint::GetLowText() const { return TextOf(intLow, doubleLow, longLow, kNoNumber); }
std::string CDMConstraint::GetHighText() const { return TextOf(intHigh, doubleHigh, longHigh, kNoNumber); }
std::string CDMConstraint::GetValueText() const { return TextOf(intValue, doubleValue, longValue, ""); }

std::string CDMConstraint::GetHelp() const {
  if (!list.empty()) {
    std::string allowed = list;
    std::replace(allowed.begin(), allowed.end(), ',', '|');
    return std::string(kHelpLine) + "one of [" + allowed + "]";
  }
  if (isRange) {
    return std::string(kHelpLine) + "between [" + GetLowText() + ".." + GetHighText() + "]";
  }
  const auto index = static_cast<std::size_t>(comparison);
  return index < kComparisons.size() ? std::string(kHelpLine) + std::string(kComparisons[index].help) + GetValueText()
                                     : std::string();
}

std::string CDMConstraint::GetCatalogAttributes() const {
  if (!list.empty()) {
    return CatalogAttribute("List", CDMUtil::EscapeXml(list));
  }
  if (isRange) {
    return CatalogAttribute("Low", GetLowText()) + CatalogAttribute("High", GetHighText());
  }
  const auto index = static_cast<std::size_t>(comparison);
  return index < kComparisons.size() ? CatalogAttribute(kComparisons[index].attribute, GetValueText())
                                     : std::string();
}

std::string CDMConstraint::GetDictionaryEntry(const std::string& prefix, CDMArgumentType type) const {
  std::string text;
  if (type == CDMArgumentType::String) {
    std::vector<std::string> allowed;
    CDMUtil::Split(list, allowed, ",");
    for (const std::string& value : allowed) {
      text.append(prefix).append("/List/").append(value).append(" = TBC\n");
    }
  }
  return text;
}

}  // namespace panelglow
