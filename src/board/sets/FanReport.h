// What a fan test has found, as text and as XML.
#pragma once

#include <string>
#include <vector>

#include "board/sets/ChipFinder.h"
#include "board/sets/Fan.h"

namespace panelglow {

class XmlObject;

/// The two forms of the text: they differ in the heading and in the words of the full-speed verdict.
enum class FanLogForm { kPlain, kExtended };

/// `group`: which fans were tested, for the reader.
void WriteFanLog(const LineSink& write, const std::vector<Fan>& fans, const std::string& group, FanLogForm form);

/// Appends an element "fantestresults" to `parent`.
void WriteFanResults(XmlObject& parent, const std::vector<Fan>& fans);

}  // namespace panelglow
