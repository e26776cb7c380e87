// What the reference controller takes on its command line.
#pragma once

#include <CLI/CLI.hpp>
#include <cstdint>
#include <string>
#include <vector>

namespace panelglow::controller {

struct Options {
  std::string machine;
  std::string person;
  std::uint64_t seed = 1;
  std::vector<std::string> faults;
  bool realTime = false;
  bool window = false;
  bool raw = false;
  std::string screenshots;
  std::string trace;
  std::vector<std::string> arguments;  // of the program
};

/// Names the program and its options, whose values parsing writes into `options`; both live as long as `app` is used.
void AddOptions(CLI::App& app, Options& options);

}  // namespace panelglow::controller
