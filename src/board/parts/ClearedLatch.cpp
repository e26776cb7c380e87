#include "board/parts/ClearedLatch.h"

#include "platform/Host.h"

namespace panelglow {

bool ReadClearedLatch(RegisterFile& file, RegisterId id, std::uint8_t bit, std::uint32_t settle_ms) {
  if ((file.Read(id) & bit) != 0) {
    file.Write(id, bit);
  }
  platform::TheHost().clock.Sleep(settle_ms);
  return (file.Read(id) & bit) != 0;
}

}  // namespace panelglow
