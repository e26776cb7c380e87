#include "board/sets/FanReport.h"

namespace panelglow {

void WriteFanLog(const LineSink& /*write*/, const std::vector<Fan>& /*fans*/, const std::string& /*group*/,
                 FanLogForm /*form*/) {}
void WriteFanResults(XmlObject& /*parent*/, const std::vector<Fan>& /*fans*/) {}

}  // namespace panelglow
