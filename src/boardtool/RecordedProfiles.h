// Look-ups in INI files that are held in memory: says which entry each look-up found, and can give one entry another
// value, to see what hangs on it.
#pragma once

#include <set>
#include <span>
#include <string>
#include <vector>

#include "boardtool/IniOutline.h"
#include "platform/ProfileFiles.h"

namespace panelglow::boardtool {

/// A look-up in a file: what was asked, found or not.
struct LookUp {
  std::string path;
  std::string section;
  std::string key;
  auto operator<=>(const LookUp&) const = default;  // NOLINT(modernize-use-nullptr): the check misreads it
};

class RecordedProfiles : public platform::ProfileFiles {
 public:
  /// The files stay where they are while this object lives; a path is compared as it is written.
  explicit RecordedProfiles(std::span<const IniOutline> files) : files_(files) {}

  /// Gives one entry of the files another value; null: none.
  void Replace(const IniEntry* entry, std::string value);

  /// Every look-up since the last Forget, each once; section and key in lower case.
  [[nodiscard]] const std::set<LookUp>& LookUps() const { return lookUps_; }
  /// The entries that were found, in the order of the files.
  [[nodiscard]] const std::set<const IniEntry*>& Found() const { return found_; }
  void Forget();

  /// Null when there is no such file.
  [[nodiscard]] const IniOutline* File(std::string_view path) const;

  // ---- ProfileFiles; nothing is ever written
  std::size_t GetValue(std::optional<std::string_view> section, std::optional<std::string_view> key,
                       std::string_view fallback, std::span<char> buffer, std::string_view path) override;
  std::size_t GetValue(std::optional<std::u16string_view> section, std::optional<std::u16string_view> key,
                       std::u16string_view fallback, std::span<char16_t> buffer, std::u16string_view path) override;
  std::size_t GetSection(std::string_view section, std::span<char> buffer, std::string_view path) override;
  bool SetValue(std::string_view, std::optional<std::string_view>, std::optional<std::string_view>,
                std::string_view) override {
    return false;
  }
  bool SetValue(std::u16string_view, std::optional<std::u16string_view>, std::optional<std::u16string_view>,
                std::u16string_view) override {
    return false;
  }
  bool SetValues(std::string_view, std::span<const platform::ProfileEntry>, std::string_view) override {
    return false;
  }

 private:
  std::span<const IniOutline> files_;
  const IniEntry* replaced_ = nullptr;
  std::string replacement_;
  bool isRecording_ = true;
  std::set<LookUp> lookUps_;
  std::set<const IniEntry*> found_;
};

}  // namespace panelglow::boardtool
