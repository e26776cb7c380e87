// The rule on an argument's value: a range, a comparison with one value, or a list of allowed values.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace panelglow {

enum class CDMArgumentType : int { String = 0, Integer = 1, Boolean = 2, Double = 3, LargeInteger = 4 };

/// The word of a type in the help and the catalogue.
std::string_view WordOf(CDMArgumentType type);

enum class CDMConstraintType : int {
  Equal = 0,
  DifferentThan = 1,
  GreaterThan = 2,
  EqualToOrGreaterThan = 3,
  EqualToOrLessThan = 4,
  LessThan = 5,
};

class CDMConstraint {
 public:
  // Ranges include both ends.
  CDMConstraint(int low, int high);
  CDMConstraint(double low, double high);
  CDMConstraint(std::int64_t low, std::int64_t high);

  CDMConstraint(int value, CDMConstraintType type);
  CDMConstraint(double value, CDMConstraintType type);
  CDMConstraint(std::int64_t value, CDMConstraintType type);

  /// Allowed values separated by commas, compared without regard to case.
  explicit CDMConstraint(const std::string& allowed);
  virtual ~CDMConstraint() = default;

  /// True when the value passes.
  [[nodiscard]] bool Check(const std::string& value) const;

  /// One line for the argument help.
  [[nodiscard]] std::string GetHelp() const;

  /// The rule as catalogue attributes, each with a blank in front.
  [[nodiscard]] std::string GetCatalogAttributes() const;

  /// One line for each allowed value under the key `prefix`, for an argument of type string; otherwise empty.
  [[nodiscard]] std::string GetDictionaryEntry(const std::string& prefix, CDMArgumentType type) const;

  /// The bounds of a range as text; "invalidString" when there are no numbers.
  [[nodiscard]] std::string GetLowText() const;
  [[nodiscard]] std::string GetHighText() const;

 private:
  template <class Number>
  [[nodiscard]] bool Compare(Number value, Number low, Number high, Number single) const;
  [[nodiscard]] bool IsInList(const std::string& value) const;
  [[nodiscard]] std::string TextOf(int integer, double real, std::int64_t large, const char* none) const;
  [[nodiscard]] std::string GetValueText() const;

  int intLow = 0;
  int intHigh = 0;
  int intValue = 0;
  double doubleLow = 0;
  double doubleHigh = 0;
  double doubleValue = 0;
  std::int64_t longLow = 0;
  std::int64_t longHigh = 0;
  std::int64_t longValue = 0;
  std::string list;
  bool isRange = false;
  CDMConstraintType comparison = CDMConstraintType::Equal;
  CDMArgumentType valueType = CDMArgumentType::String;  // String: not set
};

}  // namespace panelglow
