#include "harness/CmdLineParser.h"

#include "harness/ParameterFile.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"

namespace panelglow {

CmdLineParser& CmdLineParser::GetInstance(int argc, const char* const* argv) {
  static CmdLineParser parser(argc, argv);
  return parser;
}

CmdLineParser& CmdLineParser::GetInstance() {
  const char* nothing = "";
  return GetInstance(1, &nothing);
}

CmdLineParser::CmdLineParser(int argc, const char* const* argv) {
  if (argc > 0) {
    programPath = argv[0];
  }
  for (int i = 1; i < argc; ++i) {
    auto [key, value] = SplitParameter(argv[i]);
    parameters[key] = std::move(value);
  }
}

void CmdLineParser::ReadParameterFile(const std::function<std::string()>& modelName) {
  const std::string file = GetParameter("-ParamFile", "");
  const std::string section = GetParameter("-ParamSection", "");
  if (file.empty() && section.empty()) {
    return;
  }
  paramFileOk = false;
  if (file.empty() || section.empty()) {
    CDMout::LogMessage(LogOptions::Debug, kNote,
                       "ERROR! -ParamFile and -ParamSection both must be blank or both must be provided");
    return;
  }
  paramFileOk = ParameterFile(file, section, modelName).Read([this](const std::string& line) {
    const auto [key, value] = SplitParameter(line);
    AddParameter(key, value);
  });
}

std::pair<std::string, std::string> CmdLineParser::SplitParameter(std::string_view text) {
  const std::size_t equals = text.find('=');
  const std::string_view value = equals == std::string_view::npos ? text : text.substr(equals + 1);
  return {CDMUtil::ToLower(text.substr(0, equals)), std::string(value)};
}

std::string CmdLineParser::GetParameter(std::string_view name, std::string_view defaultValue) const {
  const auto found = parameters.find(CDMUtil::ToLower(name));
  return found == parameters.end() ? std::string(defaultValue) : found->second;
}

void CmdLineParser::AddParameter(std::string_view name, const std::string& value) {
  const std::string key = CDMUtil::ToLower(name);
  if (!parameters.emplace(key, value).second) {
    CDMout::LogMessage(LogOptions::Debug, kNote, "Ignored! Already exists on the command line: " + key);
  }
}

bool CmdLineParser::IsBoolean(std::string_view name) const {
  return CDMUtil::IsBoolean(GetParameter(name, "invalid"));
}

}  // namespace panelglow
