// Checks of one machine's settings against each other: what each of them says is sound, and together they are not.
#pragma once

#include "boardtool/Finding.h"
#include "boardtool/LayeredFiles.h"
#include "boardtool/Rehearsal.h"

namespace panelglow::boardtool {

void CheckMachine(const BoardPlan& plan, const LayeredFiles& files, const BoardFiles& names, Findings& findings);

}  // namespace panelglow::boardtool
