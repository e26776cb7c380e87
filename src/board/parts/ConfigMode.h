// A part is in its configuration mode for the life of an object.
#pragma once

#include "platform/Threads.h"

namespace panelglow {

/// `Part` has EnterConfigMode and ExitConfigMode. Never a member: a mode ends with the operation that needs it. A
/// thread that is told to end on the way in or out leaves the mode, too; the constructor and the destructor then
/// throw platform::ThreadTerminated.
template <class Part>
class ConfigMode {
 public:
  explicit ConfigMode(Part& chip) : part(chip) {
    try {
      part.EnterConfigMode();
    } catch (const platform::ThreadTerminated&) {
      part.ExitConfigMode();  // undisturbed now
      throw;
    }
  }
  ~ConfigMode() noexcept(false) {
    try {
      part.ExitConfigMode();
    } catch (const platform::ThreadTerminated&) {
      part.ExitConfigMode();
      throw;
    }
  }
  ConfigMode(const ConfigMode&) = delete;
  ConfigMode& operator=(const ConfigMode&) = delete;

 private:
  Part& part;
};

}  // namespace panelglow
