#include "platform/desktop/Damage.h"

#include <algorithm>

namespace panelglow::platform::desktop {

namespace {

bool IsEmpty(const Rectangle& area) { return area.left >= area.right || area.top >= area.bottom; }

// A top-level window and its children, in the order in which they are drawn.
using Family = std::vector<const SceneWindow*>;

std::map<WindowHandle, Family> FamiliesOf(const Scene& scene) {
  std::map<WindowHandle, Family> families;
  for (const SceneWindow& window : scene.windows) {
    families[window.topLevel].push_back(&window);
  }
  return families;
}

bool HasSameMembers(const Family& before, const Family& after) {
  return std::equal(before.begin(), before.end(), after.begin(), after.end(),
                    [](const SceneWindow* a, const SceneWindow* b) { return a->handle == b->handle; });
}

}  // namespace

Rectangle Around(const Rectangle& a, const Rectangle& b) {
  if (IsEmpty(a) || IsEmpty(b)) {
    return IsEmpty(a) ? b : a;
  }
  return {std::min(a.left, b.left), std::min(a.top, b.top), std::max(a.right, b.right), std::max(a.bottom, b.bottom)};
}

Rectangle Common(const Rectangle& a, const Rectangle& b) {
  const Rectangle common{std::max(a.left, b.left), std::max(a.top, b.top), std::min(a.right, b.right),
                         std::min(a.bottom, b.bottom)};
  return IsEmpty(common) ? Rectangle{} : common;
}

std::map<WindowHandle, Rectangle> DamageBetween(const Scene& before, const Scene& after) {
  const std::map<WindowHandle, Family> old = FamiliesOf(before);
  std::map<WindowHandle, Rectangle> damage;
  for (const auto& [handle, family] : FamiliesOf(after)) {
    const auto known = old.find(handle);
    Rectangle area;
    if (known == old.end() || !HasSameMembers(known->second, family) ||
        !(known->second.front()->frame == family.front()->frame)) {
      area = family.front()->frame;
    } else {
      for (std::size_t i = 0; i < family.size(); ++i) {
        const SceneWindow& was = *known->second[i];
        const SceneWindow& is = *family[i];
        area = was == is ? area : Around(area, Around(was.clip, is.clip));
      }
    }
    if (!IsEmpty(area)) {
      damage[handle] = area;
    }
  }
  return damage;
}

}  // namespace panelglow::platform::desktop
