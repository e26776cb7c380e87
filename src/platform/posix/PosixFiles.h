// Files of a system whose separator is '/'.
#pragma once

#include <chrono>

#include "platform/Files.h"

namespace panelglow::platform::posix {

/// The program's path as this system spells it: '\' becomes '/'.
std::string NativePath(std::string_view path);

class PosixFiles : public Files {
 public:
  bool CanRead(std::string_view path) override;
  std::optional<std::string> Read(std::string_view path) override;
  std::optional<std::string> ReadLocked(std::string_view path) override;
  bool Write(std::string_view path, std::string_view bytes) override;
  bool WriteLocked(std::string_view path, std::string_view bytes) override;
  bool Remove(std::string_view path) override;
  std::string FullPath(std::string_view path) override;
  std::string CurrentDirectory() override;
  std::string FileName(std::string_view path) override;
  std::string ExecutablePath() override;

 protected:
  /// Lets the calling thread wait before it tries again for a lock. May throw.
  virtual void Pause(std::chrono::milliseconds duration);
};

}  // namespace panelglow::platform::posix
