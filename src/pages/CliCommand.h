// The command of a program that has its options in a table of the command-line library.
#pragma once

#include <CLI/CLI.hpp>

#include "pages/Command.h"

namespace panelglow::pages {

/// With all verbs and their options.
Command CommandOf(const CLI::App& app);

}  // namespace panelglow::pages
