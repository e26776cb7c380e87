#include "controller/RunReport.h"

#include <istream>
#include <sstream>

namespace panelglow::controller {

namespace {

std::string Rest(std::istringstream& line) {
  std::string rest;
  std::getline(line >> std::ws, rest);
  return rest;
}

void ReadEdge(std::istringstream& line, RunReport& report) {
  RunReport::Edge edge;
  int lit = 0;
  if (line >> edge.time_us >> edge.led >> lit && edge.led < report.leds.size()) {
    edge.lit = lit != 0;
    report.edges.push_back(edge);
  }
}

}  // namespace

RunReport ReadRunReport(std::istream& text) {
  RunReport report;
  for (std::string row; std::getline(text, row);) {
    std::istringstream line(row);
    std::string word;
    line >> word;
    if (word == "led") {
      std::size_t index = 0;
      std::string symbol;
      RunReport::Led led;
      if (line >> index >> led.name >> symbol >> led.color >> led.driver >> led.fault) {
        report.leds.push_back(led);
      }
    } else if (word == "edge") {
      ReadEdge(line, report);
    } else if (word == "press") {
      RunReport::Press press;
      line >> press.time_us;
      press.what = Rest(line);
      report.presses.push_back(press);
    } else if (word == "end") {
      line >> report.end_us;
      report.complete = true;
    } else if (word == "before" || word == "after" || word == "owned") {
      report.leftBehind.push_back(word + " " + Rest(line));
    }
  }
  return report;
}

}  // namespace panelglow::controller
