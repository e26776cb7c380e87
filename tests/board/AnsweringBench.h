// A simulated machine on which some ports answer as they are told.
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "board/ChipCases.h"

namespace panelglow {

using Answers = std::map<std::uint16_t, std::vector<std::uint8_t>>;

/// Ports that keep what is written, but for those that have answers: these come one after the other, and the last
// stays.
class AnsweringPorts : public platform::sim::Device {
 public:
  explicit AnsweringPorts(Answers told) : answers(std::move(told)) {}

  [[nodiscard]] std::vector<platform::sim::AddressRange> PortRanges() const override {
    std::vector<platform::sim::AddressRange> ranges;
    for (const auto& [port, unused] : answers) {
      ranges.push_back({port, 1});
    }
    return ranges;
  }
  std::uint8_t ReadPort(std::uint16_t port) override {
    std::vector<std::uint8_t>& next = answers.at(port);
    const std::uint8_t value = next.front();
    if (next.size() > 1) {
      next.erase(next.begin());
    }
    return value;
  }
  void WritePort(std::uint16_t port, std::uint8_t value) override {
    std::vector<std::uint8_t>& next = answers.at(port);
    if (next.size() == 1) {
      next.front() = isKept ? value : next.front();
    }
  }
  [[nodiscard]] std::optional<bool> Signal(std::string_view /*pin*/) const override { return std::nullopt; }
  [[nodiscard]] std::string State() const override { return ""; }

  bool isKept = true;  // what is written to a port whose answers have ended

 private:
  Answers answers;
};

class AnsweringBench : public KeyBench {
 public:
  explicit AnsweringBench(const Answers& answers = {}, const std::string& keys = "", bool isKept = true,
                          const std::string& hardware = "")
      : KeyBench(hardware, keys) {
    auto ports = std::make_unique<AnsweringPorts>(answers);
    ports->isKept = isKept;
    machine.Hardware().Remove("pci");  // whose ports have answers here
    machine.Hardware().Attach("ports", std::move(ports));
  }
};

}  // namespace panelglow
