// The board files as files: what a look-up finds, and nothing else.
#pragma once

#include <string>

#include "boardtool/RecordedProfiles.h"
#include "platform/Files.h"

namespace panelglow::boardtool {

class MemoryFiles : public platform::Files {
 public:
  explicit MemoryFiles(const RecordedProfiles& profiles) : profiles_(profiles) {}

  bool CanRead(std::string_view path) override { return profiles_.File(path) != nullptr; }
  std::optional<std::string> Read(std::string_view path) override {
    const IniOutline* const file = profiles_.File(path);
    return file == nullptr ? std::nullopt : std::optional(file->bytes);
  }
  std::optional<std::string> ReadLocked(std::string_view path) override { return Read(path); }
  bool Write(std::string_view /*path*/, std::string_view /*bytes*/) override { return false; }
  bool WriteLocked(std::string_view /*path*/, std::string_view /*bytes*/) override { return false; }
  bool Remove(std::string_view /*path*/) override { return false; }
  std::string FullPath(std::string_view path) override { return std::string(path); }
  std::string CurrentDirectory() override { return {}; }
  std::string FileName(std::string_view path) override {
    return std::string(path.substr(path.find_last_of("/\\") + 1));
  }
  std::string ExecutablePath() override { return {}; }

 private:
  const RecordedProfiles& profiles_;
};

}  // namespace panelglow::boardtool
