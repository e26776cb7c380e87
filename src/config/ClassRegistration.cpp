#include "config/ClassRegistration.h"

#include <set>
#include <utility>

namespace panelglow {

namespace {

struct ByName {
  using is_transparent = void;
  static std::string_view NameOf(const ClassRegistration& registration) { return registration.name; }
  static std::string_view NameOf(std::string_view name) { return name; }
  template <class Left, class Right>
  bool operator()(const Left& left, const Right& right) const {
    return NameOf(left) < NameOf(right);
  }
};

// Made at the first registration, whichever static object comes first.
std::set<ClassRegistration, ByName>& Registry() {
  static std::set<ClassRegistration, ByName> registry;
  return registry;
}

}  // namespace

bool RegisterClass(ClassRegistration registration) { return Registry().insert(std::move(registration)).second; }

const ClassRegistration* FindClass(std::string_view name) {
  const auto found = Registry().find(name);
  return found == Registry().end() ? nullptr : &*found;
}

}  // namespace panelglow
