#include "platform/sim/SimModules.h"

#include <algorithm>
#include <utility>

#include "platform/AsciiCase.h"

namespace panelglow::platform::sim {

namespace {

constexpr std::uint16_t kAmdGraphics = 0x1002;
constexpr std::uint16_t kNvidia = 0x10DE;
constexpr std::uint32_t kDisplayClass = 0x03;

class SimGraphicsLibrary : public GraphicsLibrary {
 public:
  explicit SimGraphicsLibrary(std::vector<const PciFunction*> cards) : cards_(std::move(cards)) {}

  std::vector<GraphicsCard> Cards() override {
    std::vector<GraphicsCard> list;
    for (const PciFunction* card : cards_) {
      const std::uint32_t ids = card->registers.at(0);
      list.push_back({static_cast<std::uint16_t>(ids), static_cast<std::uint16_t>(ids >> 16U)});
    }
    return list;
  }

  std::optional<int> ReadTemperature(std::size_t card, unsigned sensor) override {
    if (card >= cards_.size() || sensor >= cards_[card]->temperatures.size()) {
      return std::nullopt;
    }
    return cards_[card]->temperatures[sensor];
  }

 private:
  std::vector<const PciFunction*> cards_;
};

}  // namespace

bool SimModules::CanLoad(std::string_view file) {
  constexpr Microseconds kLoadCost_us = 500;
  scheduler_.Spend(kLoadCost_us);
  return std::any_of(machine_.libraries.begin(), machine_.libraries.end(),
                     [file](const std::string& library) { return EqualNames(library, file); });
}

std::unique_ptr<GraphicsLibrary> SimModules::LoadGraphics(std::string_view file, GraphicsInterface interface) {
  if (!CanLoad(file)) {
    return nullptr;
  }
  const std::uint32_t vendor = interface == GraphicsInterface::kAdl ? kAmdGraphics : kNvidia;
  std::vector<const PciFunction*> cards;
  for (const PciFunction& function : machine_.pci) {
    const auto ids = function.registers.find(0x00);
    const auto code = function.registers.find(0x08);
    if (ids != function.registers.end() && (ids->second & 0xFFFFU) == vendor && code != function.registers.end() &&
        code->second >> 24U == kDisplayClass) {
      cards.push_back(&function);
    }
  }
  return std::make_unique<SimGraphicsLibrary>(std::move(cards));
}

}  // namespace panelglow::platform::sim
