// Loading and saving a data-collection log: this program's tree beside two libraries that do the same.
#include <benchmark/benchmark.h>
#include <tinyxml2.h>

#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <ctime>
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

// The three libraries. Each function makes a tree and destroys it; false when it could not.

bool LoadXmlObject() {
  XmlObject tree;
  const bool loaded = tree.LoadFromFile(kFile, false, false, -1);
  benchmark::DoNotOptimize(tree.children.data());
  return loaded;
}

bool LoadTinyXml2() {
  tinyxml2::XMLDocument document;
  const bool loaded = document.LoadFile(kFile) == tinyxml2::XML_SUCCESS;
  benchmark::DoNotOptimize(document.RootElement());
  return loaded;
}

bool LoadPugixml() {
  pugi::xml_document document;
  const bool loaded = document.load_file(kFile);
  benchmark::DoNotOptimize(document.first_child());
  return loaded;
}

bool ParseXmlObject(const std::string& text) {
  const XmlObject tree(text);
  benchmark::DoNotOptimize(tree.children.data());
  return true;
}

bool ParseTinyXml2(const std::string& text) {
  tinyxml2::XMLDocument document;
  const bool parsed = document.Parse(text.data(), text.size()) == tinyxml2::XML_SUCCESS;
  benchmark::DoNotOptimize(document.RootElement());
  return parsed;
}

bool ParsePugixml(const std::string& text) {
  pugi::xml_document document;
  const bool parsed = document.load_buffer(text.data(), text.size());
  benchmark::DoNotOptimize(document.first_child());
  return parsed;
}

// From the file, over and over.
void Load(benchmark::State& state, bool (*load)()) {
  Machine();
  WriteFile(static_cast<std::size_t>(state.range(0)));
  for (auto _ : state) {
    if (!load()) {
      state.SkipWithError("not loaded");
    }
  }
  SetRate(state);
}

// From a text in memory, over and over.
void Parse(benchmark::State& state, bool (*parse)(const std::string&)) {
  const std::string text = LogText(static_cast<std::size_t>(state.range(0)));
  for (auto _ : state) {
    if (!parse(text)) {
      state.SkipWithError("not parsed");
    }
  }
  SetRate(state);
}

// From the file, as a program does that loads it once: in a process of its own, whose memory is not there yet. Time
// of the processor: others that are busy do not count.
void FirstLoad(benchmark::State& state, bool (*load)()) {
  WriteFile(static_cast<std::size_t>(state.range(0)));
  int ends[2]{};
  if (::pipe(ends) != 0) {
    state.SkipWithError("no pipe");
    return;
  }
  for (auto _ : state) {
    const pid_t child = ::fork();
    if (child == 0) {
      Machine();
      const std::clock_t begin = std::clock();
      const bool loaded = load();
      const double seconds = static_cast<double>(std::clock() - begin) / CLOCKS_PER_SEC;
      ::_exit(loaded && ::write(ends[1], &seconds, sizeof(seconds)) == sizeof(seconds) ? 0 : 1);
    }
    int status = 1;
    double seconds = 0;
    if (child < 0 || ::waitpid(child, &status, 0) != child || status != 0 ||
        ::read(ends[0], &seconds, sizeof(seconds)) != sizeof(seconds)) {
      state.SkipWithError("not loaded");
      break;
    }
    state.SetIterationTime(seconds);
  }
  ::close(ends[0]);
  ::close(ends[1]);
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

// The first loads come first: what has run before leaves memory to the processes that are made.
BENCHMARK_CAPTURE(FirstLoad, XmlObject, LoadXmlObject)->Arg(10)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(FirstLoad, TinyXml2, LoadTinyXml2)->Arg(10)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(FirstLoad, Pugixml, LoadPugixml)->Arg(10)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(Load, XmlObject, LoadXmlObject)->Arg(10)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(Load, TinyXml2, LoadTinyXml2)->Arg(10)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(Load, Pugixml, LoadPugixml)->Arg(10)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(Parse, XmlObject, ParseXmlObject)->Arg(10)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(Parse, TinyXml2, ParseTinyXml2)->Arg(10)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(Parse, Pugixml, ParsePugixml)->Arg(10)->Unit(benchmark::kMillisecond);
BENCHMARK(LoadAppendSave)->RangeMultiplier(2)->Range(2, 32)->Unit(benchmark::kMillisecond)->Complexity();

}  // namespace
