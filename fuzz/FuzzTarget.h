// What the fuzz targets share. Each .cpp file of this folder registers one target: a reader of the program, given any
// bytes. libFuzzer links one of them at a time (see FuzzerEntry.cpp), tests/fuzz links all and gives them the files
// of corpus/<target>: small examples to start from, and whatever once went wrong.
#pragma once

#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "platform/sim/Simulation.h"

namespace panelglow::fuzz {

struct Target {
  std::string name;  // of the file, of its folder of examples, and of the program
  void (*body)(std::string_view bytes);
};

inline std::vector<Target>& Targets() {
  static std::vector<Target> targets;
  return targets;
}

struct Registered {
  Registered(std::string name, void (*body)(std::string_view bytes)) { Targets().push_back({std::move(name), body}); }
};

/// For what must hold of every input.
inline void Check(bool holds, const char* what) {
  if (!holds) {
    std::fprintf(stderr, "does not hold: %s\n", what);
    std::abort();
  }
}

/// The part of `bytes` up to the next `separator`, which is taken away with it.
inline std::string Take(std::string_view& bytes, char separator) {
  const std::size_t end = std::min(bytes.find(separator), bytes.size());
  std::string part(bytes.substr(0, end));
  bytes.remove_prefix(std::min(end + 1, bytes.size()));
  return part;
}

/// The simulated machine of this process, with all its files in memory; kept to the end.
inline platform::sim::Simulation& Machine() {
  static platform::sim::Simulation* const machine = [] {
    platform::sim::SimulationOptions options;
    options.timeLimit_us = 0;
    return new platform::sim::Simulation(platform::sim::MachineDescription{}, options);
  }();
  machine->ClearOutput();
  return *machine;
}

/// A file that holds these bytes.
inline const char* PutFile(const char* path, std::string_view bytes) {
  Machine().DiskFiles().Put(path, std::string(bytes));
  return path;
}

}  // namespace panelglow::fuzz
