// One layered look-up of a board setting in a 300 KB file, beside libraries that load a file and look a key up.
#include <benchmark/benchmark.h>
#include <glib.h>

#include <fstream>
#include <string>

#define SI_NO_CONVERSION  // narrow text only
#include <SimpleIni.h>

#include "board/base/IniReader.h"
#include "platform/sim/Simulation.h"

namespace {

constexpr const char* kDetect = "bench-mbdetect.ini";
constexpr const char* kTest = "bench-mbtest.ini";
constexpr const char* kSection = "7D10";
constexpr const char* kKey = "test.powerled.chip";

// About 300 KB of board sections; the wanted one stands in the middle.
std::string BoardFile() {
  std::string text;
  for (int board = 0; text.size() < 300'000; ++board) {
    const std::string id = board == 600 ? std::string(kSection) : "B" + std::to_string(board);
    text += "[" + id + "]\n# a board\nplatform=generic\nchips=g_iospace, g_ec\n";
    for (int key = 0; key < 8; ++key) {
      text += "detect.key." + std::to_string(key) + "=0x" + std::to_string(key) + "A20:0x01\n";
    }
    text += std::string(kKey) + "=g_iospace\n\n";
  }
  return text;
}

void WriteFiles() {
  std::ofstream(kDetect, std::ios::binary) << BoardFile();
  std::ofstream(kTest, std::ios::binary) << "[7D10]\ntest.chargeled.redled.support=no\n";
}

void LayeredLookUp(benchmark::State& state) {
  const panelglow::platform::sim::Simulation machine(panelglow::platform::sim::MachineDescription{},
                                                     {.realFiles = true});
  WriteFiles();
  panelglow::IniReader reader(kSection, kDetect, kTest, "none.ini");
  for (auto _ : state) {
    panelglow::IniReader::status_t status = panelglow::IniReader::kNotFound;
    benchmark::DoNotOptimize(reader.ReadIniValue(kKey, status, ""));
    if (status != panelglow::IniReader::kFound) {
      state.SkipWithError("not found");
    }
  }
}

void KeyFileLoadAndGet(benchmark::State& state) {
  WriteFiles();
  for (auto _ : state) {
    GKeyFile* file = g_key_file_new();
    if (g_key_file_load_from_file(file, kDetect, G_KEY_FILE_NONE, nullptr) == FALSE) {
      state.SkipWithError("not loaded");
    }
    gchar* value = g_key_file_get_string(file, kSection, kKey, nullptr);
    benchmark::DoNotOptimize(value);
    g_free(value);
    g_key_file_free(file);
  }
}

void SimpleIniLoadAndGet(benchmark::State& state) {
  WriteFiles();
  for (auto _ : state) {
    CSimpleIniA file;
    if (file.LoadFile(kDetect) < 0) {
      state.SkipWithError("not loaded");
    }
    benchmark::DoNotOptimize(file.GetValue(kSection, kKey));
  }
}

BENCHMARK(LayeredLookUp)->Unit(benchmark::kMicrosecond);
BENCHMARK(KeyFileLoadAndGet)->Unit(benchmark::kMicrosecond);
BENCHMARK(SimpleIniLoadAndGet)->Unit(benchmark::kMicrosecond);

}  // namespace
