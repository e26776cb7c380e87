// The seconds that are left, painted on a prompt. The number has a fixed place in the window; where a button lies
// there it moves aside, and where a text lies there it is painted on the text.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "platform/Desktop.h"

namespace panelglow {

class CountDown {
 public:
  /// `ground` is the colour behind the number where it must cover a caption.
  CountDown(platform::Desktop& desktop, platform::Color ground) : desktop_(desktop), ground_(ground) {}

  /// Finds the number's place in the window as it is now; `seconds` is empty when nothing is counted. `buttons` are
  /// those of the window.
  void Arrange(platform::WindowHandle window, const std::vector<platform::WindowHandle>& buttons,
               std::optional<std::uint32_t> seconds);

  /// The controls that lie where the number stands, and are to paint their part of it.
  [[nodiscard]] const std::vector<platform::WindowHandle>& Controls() const { return controls_; }
  [[nodiscard]] bool IsOn(platform::WindowHandle control) const;

  /// Paints the number, or the part of it that lies there, on the window or one of Controls().
  void Paint(platform::Canvas& canvas, platform::WindowHandle surface) const;

 private:
  void MoveAside(const std::vector<platform::Rectangle>& buttons, int clientWidth);
  void MoveOnto(platform::WindowHandle button);

  platform::Desktop& desktop_;
  platform::Color ground_;
  wstring text_;               // empty: nothing is counted
  platform::Rectangle place_;  // client pixels of the window
  bool coversCaption_ = false;
  std::vector<platform::WindowHandle> controls_;
};

}  // namespace panelglow
