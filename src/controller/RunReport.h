// What the simulation says of a run once it is over: the panel's time line, what the operator did, and what the run
// left changed.
#pragma once

#include <cstddef>
#include <cstdint>
#include <iosfwd>
#include <string>
#include <vector>

namespace panelglow::controller {

struct RunReport {
  struct Led {
    std::string name;
    std::string color;
    std::string driver;  // "<device>.<pin>"
    std::string fault;   // "-" for none
  };
  struct Edge {
    std::uint64_t time_us = 0;
    std::size_t led = 0;
    bool lit = false;
  };
  struct Press {
    std::uint64_t time_us = 0;
    std::string what;
  };

  std::vector<Led> leds;
  std::vector<Edge> edges;
  std::vector<Press> presses;
  std::uint64_t end_us = 0;
  bool complete = false;                // the run came to its end
  std::vector<std::string> leftBehind;  // registers that differ from before, locks still held
};

/// Reads the report's text. Lines that are not understood are left out.
RunReport ReadRunReport(std::istream& text);

}  // namespace panelglow::controller
