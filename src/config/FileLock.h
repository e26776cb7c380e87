// The lock by which all processes of the machine take turns at one file.
#pragma once

#include <string>

#include "platform/NamedMutexes.h"

namespace panelglow {

/// One name for one file, however its path is spelled: its full path without the characters that a lock's name cannot
/// have, and the suffix of such locks.
std::string FileLockName(const std::string& file);

/// Holds the file's lock for the life of the object, on one thread. Waits without limit.
class FileLock {
 public:
  explicit FileLock(const std::string& file);

 private:
  platform::NamedMutexLock mutex_;
};

}  // namespace panelglow
