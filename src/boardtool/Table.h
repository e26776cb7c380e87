// Columns of text for people.
#pragma once

#include <string>
#include <vector>

namespace panelglow::boardtool {

/// A line for each row, the columns as wide as their widest text; the first row is the heading. Nothing without rows
/// behind it.
std::string TableText(const std::vector<std::vector<std::string>>& rows);

}  // namespace panelglow::boardtool
