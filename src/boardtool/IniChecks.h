// Checks of an INI file's text alone, without knowing what it is for.
#pragma once

#include "boardtool/Finding.h"
#include "boardtool/IniOutline.h"

namespace panelglow::boardtool {

/// Files of more bytes are not looked into.
inline constexpr std::size_t kLargestText_bytes = std::size_t{4} << 20U;

/// Whether the bytes can be looked into at all; says why not. `mayBeWide`: UTF-16 with its mark is text, too.
bool IsCheckableText(const std::string& path, const std::string& bytes, bool mayBeWide, Findings& findings);

/// Marks, lines that count for nothing, what stands twice, what is cut. `keepsComments`: a ";" belongs to the values
/// of this file and begins no comment there.
void CheckIniText(const IniOutline& file, bool keepsComments, Findings& findings);

}  // namespace panelglow::boardtool
