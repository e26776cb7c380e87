// The kinds of front-panel LED that CustomLEDTest knows, each with its fixed ids and codes.
#pragma once

#include <cstdint>
#include <span>
#include <string_view>

namespace panelglow {

struct LedKind {
  std::string_view function;  // key in buttondefinition.xml
  std::int32_t deviceId;
  std::uint32_t startCommand;
  std::uint32_t buttonCommand;  // what the button's ButtonLParam holds
  std::string_view errorCode;
  std::string_view logName;  // of the worker in log lines
};

// Device ids that code refers to.
inline constexpr std::int32_t kNoLed = 0;
inline constexpr std::int32_t kNumLock = 4;
inline constexpr std::int32_t kChargeGreen = 7;
inline constexpr std::int32_t kScrollLock = 11;
inline constexpr std::int32_t kCapsLock = 12;
inline constexpr std::int32_t kHdRed = 17;
inline constexpr std::int32_t kPowerRed = 19;
inline constexpr std::int32_t kPowerGreen = 20;
inline constexpr std::int32_t kNetwork = 25;
inline constexpr std::int32_t kWebcam = 32;
inline constexpr std::int32_t kChargeRed = 33;
inline constexpr std::int32_t kTouchpad = 34;
inline constexpr std::int32_t kSpeakerMute = 35;
inline constexpr std::int32_t kMicrophone = 36;
inline constexpr std::int32_t kFirstHdGreen = 90;  // one id per drive controller from here on

inline constexpr std::uint32_t kHdGreenCommand = 777;
inline constexpr std::uint32_t kHdButtonCommand = 1013;

/// All kinds but hdgreen's, which has one entry per controller, and hdgreen as the last row.
std::span<const LedKind> LedKinds();

/// Null when there is none.
const LedKind* FindLedKindByFunction(std::string_view function);
const LedKind* FindLedKindByStartCommand(std::uint32_t command);
const LedKind* FindLedKindByButton(std::uint32_t command);

}  // namespace panelglow
