// Completions of a command line for three shells.
#pragma once

#include <string>

#include "pages/Command.h"

namespace panelglow::pages {

std::string BashCompletionOf(const Command& command);
std::string ZshCompletionOf(const Command& command);
std::string FishCompletionOf(const Command& command);

}  // namespace panelglow::pages
