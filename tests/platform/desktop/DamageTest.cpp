// What is drawn again when a scene follows another.
#include "platform/desktop/Damage.h"

#include <gtest/gtest.h>

#include <functional>

namespace panelglow::platform::desktop {
namespace {

// A child of `topLevel`, or the top-level window itself.
SceneWindow Window(WindowHandle handle, WindowHandle topLevel, const Rectangle& place) {
  SceneWindow window;
  window.handle = handle;
  window.topLevel = topLevel;
  window.frame = window.client = window.clip = place;
  return window;
}

// Two windows, the first with three children.
Scene Before() {
  Scene scene;
  scene.windows = {Window(1, 1, {0, 0, 100, 100}), Window(2, 1, {10, 10, 20, 20}), Window(3, 1, {10, 30, 20, 40}),
                   Window(4, 1, {50, 50, 60, 90}), Window(5, 5, {200, 0, 300, 50})};
  return scene;
}

TEST(Damage, IsWhatHasChangedOfEachTopLevelWindow) {
  using Areas = std::map<WindowHandle, Rectangle>;
  const Rectangle whole{0, 0, 100, 100};
  const struct {
    const char* what;
    std::function<void(std::vector<SceneWindow>&)> change;
    Areas damage;
  } kCases[] = {
      {"nothing", [](auto&) {}, {}},
      {"a text", [](auto& windows) { windows[1].text = u"new"; }, {{1, {10, 10, 20, 20}}}},
      {"two controls",
       [](auto& windows) { windows[1].pressed = windows[3].focused = true; },
       {{1, {10, 10, 60, 90}}}},
      {"a place",
       [](auto& windows) {
         windows[2].frame = windows[2].clip = {40, 30, 50, 40};
       },
       {{1, {10, 30, 50, 40}}}},
      {"a painting", [](auto& windows) { windows[0].operations = {DiscOperation{}}; }, {{1, whole}}},
      {"another painting",
       [](auto& windows) {
         windows[4].operations = {FillOperation{{}, 7}};
       },
       {{5, {200, 0, 300, 50}}}},
      {"a hidden control", [](auto& windows) { windows.erase(windows.begin() + 2); }, {{1, whole}}},
      {"a control on top", [](auto& windows) { std::swap(windows[1], windows[2]); }, {{1, whole}}},
      {"a moved window",
       [](auto& windows) {
         windows[4].frame = windows[4].clip = {210, 0, 310, 50};
       },
       {{5, {210, 0, 310, 50}}}},
      {"a window that is gone", [](auto& windows) { windows.pop_back(); }, {}},
      {"a new window",
       [](auto& windows) {
         windows.push_back(Window(6, 6, {0, 0, 9, 9}));
       },
       {{6, {0, 0, 9, 9}}}},
      {"a control without pixels", [](auto& windows) { windows[1].clip = {}; }, {{1, {10, 10, 20, 20}}}},
  };
  for (const auto& c : kCases) {
    Scene after = Before();
    c.change(after.windows);
    EXPECT_EQ(DamageBetween(Before(), after), c.damage) << c.what;
  }
  EXPECT_EQ(DamageBetween({}, Before()), (Areas{{1, whole}, {5, {200, 0, 300, 50}}}));
}

}  // namespace
}  // namespace panelglow::platform::desktop
