// What a temperature test has found, as text and as XML.
#pragma once

#include <string>

#include "board/sets/ChipFinder.h"
#include "board/sets/ZoneSet.h"

namespace panelglow {

class XmlObject;

/// One word for the state of a zone, as "NoErr" or "OverTempErr".
std::string ZoneStatus(const TempZone& zone, const ProbeSettings& probe);

void WriteZoneLog(const LineSink& write, ZoneSet& zones);

/// Appends an element "tempcautiontestresults" to `parent`.
void WriteZoneResults(XmlObject& parent, ZoneSet& zones);

}  // namespace panelglow
