// The drawing module, loaded when a picture or a measure is first asked for: a run without one never pays for it.
#pragma once

#include <mutex>
#include <optional>

#include "platform/Images.h"
#include "platform/desktop/Scene.h"

namespace panelglow::platform::posix {

class LazyDrawing {
 public:
  /// Null, after one line on standard error, when the module cannot be loaded. May be called from any thread.
  desktop::SceneDrawing* Get();

 private:
  std::once_flag once_;
  desktop::SceneDrawing* drawing_ = nullptr;
};

/// Image sizes by the drawing module.
class DrawnImages : public Images {
 public:
  explicit DrawnImages(LazyDrawing& drawing) : drawing_(drawing) {}
  std::optional<ImageSize> Size(std::u16string_view path) override;

 private:
  LazyDrawing& drawing_;
};

}  // namespace panelglow::platform::posix
