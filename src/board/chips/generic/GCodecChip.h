// The HD Audio codec, whose GPIO pins drive the speaker and microphone LEDs. Verbs go through the controller's
// immediate command registers. Serves the chip name "g_codec".
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "board/base/Setting.h"
#include "board/chips/generic/GChip.h"

namespace panelglow {

class GCodecChip : public GChip {
 public:
  /// Finds the controller and reads the chip's keys. Throws mblib_exception when no base address can be had.
  GCodecChip();

  // Every LED operation is false when one of the verb lists that it uses does not hold exactly three verbs.
  bool SaveSpeakerLedState() override;
  bool RestoreSpeakerLedState() override;
  bool AssertSpeakerLed() override { return SetGpio(speakerBit, true); }
  bool DeassertSpeakerLed() override { return SetGpio(speakerBit, false); }
  bool AssertMicrophoneLed() override { return SetGpio(microphoneBit, true); }
  bool DeassertMicrophoneLed() override { return SetGpio(microphoneBit, false); }
  bool BlinkSpeakerLed() override { return BlinkGpio(speakerBit); }
  bool BlinkMicrophoneLed() override { return BlinkGpio(microphoneBit); }

  virtual bool ReservedOperation86() { return false; }

  /// "undef" is an empty list.
  virtual void ParseVerbList(const Setting& setting, std::vector<std::uint32_t>& list);

  /// Sends one verb and returns the codec's response; 0 when the controller stays busy or gives none.
  virtual std::uint32_t SendVerb(std::uint32_t verb);
  virtual void LoadVerbLists();

  /// Blinks a pin for 25.5 s and leaves it asserted.
  virtual bool BlinkGpio(std::uint16_t bit);

 private:
  static constexpr std::size_t kVerbs = 3;  // of each list: GPIO enable, direction, data

  std::uint32_t FindController();
  std::uint32_t SetVerb(std::size_t index, std::uint32_t mask) const;
  bool SetGpio(std::uint16_t bit, bool asserted);
  std::uint32_t ReadRegister(std::uint16_t offset, std::uint32_t length);
  void WriteRegister(std::uint16_t offset, std::uint32_t length, std::uint32_t value);
  bool AwaitIdle(std::uint32_t& status, int& rereads);

  std::uint32_t hdaBar = 0;     // memory base of the HD Audio controller
  std::uint16_t icwReg = 0x60;  // immediate command write
  std::uint16_t irrReg = 0x64;  // immediate response read
  std::uint16_t icsReg = 0x68;  // immediate command status
  std::vector<std::uint32_t> stateSetVerbs;
  std::vector<std::uint32_t> stateSaveVerbs;
  std::vector<std::uint32_t> stateRestoreVerbs;
  std::array<std::uint32_t, kVerbs> savedResponses{};
  bool isStateSaved = false;
  std::uint16_t speakerBit = 0;
  std::uint16_t microphoneBit = 3;
};

}  // namespace panelglow
