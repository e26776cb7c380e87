// The time limit of a prompt: counts ticks, and paints the seconds that are left. The number is painted on the window
// and on the controls that lie where it stands.
#pragma once

#include <cstdint>
#include <vector>

#include "platform/Desktop.h"
#include "prompts/PromptLayout.h"

namespace panelglow {

class CountDown {
 public:
  static constexpr std::uint32_t kTick_ms = 10;

  /// 0 seconds: nothing is counted. `ground` is the colour behind the number where it must cover a caption.
  CountDown(platform::Desktop& desktop, platform::Color ground, unsigned int seconds)
      : desktop_(desktop), ground_(ground), timeoutTicks_(seconds * 1000 / kTick_ms) {}

  enum class Step { kNothing, kSecond, kOver };

  /// What one more tick brings. Nothing is counted any more once it is over.
  Step Tick();

  /// Finds the number's place in the window as it is now. `buttons` are those of the window.
  void Arrange(platform::WindowHandle window, const std::vector<platform::WindowHandle>& buttons);

  /// The controls that lie where the number stands, and are to paint their part of it.
  [[nodiscard]] const std::vector<platform::WindowHandle>& Controls() const { return controls_; }
  [[nodiscard]] bool IsOn(platform::WindowHandle control) const;
  [[nodiscard]] bool IsRunning() const { return timeoutTicks_ != 0; }

  /// Paints the number, or the part of it that lies there, on the window or one of Controls().
  void Paint(platform::Canvas& canvas, platform::WindowHandle surface) const;

 private:
  platform::Desktop& desktop_;
  platform::Color ground_;
  std::uint32_t timeoutTicks_;
  std::uint32_t elapsedTicks_ = 0;
  wstring text_;
  CountDownPlace place_;  // client pixels of the window
  std::vector<platform::WindowHandle> controls_;
};

}  // namespace panelglow
