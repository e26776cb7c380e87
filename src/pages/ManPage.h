// Manual pages in the man(7) macros.
#pragma once

#include <string>
#include <string_view>

#include "pages/Command.h"

namespace panelglow::pages {

/// What a page says beyond the options.
struct PageTexts {
  std::string version = {};      // of the package
  std::string description = {};  // paragraphs, by empty lines
  std::string exitStatus = {};   // lines "code: meaning"
  std::string examples = {};     // lines
  std::string seeAlso = {};      // "name(section), ..."
};

/// The page of a command, in section 1.
std::string ManPageOf(const Command& command, const PageTexts& texts);

/// A page in section 5 of a Markdown text: headings, paragraphs, lists, fenced blocks, and tables, whose first column
/// counts as what a row is about; a row without it goes on with the one before.
std::string ManPageOfMarkdown(std::string_view name, std::string_view summary, std::string_view markdown,
                              const PageTexts& texts);

}  // namespace panelglow::pages
