// The temperatures of the graphics cards, read through their makers' libraries, and the limits that the test file has
// for each kind of card. Serves the chip name "videochip".
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "board/chips/Chip.h"
#include "platform/Modules.h"

namespace panelglow {

class VideoChip : public Chip {
 public:
  VideoChip() : Chip("videochip") {}

  int CountCards() override;

  /// The hottest of the card's sensors, in degrees. False for a card that there is not, one of a maker whose library
  /// is not known or not installed, and one without a sensor; people are told what is missing.
  bool ReadTemperature(int zone, int& value) override;

  /// The card's limits. False for a card that the test file does not list.
  bool ReadThreshold(int zone, int& value) override;
  bool ReadLowLimitTemperature(int zone, int& value) override;

 private:
  struct Card {
    std::uint32_t vendorId = 0;
    std::uint32_t deviceId = 0;
    std::uint32_t subVendorId = 0;
    std::uint32_t subDeviceId = 0;
    std::size_t earlierEqual = 0;  // cards ahead of it with the same vendor and device
  };

  void FindCards();
  const Card* CardAt(int zone);
  platform::GraphicsLibrary* LibraryOf(const Card& card);
  [[nodiscard]] static std::string FindEntry(const Card& card);
  bool ReadLimit(int zone, const char* key, int& value);

  std::optional<std::vector<Card>> cards;  // once found
  std::unique_ptr<platform::GraphicsLibrary> adl;
  std::unique_ptr<platform::GraphicsLibrary> nvApi;
};

}  // namespace panelglow
