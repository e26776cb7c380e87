// A new file that takes another one's place when it is complete.
#pragma once

#include <string>

#include "platform/posix/Descriptor.h"

namespace panelglow::platform::posix {

/// It stands beside its target, is locked for as long as its writer lives, and goes with the object. What a process
/// that was killed left beside the same target goes when the next one is made: nobody holds its lock any more.
class TemporaryFile {
 public:
  /// Makes "<target>.panelglow-" with six more characters. No file when the folder takes none.
  explicit TemporaryFile(std::string targetPath);
  ~TemporaryFile();
  TemporaryFile(const TemporaryFile&) = delete;
  TemporaryFile& operator=(const TemporaryFile&) = delete;

  explicit operator bool() const { return static_cast<bool>(file_); }
  [[nodiscard]] int Get() const { return file_.Get(); }

  /// False when the target stays what it was.
  bool TakePlace();

 private:
  void Make();

  std::string target_;
  std::string path_;  // empty when there is nothing to remove
  Descriptor file_;
};

/// True while `fd` is still the file that `path` names: another writer may have put a new one in its place.
bool IsCurrent(int fd, const std::string& path);

}  // namespace panelglow::platform::posix
