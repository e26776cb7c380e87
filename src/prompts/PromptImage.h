// The picture of a prompt: its area, which shows as much of the image as fits, and the two scroll bars that move it.
// An image that cannot be loaded is logged, and its area becomes a box with the file's name.
#pragma once

#include <optional>
#include <string>

#include "platform/Desktop.h"
#include "prompts/PromptLayout.h"

namespace panelglow {

class PromptImage {
 public:
  /// Measures the image; an empty path is none.
  PromptImage(platform::Desktop& desktop, wstring path);

  /// True also for an image that failed.
  [[nodiscard]] bool HasArea() const { return !path_.empty(); }

  /// Empty for none, and for one that failed.
  [[nodiscard]] const std::optional<PixelSize>& Size() const { return loaded_; }

  void Create(platform::WindowHandle parent, const PicturePlaces& places);

  /// Moves the parts to where they are in a window of another size, and the image back to its left top corner.
  void Place(const PicturePlaces& places);

  void Scroll(const platform::Message& scroll);
  void Paint() const;

 private:
  void SetRanges();

  platform::Desktop& desktop_;
  wstring path_;
  std::optional<PixelSize> loaded_;
  PixelSize size_;  // of the image, or what stands for it in its place
  platform::WindowHandle area_ = 0;
  platform::WindowHandle horizontalBar_ = 0;
  platform::WindowHandle verticalBar_ = 0;
  int x_ = 0;  // of the image's pixel in the area's left top corner
  int y_ = 0;
};

}  // namespace panelglow
