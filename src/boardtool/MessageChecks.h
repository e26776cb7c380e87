// Checks of a message file's texts.
#pragma once

#include <string_view>

#include "boardtool/Finding.h"
#include "boardtool/IniOutline.h"

namespace panelglow::boardtool {

/// Whether a section has the name of a language as a run is given it, "de_DE".
bool IsLanguage(std::string_view section);

/// `isWhole`: the file has all texts; one that only replaces some needs no language of its own.
void CheckMessages(const IniOutline& file, bool isWhole, Findings& findings);

}  // namespace panelglow::boardtool
