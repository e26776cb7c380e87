// Lets another host answer in place of the machine that the executable was linked with: one that only records, or one
// that plays back what was recorded. Our own tools use it; the product makes none.
#pragma once

#include <atomic>

#include "platform/Host.h"

namespace panelglow::platform {

class HostInPlace {
 public:
  /// TheHost() gives `host` while the object lives, on every thread. They nest; the last one made counts.
  explicit HostInPlace(Host& host) : before_(current_.exchange(&host)) {}
  ~HostInPlace() { current_ = before_; }
  HostInPlace(const HostInPlace&) = delete;
  HostInPlace& operator=(const HostInPlace&) = delete;

  /// Null while the executable's own machine answers.
  static Host* Current() { return current_.load(std::memory_order_acquire); }

 private:
  inline static std::atomic<Host*> current_{nullptr};
  Host* before_;
};

}  // namespace panelglow::platform
