// The system's files. A thread that was told to end is ended before it touches one, and while it waits for a lock.
#pragma once

#include "platform/posix/PosixFiles.h"

namespace panelglow::platform::host_linux {

class LinuxFiles : public posix::PosixFiles {
 public:
  bool CanRead(std::string_view path) override;
  std::optional<std::string> Read(std::string_view path) override;
  std::optional<std::string> ReadLocked(std::string_view path) override;
  bool Write(std::string_view path, std::string_view bytes) override;
  bool WriteLocked(std::string_view path, std::string_view bytes) override;
  bool Remove(std::string_view path) override;

 protected:
  void Pause(std::chrono::milliseconds duration) override;
};

}  // namespace panelglow::platform::host_linux
