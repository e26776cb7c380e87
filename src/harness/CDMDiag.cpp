#include "harness/CDMDiag.h"

#include <array>
#include <utility>

#include "harness/CatalogAttribute.h"
#include "harness/CmdLineParser.h"
#include "harness/MessageFiles.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/Notices.h"
#include "platform/Host.h"
#include "prompts/CDMWindow.h"
#include "prompts/DiagnosticConfiguration.h"
#include "prompts/DiagnosticWindow.h"
#include "prompts/MessageWindow.h"
#include "prompts/PlainPrompt.h"
#include "prompts/TextWindow.h"

namespace panelglow {

namespace {

constexpr const char* kDefaultLocale = "en_US";
constexpr const char* kDefaultDiagConf = ".\\diagconf.ini";

// Message numbers of the argument check.
constexpr unsigned int kUnknownParameter = 20003;
constexpr unsigned int kBooleanExpected = 20004;
constexpr unsigned int kNumberNotAccepted = 20005;
constexpr unsigned int kTextNotAccepted = 20006;

// Control files.
constexpr const char* kControlFolder = "\\Tamberlane\\TMB Halcyon Hardware Diagnostics";
constexpr const char* kControlFile = "\\halcyon.ctl";
constexpr const char* kKillFile = "\\kill.ctl";
constexpr const char* kKillFileHere = ".\\kill.ctl";

// Standard parameters with their defaults, in the order in which they are logged.
struct StandardParameter {
  const char* name;
  const char* defaultValue;
};
constexpr std::array<StandardParameter, 10> kStandardParameters{{{"-subtest", "unknown"},
                                                                 {"-locale", kDefaultLocale},
                                                                 {"-debug", "false"},
                                                                 {"-version", "false"},
                                                                 {"-description", "false"},
                                                                 {"-help", "false"},
                                                                 {"-catalog", "false"},
                                                                 {"-diagconf", kDefaultDiagConf},
                                                                 {"-paramfile", ""},
                                                                 {"-paramsection", ""}}};

bool HoldsWord(const std::string& path, std::string_view word) {
  std::string content;
  return CDMUtil::FileExists(path) && CDMUtil::ReadFile(path, content) && content == word;
}

// The number to log for a value that an argument of this type does not accept; 0 for none.
unsigned int MessageFor(CDMArgumentType type) {
  switch (type) {
    case CDMArgumentType::Boolean:
      return kBooleanExpected;
    case CDMArgumentType::Integer:
    case CDMArgumentType::Double:
      return kNumberNotAccepted;
    case CDMArgumentType::String:
      return kTextNotAccepted;
    case CDMArgumentType::LargeInteger:
      break;  // no number is set aside for it
  }
  return 0;
}

}  // namespace

std::string CDMDiag::diagConfPath = kDefaultDiagConf;
bool CDMDiag::debugEnabled = false;
std::atomic<unsigned int> CDMDiag::signalCount{0};

CDMDiag::CDMDiag() {
  DeclareArgument("-integratormsgfile", CDMArgumentType::String, "",
                  "Name and path of messsage file from which the prompt needs to be displayed.", false, nullptr,
                  false, false);
  DeclareArgument("-DataCollectionFile", CDMArgumentType::String, "",
                  "Filepath to the XML fileto output test status for DataCollection.", false, nullptr, false, false);
  DeclareArgument("-paramfile", CDMArgumentType::String, "",
                  "Path and file name of an INI file that can contain any or all command line parameters.", false,
                  nullptr, false, false);
  DeclareArgument("-paramsection", CDMArgumentType::String, "",
                  "Section within the paramfile INI file that lists command line parameters. It cannot be blank if "
                  "-paramfile is not blank",
                  false, nullptr, false, false);
  subtest = GetArgument("-subtest", "unknown");
  locale = GetArgument("-locale", kDefaultLocale);
  help = GetArgument("-help", false);
  debug = GetArgument("-debug", false);
  descriptionRequested = GetArgument("-description", false);
  diagConfPath = GetArgument("-diagconf", kDefaultDiagConf);
  paramFile = GetArgument("-paramfile", "");
  paramSection = GetArgument("-paramsection", "");
  debugEnabled = debug;
  integratorMsgFile = GetArgument("-integratormsgfile", "");
  dataCollectionFile = GetArgument("-DataCollectionFile", "");
}

CDMDiag::~CDMDiag() { CDMWindow::ReleasePrompt(); }

// ---- arguments

void CDMDiag::DeclareArgument(const std::string& argument, CDMArgumentType type, const std::string& defaultValue,
                              const std::string& argumentDescription, bool required,
                              std::unique_ptr<CDMConstraint> constraint, bool hidden, bool guiHidden) {
  arguments[argument] = std::make_unique<CDMArgument>(argument, type, defaultValue, argumentDescription, required,
                                                      std::move(constraint), hidden, guiHidden);
}

std::string CDMDiag::GetArgument(const std::string& argument, const std::string& defaultValue) const {
  std::string value = CmdLineParser::GetInstance().GetParameter(argument, "");
  if (value.empty()) {
    const auto declared = arguments.find(argument);
    value = declared == arguments.end() ? std::string() : declared->second->GetDefaultValue();
  }
  return value.empty() ? defaultValue : value;
}

std::string CDMDiag::GetArgument(const std::string& argument, const char* defaultValue) const {
  return GetArgument(argument, std::string(defaultValue));
}

bool CDMDiag::GetArgument(const std::string& argument, bool defaultValue) const {
  return CDMUtil::ToLower(GetArgument(argument, CDMUtil::ToString(defaultValue))) == "true";
}

int CDMDiag::GetArgument(const std::string& argument, int defaultValue) const {
  const std::string text = CDMUtil::Trim(GetArgument(argument, CDMUtil::ToString(defaultValue)));
  const int number = CDMUtil::ToInt(text);
  if (!CDMUtil::IsInteger(text) || text == "-" || CDMUtil::ToInt64(text) != number) {
    Notices::Tell("The parameter " + argument + " is \"" + text +
                  "\", which is no number of 32 bits, decimal or hexadecimal behind 0x: it counts as " +
                  CDMUtil::ToString(number) + ".");
  }
  return number;
}

bool CDMDiag::ValidateArguments() {
  const CmdLineParser& parser = CmdLineParser::GetInstance();
  std::map<std::string, CDMArgument*> declared;  // by lowered name
  for (const auto& [argumentName, argument] : arguments) {
    declared[CDMUtil::ToLower(argumentName)] = argument.get();
    if (argument->IsRequired() && parser.GetParameter(argumentName, "").empty()) {
      LogMessage(LogOptions::Invalid, kFreeText,
                 "Mandatory argument " + argumentName + " is not present in command line");
      return false;
    }
  }
  for (const auto& [key, value] : parser.GetParameters()) {
    if (!CheckParameter(declared, key, value)) {
      return false;
    }
  }
  return true;
}

bool CDMDiag::CheckParameter(const std::map<std::string, CDMArgument*>& declared, const std::string& key,
                             const std::string& value) const {
  if (key == "-subtest" || key == "-locale") {
    return true;
  }
  if (key == "-debug" || key == "-version" || key == "-description" || key == "-help" || key == "-catalog") {
    if (!CDMUtil::IsBoolean(value)) {
      LogMessage(LogOptions::Invalid, kBooleanExpected, key);
      return false;
    }
    return true;
  }
  const bool isFile = key == "-diagconf" || key == "-integratormsgfile";
  const bool isParameterFile = key == "-paramfile" || key == "-paramsection";
  if (isFile || isParameterFile) {
    const bool accepted = isFile ? CDMUtil::FileExists(value) : CmdLineParser::GetInstance().IsParamFileOk();
    if (!accepted) {
      LogMessage(LogOptions::Invalid, kTextNotAccepted, key);
    }
    return accepted;
  }
  const auto found = declared.find(key);
  if (found == declared.end()) {
    LogMessage(LogOptions::Invalid, kUnknownParameter, key);
    return false;
  }
  if (!found->second->Validate(value)) {
    if (const unsigned int id = MessageFor(found->second->GetType()); id != 0) {
      LogMessage(LogOptions::Invalid, id, key);
    }
    return false;
  }
  return true;
}

std::string CDMDiag::GetArgumentsHelp() {
  std::string text;
  for (const auto& [argumentName, argument] : arguments) {
    if (!argument->IsHidden()) {
      text += argument->GetHelp() + "\n";
    }
  }
  return text;
}

std::string CDMDiag::GetCatalogEntry(int indent) {
  const std::string margin(static_cast<std::size_t>(indent), ' ');
  std::string entry = margin + "<TEST" + CatalogAttributeIfAny("Name", name.empty() ? subtest : name) +
                      CatalogAttributeIfAny("FileName", CmdLineParser::GetInstance().GetProgramPath()) +
                      CatalogAttributeIfAny("Description", CDMUtil::EscapeXml(CDMUtil::OnOneLine(GetDescription()))) +
                      " >\n";
  for (const auto& [argumentName, argument] : arguments) {
    entry += "  " + argument->GetCatalogEntry(indent + 2) + "\n";
  }
  return entry + margin + "</TEST>";
}

std::string CDMDiag::GetDictionaryEntry() {
  std::string entry = "\n\n" + name + "/Name = TBC\n";
  entry += name + "/Description = " + CDMUtil::OnOneLine(GetDescription()) + "\n";
  for (const auto& [argumentName, argument] : arguments) {
    entry += argument->GetDictionaryEntry(name);
  }
  return entry;
}

void CDMDiag::LogArguments(LogOptions option, unsigned int id) {
  if (arguments.empty()) {
    return;
  }
  for (const StandardParameter& parameter : kStandardParameters) {
    LogMessage(option, id,
               parameter.name + std::string("=") +
                   CmdLineParser::GetInstance().GetParameter(parameter.name, parameter.defaultValue));
  }
  for (const auto& [argumentName, argument] : arguments) {
    LogMessage(option, id, argumentName + "=" + GetArgument(argumentName, ""));
  }
}

// ---- texts

wstring CDMDiag::GetResourceString(int id, const wstring& text) {
  return MessageFiles::Instance().GetResourceString(id, text);
}

wstring CDMDiag::GetResourceString(int id, const wstring& text, const wstring& fallback, wstring& mediaPath) {
  return MessageFiles::Instance().GetResourceString(id, text, fallback, mediaPath);
}

// ---- run control

bool CDMDiag::ShouldTestBeTerminated() {
  const std::string programData = platform::TheHost().environment.Variable("ProgramData").value_or("");
  if (!programData.empty()) {
    const std::string folder = programData + kControlFolder;
    if (HoldsWord(folder + kControlFile, "terminate") || CDMUtil::FileExists(folder + kKillFile)) {
      return true;
    }
  }
  return HoldsWord(kControlFile, "terminate") || CDMUtil::FileExists(kKillFile) || CDMUtil::FileExists(kKillFileHere);
}

bool CDMDiag::IsPauseRequested() { return HoldsWord(kControlFile, "pause"); }

bool CDMDiag::IsResumeRequested() { return HoldsWord(kControlFile, "resume"); }

void CDMDiag::AddSignal(std::uint32_t /*type*/) { ++signalCount; }

// ---- prompts

bool CDMDiag::HasWindowSettings() { return CDMUtil::FileExists(diagConfPath); }

platform::Color CDMDiag::GetWindowBackgroundBrush() {
  return DiagnosticConfiguration(diagConfPath).GetBackgroundBrush();
}

int CDMDiag::PopWindow(const wstring& text, const wstring& title, unsigned int style, const wstring& imagePath,
                       AutoWorker autoWorker, int autoResult) {
  if (HasWindowSettings()) {
    return DiagnosticWindow(diagConfPath).ImageForm(text, title, style, imagePath);
  }
  return ImagePrompt(text, title, style, imagePath, std::move(autoWorker), autoResult);
}

int CDMDiag::PopWindow(const wstring& text, const wstring& title, unsigned int style, AutoWorker autoWorker,
                       int autoResult) {
  if (HasWindowSettings()) {
    return DiagnosticWindow(diagConfPath).TextForm(text, title, style);
  }
  return TextPrompt(text, title, style, std::move(autoWorker), autoResult);
}

int CDMDiag::PopWindow(const std::string& text, const std::string& title, unsigned int style) {
  return PopWindow(CDMUtil::ToWString(text), CDMUtil::ToWString(title), style, nullptr, 0);
}

int CDMDiag::PopWindow(const wstring& text, const std::string& title, unsigned int style) {
  return PopWindow(text, CDMUtil::ToWString(title), style, nullptr, 0);
}

int CDMDiag::PopWindow(const wstring& text, const std::string& title, unsigned int style, const wstring& greenMark,
                       const wstring& redMark) {
  const wstring wideTitle = CDMUtil::ToWString(title);
  if (HasWindowSettings()) {
    return DiagnosticWindow(diagConfPath).MarkedForm(text, wideTitle, style, greenMark, redMark);
  }
  return MarkedPrompt(text, wideTitle, style, greenMark, redMark);
}

int CDMDiag::PopMessageWindow(const wstring& text, const wstring& title, int seconds,
                              platform::WindowProcedure hook) {
  return ShowMessageWindow(text, title, seconds, std::move(hook));
}

int CDMDiag::PopTextWindow(const wstring& text, const wstring& title, std::string& entered,
                           std::uint32_t clearInterval) {
  return ShowTextWindow(text, title, entered, clearInterval);
}

void CDMDiag::SetPromptTimeout(unsigned int seconds, int timeoutResult) {
  ThePromptState().timeoutSeconds = seconds;
  ThePromptState().timeoutResult = timeoutResult;
}

}  // namespace panelglow
