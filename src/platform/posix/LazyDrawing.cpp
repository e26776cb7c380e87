#include "platform/posix/LazyDrawing.h"

#include <algorithm>
#include <cstdio>
#include <string>

#include "platform/Text.h"
#include "platform/posix/ModuleLoader.h"

namespace panelglow::platform::posix {

desktop::SceneDrawing* LazyDrawing::Get() {
  std::call_once(once_, [this] {
    using Maker = desktop::SceneDrawing* (*)();
    std::string error;
    if (const auto make = reinterpret_cast<Maker>(LoadSymbol("panelglow-drawing", "PanelglowSceneDrawing", error))) {
      drawing_ = make();
    } else {
      std::fprintf(stderr, "drawing is not available: %s\n", error.c_str());
    }
  });
  return drawing_;
}

std::optional<ImageSize> DrawnImages::Size(std::u16string_view path) {
  desktop::SceneDrawing* drawing = drawing_.Get();
  std::string name = Utf8FromWide(path);
  std::replace(name.begin(), name.end(), '\\', '/');
  const auto size = drawing == nullptr ? std::nullopt : drawing->ImageSize(name);
  return size ? std::optional<ImageSize>({size->first, size->second}) : std::nullopt;
}

}  // namespace panelglow::platform::posix
