#include "platform/sim/silicon/CoolingModel.h"

#include <algorithm>
#include <utility>

namespace panelglow::platform::sim {

namespace {

constexpr Microseconds kStep_us = 100'000;
constexpr Microseconds kMostSteps = 36'000;  // of one look; an hour settles everything
constexpr std::int64_t kStepsPerSecond = 10;
constexpr std::int64_t kFullDuty = 255;

std::int64_t Toward(std::int64_t from, std::int64_t target, std::int64_t most) {
  return from + std::clamp(target - from, -most, most);
}

}  // namespace

CoolingModel::CoolingModel(CoolingSetup setup, const Registers& registers) : setup_(std::move(setup)) {
  for (const FanSetup& fan : setup_.fans) {
    speeds_.push_back(Target(fan, registers));
  }
  for (const SensorSetup& sensor : setup_.sensors) {
    degrees_.push_back(Target(sensor));
  }
}

std::int64_t CoolingModel::Target(const FanSetup& fan, const Registers& registers) {
  const bool isManual = !fan.mode || (registers(*fan.mode) & fan.manual) == fan.manual;
  const std::int64_t set = fan.duty ? registers(*fan.duty) : kFullDuty;
  const std::int64_t duty = isManual ? set : fan.automatic;
  return !fan.isPlugged || duty < fan.stall ? 0 : fan.full_rpm * duty / kFullDuty;
}

std::int64_t CoolingModel::Target(const SensorSetup& sensor) const {
  const std::int64_t span = 1000 * (std::int64_t{sensor.cooled} - sensor.still);
  const std::int64_t full = std::max<std::int64_t>(setup_.fans[sensor.fan].full_rpm, 1);
  return 1000 * std::int64_t{sensor.still} + span * speeds_[sensor.fan] / full;
}

void CoolingModel::Advance(Microseconds now, const Registers& registers) {
  const Microseconds due = now / kStep_us;
  steps_ = std::max(steps_, due > kMostSteps ? due - kMostSteps : 0);
  for (; steps_ < due; ++steps_) {
    for (std::size_t i = 0; i < speeds_.size(); ++i) {
      const FanSetup& fan = setup_.fans[i];
      speeds_[i] = Toward(speeds_[i], Target(fan, registers), fan.ramp_rpm / kStepsPerSecond);
    }
    for (std::size_t i = 0; i < degrees_.size(); ++i) {
      const SensorSetup& sensor = setup_.sensors[i];
      degrees_[i] = Toward(degrees_[i], Target(sensor), sensor.ramp_mdeg / kStepsPerSecond);
    }
  }
}

std::uint32_t CoolingModel::Count(std::size_t fan) const {
  const FanSetup& setup = setup_.fans[fan];
  return speeds_[fan] == 0
             ? setup.stopped
             : static_cast<std::uint32_t>(std::min<std::int64_t>(setup.clock / speeds_[fan], setup.stopped));
}

std::optional<std::uint8_t> CoolingModel::Read(std::uint8_t address) const {
  for (std::size_t i = 0; i < setup_.fans.size(); ++i) {
    if (address == setup_.fans[i].tachHigh) {
      return static_cast<std::uint8_t>(Count(i) >> 8U);
    }
    if (address == setup_.fans[i].tachLow) {
      return static_cast<std::uint8_t>(Count(i));
    }
  }
  for (std::size_t i = 0; i < setup_.sensors.size(); ++i) {
    if (address == setup_.sensors[i].address) {
      return static_cast<std::uint8_t>(degrees_[i] / 1000);
    }
  }
  return std::nullopt;
}

}  // namespace panelglow::platform::sim
