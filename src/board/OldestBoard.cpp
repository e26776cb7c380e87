#include "board/OldestBoard.h"

#include <utility>

#include "board/base/SelectedSystem.h"
#include "board/base/Setting.h"
#include "platform/Host.h"

namespace panelglow {

OldestBoard::OldestBoard(std::string boardClass, std::uint16_t boardId, const Traits& fixed)
    : MotherBoard(std::move(boardClass), boardId), traits(fixed), superIo(devio, fixed.indexPort) {}

std::uint16_t OldestBoard::ReadFlatWord(const char* key) {
  constexpr std::size_t kValueBuffer = 64;
  const SelectedSystem selected = GetSelectedSystem();
  std::string value(kValueBuffer, '\0');
  value.resize(platform::TheHost().profiles.GetValue(selected.section, key, "", value, selected.detectIniPath));
  if (value.empty()) {
    return 0;
  }
  return static_cast<std::uint16_t>(NumberIn(
      value, 16, {value, selected.detectIniPath + ", section [" + selected.section + "], key \"" + key + "\""}));
}

bool OldestBoard::IsPowerLedRedSupported(bool& supported) {
  supported = traits.fanLatched;
  return true;
}

}  // namespace panelglow
