// All keys that anything reads, gathered by running every chip class and every board class on files made for it.
#pragma once

#include <set>
#include <string>
#include <vector>

#include "boardtool/Rehearsal.h"
#include "platform/Host.h"

namespace panelglow::boardtool {

class KnownKeys {
 public:
  /// Gathers them, which takes some hundredths of a second. `names` are those of the files that are looked into.
  KnownKeys(const BoardFiles& names, platform::Host& machine);

  /// A key in lower case, of the chip file or of the two others.
  [[nodiscard]] bool IsKnown(const std::string& key, bool isChipFile) const;

  /// Keys to suggest; a number stands as 1.
  [[nodiscard]] const std::vector<std::string>& All(bool isChipFile) const { return isChipFile ? chip_ : board_; }

 private:
  std::set<std::string> chipPatterns_;
  std::set<std::string> boardPatterns_;
  std::vector<std::string> chip_;
  std::vector<std::string> board_;
};

}  // namespace panelglow::boardtool
