// Object streams of a tree of 100,000 elements beside the XML text of the same tree, and a list file of 10,000 lines.
#include <benchmark/benchmark.h>

#include <sstream>
#include <string>
#include <utility>

#include "config/OrgFileParser.h"
#include "config/XmlObject.h"
#include "config/iptstream.h"
#include "config/optstream.h"
#include "platform/sim/Simulation.h"

namespace {

using panelglow::XmlObject;

constexpr int kGroups = 1000;
constexpr int kElementsOfAGroup = 99;  // and the group itself
constexpr int kElements = kGroups * (kElementsOfAGroup + 1);

XmlObject Tree() {
  XmlObject tree;
  tree.name = "Groups";
  for (int group = 0; group < kGroups; ++group) {
    XmlObject& parent = *tree.AddChild(XmlObject());
    parent.name = "Group";
    parent.SetAttribute("name", "group " + std::to_string(group));
    for (int element = 0; element < kElementsOfAGroup; ++element) {
      XmlObject& child = *parent.AddChild(XmlObject());
      child.name = "Argument";
      child.SetAttribute("name", "-argument" + std::to_string(element));
      child.SetAttribute("value", ".\\value & text");
    }
  }
  return tree;
}

std::string StreamOf(XmlObject& tree) {
  std::ostringstream bytes;
  panelglow::optstream(bytes).WriteValue(tree);
  return std::move(bytes).str();
}

void SetRates(benchmark::State& state, std::size_t bytes) {
  state.SetItemsProcessed(state.iterations() * kElements);
  state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(bytes));
}

void WriteObjectStream(benchmark::State& state) {
  XmlObject tree = Tree();
  std::string stream;
  for (auto _ : state) {
    stream = StreamOf(tree);
    benchmark::DoNotOptimize(stream.data());
  }
  SetRates(state, stream.size());
}

void WriteXmlText(benchmark::State& state) {
  const XmlObject tree = Tree();
  std::string text;
  for (auto _ : state) {
    std::ostringstream bytes;
    bytes << tree;
    text = std::move(bytes).str();
    benchmark::DoNotOptimize(text.data());
  }
  SetRates(state, text.size());
}

void ReadObjectStream(benchmark::State& state) {
  XmlObject source = Tree();
  const std::string stream = StreamOf(source);
  std::istringstream bytes(stream);
  for (auto _ : state) {
    bytes.seekg(0);
    XmlObject tree;
    panelglow::iptstream(bytes).ReadValue(tree);
    if (tree.children.size() != kGroups) {
      state.SkipWithError("not read");
    }
  }
  SetRates(state, stream.size());
}

void ReadXmlText(benchmark::State& state) {
  const std::string text = Tree().ToString(false);
  for (auto _ : state) {
    const XmlObject tree(text);
    if (tree.children.size() != kGroups) {
      state.SkipWithError("not read");
    }
  }
  SetRates(state, text.size());
}

void ReadListFile(benchmark::State& state) {
  constexpr int kLines = 10'000;
  std::string content = "[list]\n";
  for (int line = 0; line < kLines; ++line) {
    content += "8086, " + std::to_string(10'000 + line) + ", \"a, b\", 4 ; c\n";
  }
  panelglow::platform::sim::Simulation machine(panelglow::platform::sim::MachineDescription{}, {});
  machine.DiskFiles().Put("list.ini", content);
  for (auto _ : state) {
    panelglow::OrgFileParser parser("list.ini");
    int fields = 0;
    parser.ReadSection("list");
    while (parser.NextLine()) {
      fields += parser.GetFieldCount();
    }
    if (fields != 4 * kLines) {
      state.SkipWithError("not split");
    }
  }
  state.SetItemsProcessed(state.iterations() * kLines);
}

BENCHMARK(WriteObjectStream)->Unit(benchmark::kMillisecond);
BENCHMARK(WriteXmlText)->Unit(benchmark::kMillisecond);
BENCHMARK(ReadObjectStream)->Unit(benchmark::kMillisecond);
BENCHMARK(ReadXmlText)->Unit(benchmark::kMillisecond);
BENCHMARK(ReadListFile)->Unit(benchmark::kMillisecond);

}  // namespace
