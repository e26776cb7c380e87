// A query of the management service, in the part of its language that this machine understands.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace panelglow::platform::sim {

struct WqlCondition {
  std::string property;
  std::string value;  // without quotes and escapes
};

/// "SELECT ... FROM class", perhaps with "WHERE property = value"; or
/// "ASSOCIATORS OF {class.property="value"} WHERE ResultClass = class".
struct WqlQuery {
  std::string className;
  std::optional<WqlCondition> condition;  // of an object of associators: which one
  std::string resultClass;                // of associators; empty otherwise
};

/// Nothing for any other text.
std::optional<WqlQuery> ParseWql(std::string_view text);

}  // namespace panelglow::platform::sim
