// Checks of what the test dialog is made of: buttons, their definitions, captions and icons.
#pragma once

#include <string>
#include <vector>

#include "boardtool/BoardChecks.h"
#include "boardtool/Finding.h"
#include "boardtool/IniOutline.h"
#include "platform/Host.h"

namespace panelglow::boardtool {

/// Looks at ui.xml, buttondefinition.xml and the message files in a folder, and at the icons that they name. The
/// message files that were read are appended to `messages`, for what their comments silence. `boards` is null when
/// the board files could not be looked into.
void CheckDialog(const std::string& folder, platform::Host& machine, const BoardKnowledge* boards,
                 std::vector<IniOutline>& messages, Findings& findings);

}  // namespace panelglow::boardtool
