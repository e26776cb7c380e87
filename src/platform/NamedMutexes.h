// Mutexes that all processes of the machine share by name.
#pragma once

#include <cstdint>
#include <string_view>

namespace panelglow::platform {

/// Names an opened mutex in this process; 0 names none.
using MutexHandle = std::uint32_t;

/// Owned by a thread and recursive. When the owner ends (thread or process) without releasing, the next waiter
/// obtains the mutex like a free one.
class NamedMutexes {
 public:
  virtual ~NamedMutexes() = default;

  /// Opens the mutex, creating it when it is new; not owned initially. The same name gives the same mutex. Returns
  /// 0 on failure.
  virtual MutexHandle Create(std::string_view name) = 0;

  /// Blocks without limit until the calling thread owns the mutex. A handle of 0 returns at once.
  virtual void WaitFor(MutexHandle mutex) = 0;

  /// Gives up one ownership. False, and nothing changed, when the calling thread is not the owner.
  virtual bool Release(MutexHandle mutex) = 0;
};

/// Holds a named mutex for the life of the object, on one thread.
class NamedMutexLock {
 public:
  NamedMutexLock(NamedMutexes& mutexes, std::string_view name) : mutexes_(mutexes), mutex_(mutexes.Create(name)) {
    mutexes_.WaitFor(mutex_);
  }
  ~NamedMutexLock() { mutexes_.Release(mutex_); }
  NamedMutexLock(const NamedMutexLock&) = delete;
  NamedMutexLock& operator=(const NamedMutexLock&) = delete;

 private:
  NamedMutexes& mutexes_;
  MutexHandle mutex_;
};

}  // namespace panelglow::platform
