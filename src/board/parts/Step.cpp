#include "board/parts/Step.h"

namespace panelglow {

void Run(std::span<const Step> steps, RegisterFile& file, const SavedRegisters& saved) {
  for (const Step& step : steps) {
    std::uint8_t old = 0;
    if (step.from == From::kRegister) {
      old = file.Read(step.id);
    } else if (step.from == From::kSaved) {
      old = saved.At(step.id);
    }
    file.Write(step.id, static_cast<std::uint8_t>((old & step.keep) | step.set));
  }
}

void Run(std::span<const Step> steps, RegisterFile& file) { Run(steps, file, SavedRegisters()); }

}  // namespace panelglow
