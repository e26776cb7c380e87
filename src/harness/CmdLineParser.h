// All parameters of a run, as name=value. Everything else asks this object and knows nothing of where a value came
// from: the command line, or a parameter file that it names. Nothing writes to it once the manager is built, so any
// thread may read it.
#pragma once

#include <functional>
#include <map>
#include <string>
#include <string_view>
#include <utility>

namespace panelglow {

class CmdLineParser {
 public:
  /// The singleton, created from the arguments at the first call; later calls ignore them.
  static CmdLineParser& GetInstance(int argc, const char* const* argv);

  /// The same with no arguments: the manager's call has to come first.
  static CmdLineParser& GetInstance();

  /// Logs nothing: a log line asks the singleton, which would be the very object that is being built. For the same
  /// reason the parameter file is read by a call of its own.
  CmdLineParser(int argc, const char* const* argv);
  virtual ~CmdLineParser() = default;

  /// Adds the parameters of the file that -paramfile and -paramsection name, if any; those of the command line win.
  /// The manager calls it once, before anybody else asks for a parameter. `modelName` names this machine's model.
  void ReadParameterFile(const std::function<std::string()>& modelName);

  /// The first command-line argument, unchanged.
  [[nodiscard]] std::string GetProgramPath() const { return programPath; }

  /// By lower-case key, values unchanged.
  [[nodiscard]] std::map<std::string, std::string> GetParameters() const { return parameters; }

  /// The stored value, also an empty one; the default when there is no such key. `name` without regard to case.
  [[nodiscard]] std::string GetParameter(std::string_view name, std::string_view defaultValue) const;

  /// Adds a key that is new; one that exists keeps its value, and a debug line says so.
  void AddParameter(std::string_view name, const std::string& value);

  /// True when the value is "true" or "false", without regard to case.
  [[nodiscard]] bool IsBoolean(std::string_view name) const;

  /// False when a parameter file was asked for and could not be used.
  [[nodiscard]] bool IsParamFileOk() const { return paramFileOk; }

  /// Cuts a parameter at its first "=": the lowered key and the value. Without one the whole text is both.
  static std::pair<std::string, std::string> SplitParameter(std::string_view text);

 private:
  std::map<std::string, std::string> parameters;
  std::string programPath;
  bool paramFileOk = true;
};

}  // namespace panelglow
