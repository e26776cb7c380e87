#include "controller/PanelView.h"

#include <algorithm>
#include <cstdio>

namespace panelglow::controller {

namespace {

std::string Seconds(std::uint64_t time_us) {
  char text[32];
  std::snprintf(text, sizeof text, "%.1f s", static_cast<double>(time_us) / 1e6);
  return text;
}

std::string Padded(std::string text, std::size_t width) {
  text.resize(std::max(text.size(), width), ' ');
  return text;
}

std::size_t ColumnOf(std::uint64_t time_us, const RunReport& report, std::size_t columns) {
  return std::min(columns - 1,
                  static_cast<std::size_t>(time_us * columns / std::max<std::uint64_t>(report.end_us, 1)));
}

// A LED's whole run, one character per column of time.
std::string Strip(const RunReport& report, std::size_t led, std::size_t columns) {
  std::string strip(columns, '.');
  bool lit = false;
  std::size_t column = 0;
  for (const RunReport::Edge& edge : report.edges) {
    if (edge.led != led) {
      continue;
    }
    const std::size_t at = ColumnOf(edge.time_us, report, columns);
    for (; column < at; ++column) {
      strip[column] = strip[column] == '~' ? '~' : (lit ? '#' : '.');
    }
    if (edge.time_us > 0) {
      strip[at] = '~';
    }
    lit = edge.lit;
  }
  for (; column < columns; ++column) {
    strip[column] = strip[column] == '~' ? '~' : (lit ? '#' : '.');
  }
  return strip;
}

std::size_t TimesLit(const RunReport& report, std::size_t led) {
  return static_cast<std::size_t>(std::count_if(report.edges.begin(), report.edges.end(), [&](const auto& edge) {
    return edge.led == led && edge.lit && edge.time_us > 0;
  }));
}

}  // namespace

std::string ShowPanel(const RunReport& report, std::size_t columns) {
  std::string text =
      "Front panel over " + Seconds(report.end_us) + " of the machine's time (# lit, . dark, ~ changing):\n";
  std::size_t widest = std::string("operator").size();
  for (const RunReport::Led& led : report.leds) {
    widest = std::max(widest, led.name.size());
  }
  for (std::size_t i = 0; i < report.leds.size(); ++i) {
    const RunReport::Led& led = report.leds[i];
    text += "  " + Padded(led.name, widest) + " " + Strip(report, i, columns) + " " + led.color + ", " + led.driver +
            ", lit " + std::to_string(TimesLit(report, i)) + " times";
    text += led.fault == "-" ? "\n" : ", FAULT: " + led.fault + "\n";
  }
  if (!report.presses.empty()) {
    std::string strip(columns, ' ');
    for (const RunReport::Press& press : report.presses) {
      strip[ColumnOf(press.time_us, report, columns)] = '^';
    }
    text +=
        "  " + Padded("operator", widest) + " " + strip + " " + std::to_string(report.presses.size()) + " presses\n";
    for (const RunReport::Press& press : report.presses) {
      text += "    " + Padded(Seconds(press.time_us), 8) + " " + press.what + "\n";
    }
  }
  if (report.complete && report.leftBehind.empty()) {
    text += "All registers are as they were before the run, and no lock is held.\n";
  }
  for (const std::string& difference : report.leftBehind) {
    text += "Left changed: " + difference + "\n";
  }
  return text;
}

}  // namespace panelglow::controller
