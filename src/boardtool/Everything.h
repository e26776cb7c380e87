// All that can be asked of a board, so that every key that its classes know is looked up.
#pragma once

#include "board/MotherBoard.h"

namespace panelglow::boardtool {

/// Loads and asks everything that the files may hold keys for, but nothing that takes seconds. What an operation says
/// by an exception is left alone.
void AskEverything(MotherBoard& board);

}  // namespace panelglow::boardtool
