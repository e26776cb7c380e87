#include "board/chips/fin/FinCurveChip.h"

#include <utility>

#include "board/parts/RowOf.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kBounds = 4;  // temperatures between the sections of a curve, its first registers
constexpr std::uint8_t kDuties = 5;  // duty of each section, behind them

}  // namespace

FinCurveChip::FinCurveChip(std::string chipName) : FinChip(std::move(chipName)) {
  fans.duties = RegistersAt(0, {0xA6, 0xB6, 0xC6});
}

std::vector<RegisterId> FinCurveChip::WithCurves(const std::vector<std::uint8_t>& others,
                                                 const std::vector<std::uint8_t>& curves, std::size_t count) {
  std::vector<RegisterId> ids = RegistersAt(0, others);
  for (const std::uint8_t first : curves) {
    const std::vector<RegisterId> curve = RegisterRun(0, first, count);
    ids.insert(ids.end(), curve.begin(), curve.end());
  }
  return ids;
}

void FinCurveChip::Flatten(RegisterId curve, std::uint8_t duty) {
  for (const RegisterId bound : RegisterRun(0, curve.reg, kBounds)) {
    monitor.Write(bound, 0);
  }
  for (const RegisterId section : RegisterRun(0, static_cast<std::uint8_t>(curve.reg + kBounds), kDuties)) {
    monitor.Write(section, duty);
  }
}

bool FinCurveChip::WriteDuty(int fan, int value) {
  if (fan <= 0 && takesAllFans) {
    for (std::size_t last = fans.duties.size(); last > 0; --last) {
      Flatten(fans.duties[last - 1], DutyOf(value));
    }
    return true;
  }
  const RegisterId* curve = RowOf(fans.duties, fan);
  if (curve == nullptr) {
    return false;
  }
  Flatten(*curve, DutyOf(value));
  return true;
}

}  // namespace panelglow
