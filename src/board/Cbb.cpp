#include "board/Cbb.h"

#include <algorithm>
#include <array>

#include "hw/Tsk.h"

namespace panelglow {

namespace {

struct Model {
  std::uint16_t systemId;
  const char* chip;
};

constexpr std::array<Model, 4> kModels{{{0x0B1C, "fin"}, {0x0B38, "fin"}, {0x0B34, "win"}, {0x0B44, "win_w83202g"}}};

}  // namespace

Cbb::Cbb(const std::string& systemIdText) : MotherBoard("CBB", SystemIdOf(systemIdText)) {
  const auto* model = std::find_if(kModels.begin(), kModels.end(),
                                   [this](const Model& row) { return row.systemId == GetSystemId(); });
  if (model != kModels.end()) {
    Place(model->chip);
    powerLed.name = model->chip;
    powerButton.name = model->chip;
  }
}

}  // namespace panelglow
