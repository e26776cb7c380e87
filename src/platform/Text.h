// The two text types of the program and the one place where they are converted into each other.
#pragma once

#include <string>
#include <string_view>

namespace panelglow {

/// Text shown to people: 16-bit code units (UTF-16).
using wstring = std::u16string;

namespace platform {

/// Decodes UTF-8 into UTF-16. A byte that is part of no valid sequence becomes U+FFFD.
wstring WideFromUtf8(std::string_view text);

/// Encodes UTF-16 as UTF-8. A lone surrogate becomes U+FFFD.
std::string Utf8FromWide(std::u16string_view text);

/// Widens Windows code page 1252, the system code page of narrow text files. Never fails.
wstring WideFromCodePage(std::string_view bytes);

/// Narrows to Windows code page 1252; a character that the page lacks becomes '?'.
std::string CodePageFromWide(std::u16string_view text);

}  // namespace platform
}  // namespace panelglow
