// A file of parameter sets: each section holds parameters as name=value lines, or one line "ParamSet=" with the name
// of the section that holds them. The set of this machine's model, whose section's name begins with the model's name
// and "_", goes before the general one.
#pragma once

#include <functional>
#include <string>

namespace panelglow {

class ParameterFile {
 public:
  /// `modelName` is asked only when the file is really read; it may throw what the firmware's readers throw.
  ParameterFile(std::string file, std::string wantedSection, std::function<std::string()> modelName);

  /// Gives each line of the set to `take`, in the file's order. False when there is no such set or the file cannot be
  /// read; debug lines tell what was done and what failed. Throws nothing of its own.
  [[nodiscard]] bool Read(const std::function<void(const std::string& line)>& take) const;

 private:
  [[nodiscard]] bool ReadSet(const std::function<void(const std::string& line)>& take) const;

  std::string path;
  std::string section;
  std::function<std::string()> model;
};

}  // namespace panelglow
