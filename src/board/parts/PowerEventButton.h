// The power button as an event of the power management block at a base port: a status word, and behind it a word that
// enables the events.
#pragma once

#include <cstdint>
#include <optional>

#include "hw/CDevio.h"

namespace panelglow {

class PowerEventButton {
 public:
  /// Whether the enable word is read back after it was written.
  enum class Check : std::uint8_t { kReadBack, kNone };

  PowerEventButton(CDevio& client, std::uint16_t basePort, Check how) : devio(&client), base(basePort), check(how) {}

  /// Nothing is kept twice.
  void Save();

  /// Disables the button's events, so that a press is only latched; what was not saved is. False when the word reads
  /// as before: the part ignores it. Without a check the word is changed as it is now, not as it was saved, and the
  /// result is true.
  bool Arm();
  [[nodiscard]] bool IsPressed() const;

  /// True, and nothing is done, without a save; false when the enable word does not read as saved within three
  /// reads, 100 ms apart; then the save is kept, and a further try puts it back.
  bool Restore();

  /// Without one nothing is known of the button: ports 0 and 2 are other parts'.
  [[nodiscard]] bool HasBase() const { return base != 0; }

 private:
  [[nodiscard]] std::uint16_t EnablePort() const { return static_cast<std::uint16_t>(base + 2); }

  CDevio* devio;
  std::uint16_t base;
  Check check;
  std::optional<std::uint16_t> savedEnable;
};

}  // namespace panelglow
