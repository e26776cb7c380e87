// The command of the diagnostic, as its own catalogue tells it.
#pragma once

#include <string>
#include <string_view>

#include "pages/Command.h"

namespace panelglow::pages {

/// Each subtest is a verb. `catalog` is what the program prints for "-catalog=true", `usage` what it prints for
/// "-help=true". Throws std::runtime_error when nothing of that kind is in them.
Command CommandOfCatalog(std::string_view name, const std::string& catalog, const std::string& usage);

}  // namespace panelglow::pages
