// The classes that a stream can make objects of, by name.
#pragma once

#include <memory>
#include <string>
#include <string_view>

#include "config/Persistent.h"
#include "config/PersistentByProxy.h"

namespace panelglow {

struct ClassRegistration {
  std::string name;
  std::unique_ptr<Persistent> (*create)() = nullptr;  // null: objects are made by proxy only
  std::unique_ptr<PersistentByProxy> (*createByProxy)() = nullptr;
};

/// Each streamable class registers itself while static objects are built; later the registry is only read, by any
/// thread. The first entry of a name stays: false when there is one.
bool RegisterClass(ClassRegistration registration);

/// Null when no class of this name has registered.
const ClassRegistration* FindClass(std::string_view name);

/// Registers a class with a default constructor.
template <class Streamable>
bool RegisterClass(std::string name) {
  return RegisterClass(
      {std::move(name), []() -> std::unique_ptr<Persistent> { return std::make_unique<Streamable>(); }, nullptr});
}

}  // namespace panelglow
