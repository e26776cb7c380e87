#include "board/base/SelectedSystem.h"

#include <mutex>
#include <utility>

namespace panelglow {

namespace {

struct Kept {
  std::mutex guard;
  SelectedSystem system;  // by guard
};

Kept& TheKept() {
  static Kept kept;
  return kept;
}

}  // namespace

SelectedSystem GetSelectedSystem() {
  Kept& kept = TheKept();
  const std::lock_guard<std::mutex> lock(kept.guard);
  return kept.system;
}

void SetSelectedSystem(SelectedSystem system) {
  Kept& kept = TheKept();
  const std::lock_guard<std::mutex> lock(kept.guard);
  kept.system = std::move(system);
}

}  // namespace panelglow
