// Loading and saving a data-collection log: this program's tree beside two libraries that do the same.
#include <benchmark/benchmark.h>
#include <tinyxml2.h>

#include <cstdio>
#include <fstream>
#include <pugixml.hpp>
#include <string>

#include "config/XmlObject.h"
#include "platform/sim/Simulation.h"

namespace {

using panelglow::XmlObject;

constexpr const char* kFile = "bench-log.xml";

// A log of about `megabytes` MB, run after run of four attempts and twenty arguments.
std::string LogText(std::size_t megabytes) {
  std::string run =
      "  <Diagnostic name=\"panelglow-diags\">\n"
      "    <Subtest name=\"CustomLEDTest\" duration=\"27450\" status=\"1\" errorcode=\"0\" "
      "starttime=\"03/01/2024 12:00:00\" endtime=\"03/01/2024 12:00:27\">\n"
      "      <Attempts retriesspecified=\"3\" retriesattempted=\"3\">\n";
  for (int i = 0; i < 4; ++i) {
    run += "        <Attempt number=\"" + std::to_string(i) + "\" errorcode=\"770133\"/>\n";
  }
  run += "      </Attempts>\n      <ArgumentList>\n";
  for (int i = 0; i < 20; ++i) {
    run += "        <Argument name=\"-argument" + std::to_string(i) + "\" value=\".\\value &amp; text\"/>\n";
  }
  run += "      </ArgumentList>\n    </Subtest>\n  </Diagnostic>\n";
  std::string text = "<DiagnosticsData Version=\"4.15.0\">\n";
  while (text.size() < megabytes << 20U) {
    text += run;
  }
  return text + "</DiagnosticsData>\n";
}

void WriteFile(std::size_t megabytes) { std::ofstream(kFile, std::ios::binary) << LogText(megabytes); }

// A machine whose files are the real ones of this folder.
panelglow::platform::sim::Simulation& Machine() {
  static panelglow::platform::sim::Simulation machine(panelglow::platform::sim::MachineDescription{},
                                                      {.realFiles = true});
  return machine;
}

void SetRate(benchmark::State& state) {
  state.SetBytesProcessed(state.iterations() * (state.range(0) << 20));
  std::remove(kFile);
}

void LoadXmlObject(benchmark::State& state) {
  Machine();
  WriteFile(static_cast<std::size_t>(state.range(0)));
  for (auto _ : state) {
    XmlObject tree;
    if (!tree.LoadFromFile(kFile, false, false, -1)) {
      state.SkipWithError("not loaded");
    }
    benchmark::DoNotOptimize(tree.children.data());
  }
  SetRate(state);
}

void LoadTinyXml2(benchmark::State& state) {
  WriteFile(static_cast<std::size_t>(state.range(0)));
  for (auto _ : state) {
    tinyxml2::XMLDocument document;
    if (document.LoadFile(kFile) != tinyxml2::XML_SUCCESS) {
      state.SkipWithError("not loaded");
    }
    benchmark::DoNotOptimize(document.RootElement());
  }
  SetRate(state);
}

void LoadPugixml(benchmark::State& state) {
  WriteFile(static_cast<std::size_t>(state.range(0)));
  for (auto _ : state) {
    pugi::xml_document document;
    if (!document.load_file(kFile)) {
      state.SkipWithError("not loaded");
    }
    benchmark::DoNotOptimize(document.first_child());
  }
  SetRate(state);
}

// What the end of a run costs on a log of this size.
void LoadAppendSave(benchmark::State& state) {
  Machine();
  WriteFile(static_cast<std::size_t>(state.range(0)));
  for (auto _ : state) {
    XmlObject tree;
    tree.LoadFromFile(kFile, false, false, -1);
    XmlObject run("<Diagnostic name=\"panelglow-diags\"><Subtest name=\"CustomLEDTest\"/></Diagnostic>");
    tree.AddChild(run);
    tree.SaveToFile(kFile, false, false);
  }
  state.SetComplexityN(state.range(0));
  SetRate(state);
}

BENCHMARK(LoadXmlObject)->Arg(10)->Unit(benchmark::kMillisecond);
BENCHMARK(LoadTinyXml2)->Arg(10)->Unit(benchmark::kMillisecond);
BENCHMARK(LoadPugixml)->Arg(10)->Unit(benchmark::kMillisecond);
BENCHMARK(LoadAppendSave)->RangeMultiplier(2)->Range(2, 32)->Unit(benchmark::kMillisecond)->Complexity();

}  // namespace
