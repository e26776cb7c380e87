// Files by the program's own path forms: ".\ui.xml" in the current directory, "\kill.ctl" in the root of the
// current drive. A backend maps them to what its system has ('\' counts as '/' where that is the separator).
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace panelglow::platform {

class Files {
 public:
  /// Files larger than this are treated like unreadable ones: no file of this program comes near it.
  static constexpr std::size_t kLargestFile_bytes = std::size_t{512} << 20U;

  virtual ~Files() = default;

  /// True when the path names a file (not a folder) that opens for reading. An empty path gives false.
  virtual bool CanRead(std::string_view path) = 0;

  /// The whole content, or nothing when the file does not open, is a folder or is too large.
  virtual std::optional<std::string> Read(std::string_view path) = 0;

  /// As Read, with the file locked against WriteLocked of every process meanwhile. The wait for the lock is limited
  /// to about ten seconds; then the file is read without it.
  virtual std::optional<std::string> ReadLocked(std::string_view path) = 0;

  /// Replaces the file's content, creating it when absent. False when it failed.
  virtual bool Write(std::string_view path, std::string_view bytes) = 0;

  /// As Write, locked against the other locked calls. When it fails the old content is kept.
  virtual bool WriteLocked(std::string_view path, std::string_view bytes) = 0;

  /// Deletes the file. False when there was none or it could not be deleted.
  virtual bool Remove(std::string_view path) = 0;

  /// The absolute form of `path`, whether the file exists or not.
  virtual std::string FullPath(std::string_view path) = 0;

  /// Without a trailing separator; empty on failure.
  virtual std::string CurrentDirectory() = 0;

  /// What stands behind the last separator of `path`, be it '\' or the system's own.
  virtual std::string FileName(std::string_view path) = 0;

  /// Full path of the running program; empty when it cannot be told.
  virtual std::string ExecutablePath() = 0;
};

}  // namespace panelglow::platform
