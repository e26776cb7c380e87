// The prompt lock and what prompts need of the harness. A prompt, or a test's own dialog, holds the lock for as long
// as the operator can see it, so that those of all processes of the machine appear one after the other.
#pragma once

#include <cstdint>
#include <functional>
#include <string>

#include "platform/Text.h"

namespace panelglow {

class CDMWindow {
 public:
  CDMWindow() = default;
  virtual ~CDMWindow() = default;

  /// Returns when the calling thread owns the machine-wide prompt lock; there is no time limit.
  static void LockPrompt();

  /// Gives the lock up. Without effect on a thread that does not own it.
  static void ReleasePrompt();

  /// True when one of the events (kPromptTick, kDeviceArrived, ...) has been noted since it was last cleared.
  static bool TestPromptEvents(std::uint32_t mask);
  static void ClearPromptEvents(std::uint32_t mask);

  /// What the harness above supplies. Handed in once at start-up.
  struct Services {
    std::function<wstring(int id, const wstring& fallback)> text;  // a text by message number
    std::function<std::string()> locale;
    std::function<bool()> isStopRequested;
  };
  static void SetServices(Services services);
  static wstring Text(int id, const wstring& fallback);
  static std::string Locale();
  static bool IsStopRequested();
};

}  // namespace panelglow
