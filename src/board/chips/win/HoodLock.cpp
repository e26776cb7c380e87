#include "board/chips/win/HoodLock.h"

#include "board/parts/ConfigRegisters.h"
#include "board/parts/Step.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr RegisterId kHoodLock{ConfigRegisters::kGlobal, 0x17};
constexpr int kMostLooks = 20;
constexpr std::uint32_t kBetweenLooks_ms = 100;

}  // namespace

bool MoveHoodLock(RegisterFile& config, HoodCommand command) {
  const auto bit = static_cast<std::uint8_t>(command);
  const Step start = SetBits(kHoodLock, bit);
  Run({&start, 1}, config);
  for (int look = 1; (config.Read(kHoodLock) & bit) != 0; ++look) {
    if (look == kMostLooks) {
      return false;
    }
    platform::TheHost().clock.Sleep(kBetweenLooks_ms);
  }
  return true;
}

}  // namespace panelglow
