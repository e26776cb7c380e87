// A text with two marked words on coloured ground, broken into lines for a pane.
#pragma once

#include <optional>
#include <vector>

#include "platform/Desktop.h"

namespace panelglow {

/// A part of a text; without a background it lies on the pane's own.
struct TextPiece {
  wstring text;
  std::optional<platform::Color> background;
};

/// A piece, or what of it is on one line, with its top left corner in the pane's client pixels.
struct PlacedText {
  int x = 0;
  int y = 0;
  TextPiece piece;
};

/// The text in five pieces: before, between and behind the marks, and the marks, one on green and one on red. A mark
/// is looked for in upper case, and as given when that is absent. Empty when one of them is not there.
std::vector<TextPiece> CutAtMarks(const wstring& text, const wstring& greenMark, const wstring& redMark);

/// Breaks the pieces into lines of a pane of this size. Lines that begin below it are left out.
std::vector<PlacedText> PlacePieces(platform::Desktop& desktop, const std::vector<TextPiece>& pieces,
                                    const platform::Font& font, int paneWidth, int paneHeight);

}  // namespace panelglow
