#include "platform/posix/LazyDrawing.h"

#include <algorithm>
#include <string>

#include "platform/Text.h"
#include "platform/posix/ModuleLoader.h"
#include "platform/posix/TellPeople.h"

namespace panelglow::platform::posix {

desktop::SceneDrawing* LazyDrawing::Get() {
  std::call_once(once_, [this] {
    using Maker = desktop::SceneDrawing* (*)();
    std::string error;
    if (const auto make = reinterpret_cast<Maker>(LoadSymbol("panelglow-drawing", "PanelglowSceneDrawing", error))) {
      drawing_ = make();
    } else {
      TellPeople("Nothing can be shown, as libpanelglow-drawing.so cannot be loaded: " + error +
                 ". Put it beside the program, or into ../lib.");
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
