// The files of a simulated machine: the real ones of the current directory, overlaid by files that exist in the
// simulation only. The root of the drive ("\kill.ctl") and paths with a drive letter never reach the real system.
#pragma once

#include <map>
#include <optional>
#include <string>

#include "platform/Files.h"
#include "platform/sim/base/Scheduler.h"

namespace panelglow::platform::sim {

class SimFiles : public Files {
 public:
  /// Without `real` all files live in memory.
  SimFiles(Files* real, Scheduler& scheduler) : real_(real), scheduler_(scheduler) {}

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

  /// A file that somebody else puts there, or takes away.
  void Put(std::string_view path, std::string content) { overlay_[Key(path)] = std::move(content); }
  void Hide(std::string_view path) { overlay_[Key(path)] = std::nullopt; }

  /// From now on every write fails, as on a full disk.
  void FillDisk() { full_ = true; }

 private:
  static std::string Key(std::string_view path);
  [[nodiscard]] bool IsVirtual(const std::string& key) const;

  Files* real_;
  Scheduler& scheduler_;
  std::map<std::string, std::optional<std::string>> overlay_;  // no content: hidden
  bool full_ = false;
};

}  // namespace panelglow::platform::sim
