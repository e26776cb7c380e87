// Image and icon files.
#pragma once

#include <optional>
#include <string_view>

#include "platform/Text.h"

namespace panelglow::platform {

struct ImageSize {
  int width = 0;   // pixels
  int height = 0;  // pixels
};

class Images {
 public:
  virtual ~Images() = default;

  /// The natural size of an image file, or nothing when the file does not decode as one.
  virtual std::optional<ImageSize> Size(std::u16string_view path) = 0;
};

}  // namespace panelglow::platform
