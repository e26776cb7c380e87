// A name that one process of the machine owns at a time: a local socket of that name. It is free again the moment its
// owner closes it or dies, and leaves nothing behind.
#pragma once

#include <string>
#include <string_view>

#include "platform/posix/Descriptor.h"

namespace panelglow::platform::posix {

class OwnedName {
 public:
  /// Any text; one that is too long for a socket's address counts by its end and a hash of the whole.
  explicit OwnedName(std::string_view name);

  /// What owns the name for as long as it is open, or nothing while somebody else does.
  [[nodiscard]] Descriptor TryToOwn() const;

  /// What becomes readable when the present owner goes; nothing when it cannot be asked for that at the moment, or
  /// there is none any more: look again in a few milliseconds then.
  [[nodiscard]] Descriptor WatchOwner() const;

  /// False, with a line for people, on a system that gives no local sockets at all.
  static bool IsAvailable();

  [[nodiscard]] const std::string& Address() const { return address_; }

 private:
  std::string address_;
};

}  // namespace panelglow::platform::posix
