// The kinds of front-panel LED, each with its fixed ids, its code and its worker.
#pragma once

#include <cstdint>
#include <span>
#include <string_view>

#include "ledtests/BlinkWorkers.h"

namespace panelglow {

struct LedKind {
  std::string_view function;  // key in buttondefinition.xml, or a name of our own
  std::int32_t deviceId;
  std::uint32_t startCommand;
  std::uint32_t buttonCommand;  // what the button's ButtonLParam holds
  std::string_view errorCode;
  std::string_view logName;  // of the worker in log lines
  BlinkWorker worker;
};

// Device ids that code refers to.
inline constexpr std::int32_t kNoLed = 0;
inline constexpr std::int32_t kNumLock = 4;
inline constexpr std::int32_t kChargeGreen = 7;
inline constexpr std::int32_t kFloppy = 9;
inline constexpr std::int32_t kScrollLock = 11;
inline constexpr std::int32_t kCapsLock = 12;
inline constexpr std::int32_t kScsiDrive = 15;
inline constexpr std::int32_t kHdRed = 17;
inline constexpr std::int32_t kPowerRed = 19;
inline constexpr std::int32_t kPowerGreen = 20;
inline constexpr std::int32_t kIdeDrive = 24;
inline constexpr std::int32_t kNetwork = 25;
inline constexpr std::int32_t kWebcam = 32;
inline constexpr std::int32_t kChargeRed = 33;
inline constexpr std::int32_t kTouchpad = 34;
inline constexpr std::int32_t kSpeakerMute = 35;
inline constexpr std::int32_t kMicrophone = 36;
inline constexpr std::int32_t kFirstHdGreen = 90;  // one id per drive controller from here on

inline constexpr std::uint32_t kHdGreenCommand = 777;
inline constexpr std::uint32_t kHdButtonCommand = 1013;

/// The kinds that button files can name.
std::span<const LedKind> LedKinds();

/// Those, and the kinds that are selected by parameters alone.
std::span<const LedKind> AllLedKinds();

/// Null when there is none.
const LedKind* FindLedKindByFunction(std::string_view function);
const LedKind* FindLedKindByStartCommand(std::uint32_t command);

/// The kind of an entry; that of all ids from kFirstHdGreen on is hdgreen.
const LedKind* FindLedKindByDevice(std::int32_t deviceId);

}  // namespace panelglow
