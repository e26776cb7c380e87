// What a temperature test has found, as text and as XML.
#pragma once

#include <string>

#include "board/sets/ChipFinder.h"
#include "board/sets/ZoneSet.h"

namespace panelglow {

class XmlObject;

/// One word for the state of a zone, as "NoErr" or "OverTempErr".
std::string ZoneStatus(const TempZone& zone, const ProbeSettings& probe);

/// Nothing is read for it: the limits are those of the last checks.
void WriteZoneLog(const LineSink& write, const ZoneSet& zones);

/// Appends an element "tempcautiontestresults" to `parent`; of the limits as the log.
void WriteZoneResults(XmlObject& parent, const ZoneSet& zones);

}  // namespace panelglow
