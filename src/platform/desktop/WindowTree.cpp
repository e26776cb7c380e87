#include "platform/desktop/WindowTree.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace panelglow::platform::desktop {

Window& WindowTree::Add(std::unique_ptr<Window> window) {
  const WindowHandle handle = next_++;
  window->handle = handle;
  Window& added = *windows_.emplace(handle, std::move(window)).first->second;
  if (Window* parent = Find(added.parent)) {
    parent->children.push_back(handle);
  } else {
    order_.push_back(handle);
    Raise(handle, added.topmost ? ZOrder::kTopmost : ZOrder::kTop);
  }
  return added;
}

void WindowTree::Remove(WindowHandle window) {
  if (const Window* removed = Find(window)) {
    if (Window* parent = Find(removed->parent)) {
      std::erase(parent->children, window);
    }
    std::erase(order_, window);
    windows_.erase(window);
  }
}

Window* WindowTree::Find(WindowHandle window) const {
  const auto found = windows_.find(window);
  return found == windows_.end() ? nullptr : found->second.get();
}

bool WindowTree::Raise(WindowHandle window, ZOrder order) {
  Window* raised = Find(window);
  if (raised == nullptr || raised->parent != 0) {
    return false;
  }
  const bool wasTopmost = raised->topmost;
  const std::vector<WindowHandle> before = order_;
  raised->topmost = wasTopmost || order == ZOrder::kTopmost;
  std::erase(order_, window);
  auto place = order_.end();
  if (!raised->topmost) {
    place = std::find_if(order_.begin(), order_.end(), [&](WindowHandle other) { return Find(other)->topmost; });
  }
  order_.insert(place, window);
  return order_ != before || raised->topmost != wasTopmost;
}

std::vector<WindowHandle> WindowTree::VisibleTopLevels() const {
  std::vector<WindowHandle> visible;
  std::copy_if(order_.begin(), order_.end(), std::back_inserter(visible),
               [&](WindowHandle window) { return Find(window)->visible; });
  return visible;
}

std::vector<WindowHandle> WindowTree::TopLevelsOf(std::uint32_t thread) const {
  std::vector<WindowHandle> own;
  for (const auto& [handle, window] : windows_) {
    if (window->thread == thread && window->parent == 0) {
      own.push_back(handle);
    }
  }
  return own;
}

WindowHandle WindowTree::TopLevelOf(WindowHandle window) const {
  const Window* at = Find(window);
  while (at != nullptr && at->parent != 0) {
    at = Find(at->parent);
  }
  return at == nullptr ? 0 : at->handle;
}

bool WindowTree::IsDescendant(WindowHandle ancestor, WindowHandle window) const {
  for (const Window* at = Find(window); at != nullptr; at = Find(at->parent)) {
    if (at->handle == ancestor) {
      return true;
    }
  }
  return false;
}

WindowHandle WindowTree::ChildWithId(WindowHandle parent, int id) const {
  const Window* window = Find(parent);
  if (window == nullptr) {
    return 0;
  }
  const auto found = std::find_if(window->children.begin(), window->children.end(),
                                  [&](WindowHandle child) { return Find(child)->id == id; });
  return found == window->children.end() ? 0 : *found;
}

bool WindowTree::IsShown(WindowHandle window) const {
  const Window* at = Find(window);
  while (at != nullptr && at->visible) {
    if (at->parent == 0) {
      return true;
    }
    at = Find(at->parent);
  }
  return false;
}

WindowHandle WindowTree::ToPaint(std::uint32_t thread) const {
  const auto found = std::find_if(windows_.begin(), windows_.end(), [&](const auto& entry) {
    return entry.second->thread == thread && entry.second->dirty && IsShown(entry.first);
  });
  return found == windows_.end() ? 0 : found->first;
}

Rectangle WindowTree::FrameOnScreen(WindowHandle window) const {
  const Window* found = Find(window);
  if (found == nullptr) {
    return {};
  }
  Rectangle area = found->area;
  if (const Window* parent = Find(found->parent)) {
    const Rectangle outer = FrameOnScreen(parent->handle);
    const int dx = outer.left + FrameWidth(*parent);
    const int dy = outer.top + FrameWidth(*parent);
    area = {area.left + dx, area.top + dy, area.right + dx, area.bottom + dy};
  }
  return area;
}

Rectangle WindowTree::ClientOnScreen(WindowHandle window) const {
  const Window* found = Find(window);
  if (found == nullptr) {
    return {};
  }
  const Rectangle frame = FrameOnScreen(window);
  const Rectangle client = Client(window);
  const int left = frame.left + FrameWidth(*found);
  const int top = frame.top + FrameWidth(*found);
  return {left, top, left + client.Width(), top + client.Height()};
}

Rectangle WindowTree::Client(WindowHandle window) const {
  const Window* found = Find(window);
  if (found == nullptr) {
    return {};
  }
  const int both = 2 * FrameWidth(*found);
  return {0, 0, std::max(0, found->area.Width() - both), std::max(0, found->area.Height() - both)};
}

WindowHandle WindowTree::At(int x, int y) const {
  const auto isThere = [&](WindowHandle window) {
    return Find(window)->visible && FrameOnScreen(window).Contains(x, y);
  };
  const auto takesClick = [&](WindowHandle window) {
    const WindowKind kind = Find(window)->kind;
    return Find(window)->enabled && isThere(window) &&
           (kind == WindowKind::kPlain || kind == WindowKind::kButton || kind == WindowKind::kEdit ||
            kind == WindowKind::kScrollBar);
  };
  const auto top = std::find_if(order_.rbegin(), order_.rend(), isThere);
  WindowHandle deepest = top == order_.rend() ? 0 : *top;
  for (bool deeper = deepest != 0; deeper;) {
    const std::vector<WindowHandle>& children = Find(deepest)->children;
    const auto child = std::find_if(children.rbegin(), children.rend(), takesClick);
    deeper = child != children.rend();
    deepest = deeper ? *child : deepest;
  }
  return deepest;
}

}  // namespace panelglow::platform::desktop
