#include "platform/sim/silicon/EnvironmentController.h"

#include <cstdio>

namespace panelglow::platform::sim {

namespace {

constexpr Microseconds kRound_us = 50'000;  // all inputs are measured once in this time

}  // namespace

EnvironmentController::EnvironmentController(const EnvironmentSetup& setup, const Scheduler& time)
    : setup_(setup), time_(time) {
  for (const auto* values : {&setup_.settings, &setup_.sensors}) {
    for (const auto& [address, value] : *values) {
      registers_[address] = value;
    }
  }
  if (setup_.intrusion && (setup_.intrusion->wasOpened || setup_.intrusion->isOpen)) {
    latchedFrom_ = 0;
  }
}

std::uint8_t EnvironmentController::Read() const {
  std::uint8_t value = registers_[index_];
  if (setup_.intrusion && index_ == setup_.intrusion->statusRegister && latchedFrom_ &&
      time_.Now() >= *latchedFrom_) {
    value = static_cast<std::uint8_t>(value | 1U << setup_.intrusion->statusBit);
  }
  return value;
}

void EnvironmentController::Write(std::uint8_t value) {
  if (setup_.sensors.count(index_) != 0) {
    return;
  }
  if (setup_.intrusion && index_ == setup_.intrusion->clearRegister) {
    const unsigned clear = 1U << setup_.intrusion->clearBit;
    if ((value & clear) != 0) {
      latchedFrom_ = setup_.intrusion->isOpen ? std::optional<Microseconds>(time_.Now() + kRound_us) : std::nullopt;
    }
    value = static_cast<std::uint8_t>(value & ~clear);
  }
  registers_[index_] = value;
}

std::string EnvironmentController::State() const {
  std::string text;
  for (const auto& [address, initial] : setup_.settings) {
    char line[48];
    std::snprintf(line, sizeof line, "environment register %02X = %02X\n", address, registers_[address]);
    text += line;
  }
  return text;
}

}  // namespace panelglow::platform::sim
