// One of the machines in machines/, reached through its driver as a program reaches it, with its panel in view.
#pragma once

#include <gtest/gtest.h>

#include <fstream>
#include <memory>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "platform/Host.h"
#include "platform/sim/Simulation.h"

namespace panelglow::platform::sim {

/// The text of a machine's file with `more` put behind the first line that is `line`.
inline std::string MachineText(const std::string& file, const std::string& line = {}, const std::string& more = {}) {
  std::ifstream stream(std::string(PANELGLOW_SOURCE_DIR "/machines/") + file);
  std::ostringstream text;
  text << stream.rdbuf();
  std::string content = text.str();
  if (!line.empty()) {
    const std::size_t at = content.find("\n" + line + "\n");
    EXPECT_NE(at, std::string::npos) << line;
    content.insert(at + line.size() + 2, more + "\n");
  }
  return content;
}

class Bench {
 public:
  using Write = std::pair<std::uint16_t, std::uint8_t>;  // port and value

  explicit Bench(const std::string& text)
      : machine(text + "\n[[driver.service]]\nname = \"bench\"\nrunning = true\n") {
    std::uint32_t error = 0;
    device_ = machine.TheMachine().drivers.Open("bench", error);
  }

  void Out(std::uint16_t port, std::uint8_t value) { Port(0x220010, port, value); }
  std::uint8_t In(std::uint16_t port) { return static_cast<std::uint8_t>(Port(0x220004, port, 0)); }
  void Run(const std::vector<Write>& writes, Microseconds pause_us = 0) {
    for (const auto& [port, value] : writes) {
      Out(port, value);
      machine.Time().SleepFor(pause_us);
    }
  }

  // Byte by byte, as a program may.
  void WriteMemory(std::uint64_t address, std::uint32_t value, std::size_t width) {
    const std::uint64_t mapped = Map(address);
    for (std::size_t i = 0; i < width; ++i) {
      device_->WriteMapped(mapped + i, 1, value >> (8 * i) & 0xFFU);
    }
  }
  std::uint32_t ReadMemory(std::uint64_t address, std::size_t width) {
    const std::uint64_t mapped = Map(address);
    std::uint32_t value = 0;
    for (std::size_t i = 0; i < width; ++i) {
      value |= device_->ReadMapped(mapped + i, 1) << (8 * i);
    }
    return value;
  }

  void Wait_us(Microseconds duration) { machine.Time().SleepFor(duration); }
  [[nodiscard]] bool IsLit(const std::string& led) { return machine.Panel().IsLit(led); }

  /// When the lamp changed since `from`.
  [[nodiscard]] std::vector<Microseconds> Edges(const std::string& led, Microseconds from) {
    std::vector<Microseconds> edges;
    for (const LedChange& change : machine.Panel().TimeLine()) {
      if (change.time >= from && machine.Panel().Leds()[change.led].name == led) {
        edges.push_back(change.time);
      }
    }
    return edges;
  }

  Simulation machine;

 private:
  std::uint32_t Port(std::uint32_t code, std::uint16_t port, std::uint32_t value) {
    const std::uint32_t request[3] = {port, 1, value};
    std::uint32_t answer = 0;
    device_->Control(code, std::as_bytes(std::span(request)), std::as_writable_bytes(std::span(&answer, 1)));
    return answer;
  }

  std::uint64_t Map(std::uint64_t address) {
    std::uint64_t record[5] = {address, 4, 0, 0, 0};
    const auto bytes = std::as_writable_bytes(std::span(record));
    device_->Control(0x2200A8, bytes, bytes);
    return record[2];
  }

  std::unique_ptr<DriverDevice> device_;
};

}  // namespace panelglow::platform::sim
