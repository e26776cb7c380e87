// Turns message numbers into texts: for log lines in debug mode and for the prompts that a subtest shows. The texts
// lie in the installation's message files, one section per locale; an integrator can put a file of his own in front.
#pragma once

#include <atomic>
#include <memory>
#include <string>
#include <utility>

#include "config/IniFile.h"
#include "config/WIniFile.h"
#include "platform/Text.h"

namespace panelglow {

/// A file that is opened at its first use and kept, by whichever thread comes first. Opening may wait, so no lock is
/// held meanwhile: where two threads open it at once, the second one's is dropped.
template <class File, class Path>
class OpenedAtFirstUse {
 public:
  explicit OpenedAtFirstUse(Path filePath) : path(std::move(filePath)) {}
  ~OpenedAtFirstUse() { delete file.load(); }
  OpenedAtFirstUse(const OpenedAtFirstUse&) = delete;
  OpenedAtFirstUse& operator=(const OpenedAtFirstUse&) = delete;

  const File& operator*() const {
    const File* opened = file.load();
    if (opened == nullptr) {
      auto mine = std::make_unique<const File>(path);
      if (file.compare_exchange_strong(opened, mine.get())) {
        opened = mine.release();
      }
    }
    return *opened;
  }

 private:
  Path path;
  mutable std::atomic<const File*> file{nullptr};
};

class MessageFiles {
 public:
  /// The files of this process, each opened at its first use and kept to the end. Safe to reach from several threads
  /// at once.
  static MessageFiles& Instance();

  /// Files by what the command line says now: for as long as it may still change.
  static MessageFiles OfCommandLine();

  /// `programPath` names the standard files, `integratorFile` may be empty.
  MessageFiles(const std::string& programPath, const std::string& integratorFile, std::string localeName);

  /// The text of a log line: the file's entry with `text` put in, or the number, a blank, and the text in quotation
  /// marks.
  [[nodiscard]] std::string ResolveLogMessage(unsigned int id, const std::string& text) const;

  /// The text of a prompt, in the same way.
  [[nodiscard]] wstring GetResourceString(int id, const wstring& text) const;

  /// As before, with `fallback` when no file has the text; `mediaPath` becomes the picture that goes with it, empty
  /// for none.
  [[nodiscard]] wstring GetResourceString(int id, const wstring& text, const wstring& fallback,
                                          wstring& mediaPath) const;

 private:
  [[nodiscard]] wstring LookUpMedia(const WIniFile& file, const wstring& key) const;

  using WideTexts = OpenedAtFirstUse<WIniFile, wstring>;

  std::string locale;
  OpenedAtFirstUse<IniFile, std::string> logTexts;
  WideTexts integratorTexts;
  WideTexts customTexts;
  WideTexts standardTexts;
};

}  // namespace panelglow
