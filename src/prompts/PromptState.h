// What the plain prompts of a process share. Only one plain prompt exists at a time, and one thread uses this state:
// processes are kept apart by the prompt lock, threads are not.
#pragma once

#include <atomic>
#include <cstdint>
#include <functional>

#include "platform/Desktop.h"

namespace panelglow {

/// Results of every prompt: the system's own numbering, a button's control id less 1000.
namespace prompt_result {
inline constexpr int kTerminated = -1;  // the run was told to stop; configurable windows only
inline constexpr int kNone = 0;
inline constexpr int kAbort = 1;
inline constexpr int kCancel = 2;
inline constexpr int kIgnore = 3;
inline constexpr int kNo = 4;
inline constexpr int kOk = 5;
inline constexpr int kRetry = 6;
inline constexpr int kYes = 7;
}  // namespace prompt_result

/// Added to a button set: the window stays above all others and keeps taking the foreground back.
inline constexpr unsigned int kPromptTopmost = 0x1000;

/// A routine that works while a prompt is open, and sets the flag when the prompt is to end. Empty for none.
using AutoWorker = std::function<void(std::atomic<bool>& done)>;

// Bits of PromptState::promptEvents.
inline constexpr std::uint32_t kPromptTick = 1U << 0U;
inline constexpr std::uint32_t kDeviceTreeChanged = 1U << 1U;
inline constexpr std::uint32_t kDeviceArrived = 1U << 2U;
inline constexpr std::uint32_t kDeviceRemoved = 1U << 3U;

struct PromptState {
  std::atomic<std::uint32_t> promptEvents{0};  // set by prompt windows, cleared by ClearPromptEvents alone
  unsigned int timeoutSeconds = 0;             // armed for the next prompt; 0: no time-out
  int timeoutResult = 0;
  bool topmost = false;  // set by the first topmost prompt, and stays so
  std::atomic<bool> workerRunning{false};
  std::atomic<bool> workerDone{false};
};

PromptState& ThePromptState();

}  // namespace panelglow
