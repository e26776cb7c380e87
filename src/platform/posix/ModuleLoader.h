// Loads the parts of the program that only some runs need.
#pragma once

#include <string>

namespace panelglow::platform::posix {

/// The address of `symbol` in the module "lib<module>.so", which is looked for in "../lib" and
/// "../lib/panelglow-diags" beside the executable's folder and in that folder itself. Null, with the reason in
/// `error`, when there is none. A module stays loaded.
void* LoadSymbol(const std::string& module, const char* symbol, std::string& error);

}  // namespace panelglow::platform::posix
