// A query of the management service, in the part of its language that the backends understand.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/Management.h"

namespace panelglow::platform::management {

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

/// Whether a row fulfils the condition: texts without regard to case, numbers by their value.
bool Fulfils(const ManagementRow& row, const WqlCondition& condition);

}  // namespace panelglow::platform::management
