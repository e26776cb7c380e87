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
  /// Gathers them, which takes some hundredths of a second. The machine is only there for what classes ask of it.
  explicit KnownKeys(platform::Host& machine);

  /// Those of this process: they hang on no file, so that they are gathered once, for the first that asks.
  [[nodiscard]] static const KnownKeys& Once(platform::Host& machine);

  /// A key in lower case, of the chip file or of the two others.
  [[nodiscard]] bool IsKnown(const std::string& key, bool isChipFile) const;

  /// True when no rehearsal can tell whether a board reads the key: it hangs on the machine, or a test reads it.
  [[nodiscard]] static bool IsReadElsewhere(const std::string& key);

  /// The form of a key in which numbers do not differ.
  [[nodiscard]] static std::string PatternOf(const std::string& key);

  /// Keys to suggest; a number stands as 1.
  [[nodiscard]] const std::vector<std::string>& All(bool isChipFile) const { return isChipFile ? chip_ : board_; }

 private:
  std::set<std::string> chipPatterns_;
  std::set<std::string> boardPatterns_;
  std::vector<std::string> chip_;
  std::vector<std::string> board_;
};

}  // namespace panelglow::boardtool
