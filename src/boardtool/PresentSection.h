// A machine's section in a file of the installation, to which something is added.
#pragma once

#include <string>
#include <vector>

#include "boardtool/IniOutline.h"

namespace panelglow::boardtool {

class PresentSection {
 public:
  PresentSection(const std::string& path, std::string systemId);

  /// What a look-up there gives; empty when there is no such key.
  [[nodiscard]] std::string Value(const std::string& key) const;
  [[nodiscard]] bool IsThere(const std::string& key) const { return !Value(key).empty() && Value(key) != "undef"; }

  /// The section with new lines and with the present ones of other keys, under a comment that names the file.
  [[nodiscard]] std::string With(std::vector<std::string> lines, const std::string& fileName) const;

 private:
  IniOutline file_;
  std::string systemId_;
};

}  // namespace panelglow::boardtool
