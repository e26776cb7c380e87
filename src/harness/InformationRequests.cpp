// The requests that ask the program about itself: usage, version, description, catalogue, dictionary. Other tools
// read the answers, so every byte of them counts.
#include <string_view>

#include "harness/CDMDiag.h"
#include "harness/CatalogAttribute.h"
#include "harness/CmdLineParser.h"
#include "harness/DiagnosticManager.h"
#include "harness/base/CDMUtil.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr const char* kTestNotAvailable = "<TEST_NOT_AVAILABLE/>";
constexpr const char* kTestInformationNotAvailable = "<TEST_INFORMATION_NOT_AVAILABLE/>";

constexpr int kTestIndent = 2;  // of a subtest inside the whole catalogue

void Print(const std::string& text) { platform::TheHost().console.Write(text + "\n"); }

bool IsRequested(const char* request) {
  return CDMUtil::EqualIgnoreCase(CmdLineParser::GetInstance().GetParameter(request, "false"), "true");
}

std::string UsageOf(const std::string& subtestList) {
  return "Usage:\n\n" + CmdLineParser::GetInstance().GetProgramPath() +
         " [<parameter>]*\n"
         "where parameter is one of the following:\n"
         "-subtest=<testname>     Name of the test ( " +
         subtestList +
         " )\n"
         "-version=true|false     Default is false\n"
         "-help=true|false        Default is false\n"
         "-description=true|false Default is false\n"
         "-locale=<locale>        Default is en_US\n"
         "-debug=true|false       Default is false\n"
         "-catalog=true|false     Print XML description of diagnostic / test - Default is false\n"
         "-diagconf=<filename>    Optional parameter to define a diagnostic resource file name. Used for CPC field "
         "to "
         "customize look and feel.\n"
         "-paramfile=<filename>   Path and file name of an INI file that can contain any or all command line "
         "parameters.\n"
         "-paramsection=<section> Section within the above INI file that lists command line parameters. It cannot be "
         "blank if -paramfile is not blank.\n";
}

// The answer about one subtest, or about all when there is none; never an empty text.
std::string Available(const CDMDiag* test, std::string text) {
  if (!text.empty()) {
    return text;
  }
  return test == nullptr ? kTestNotAvailable : kTestInformationNotAvailable;
}

}  // namespace

// False, with the reason on standard output, when a request is neither asked for nor declined.
bool DiagnosticManager::AreRequestsValid() {
  for (const char* request : {"-debug", "-help", "-description", "-version", "-catalog"}) {
    const std::string value = CmdLineParser::GetInstance().GetParameter(request, "");
    if (!value.empty() && !CDMUtil::IsBoolean(value)) {
      Print(std::string("Invalid value for parameter ") + request);
      Print(UsageOf(""));
      return false;
    }
  }
  return true;
}

// Answers what was asked about `test`, or about the whole diagnostic when it is null. False when nothing was asked.
bool DiagnosticManager::AnswerRequests(CDMDiag* test) const {
  const bool wantsVersion = IsRequested("-version");
  const bool wantsCatalog = IsRequested("-catalog");
  const bool wantsDictionary = IsRequested("-dictionary");
  const bool wantsDescription = IsRequested("-description");
  const bool wantsHelp = IsRequested("-help");
  if (wantsVersion) {
    Print(CmdLineParser::GetInstance().GetProgramPath() + "\nVersion: " + version);
  }
  if (wantsCatalog) {
    Print(Available(test, test == nullptr ? GetCatalog() : test->GetCatalogEntry(0)));
  }
  if (wantsDictionary) {
    Print(Available(test, test == nullptr ? GetDictionary() : test->GetDictionaryEntry()));
  }
  if (wantsDescription) {
    Print("TMB CDM diagnostics\n\nVersion: " + version);
    if (test != nullptr) {
      Print(test->GetDescription());
    }
  }
  if (wantsHelp) {
    Print(UsageOf(test == nullptr ? GetSubtestNames() : test->GetName()));
    if (test != nullptr) {
      Print(test->GetArgumentsHelp());
    }
  }
  return wantsVersion || wantsCatalog || wantsDictionary || wantsDescription || wantsHelp;
}

std::string DiagnosticManager::VersionOnOneLine() const {
  std::string text = version;
  CDMUtil::ReplaceAll(text, "\n", ", ");
  CDMUtil::ReplaceAll(text, "  ", " ");
  CDMUtil::ReplaceAll(text, "(", "");
  CDMUtil::ReplaceAll(text, ")", "");
  CDMUtil::ReplaceAll(text, " :", ":");
  return text;
}

std::string DiagnosticManager::GetCatalog() const {
  std::string catalog = "<DIAGNOSTIC" + CatalogAttributeIfAny("Name", name) +
                        CatalogAttributeIfAny("Version", VersionOnOneLine()) +
                        CatalogAttributeIfAny("FileName", CmdLineParser::GetInstance().GetProgramPath()) + ">\n";
  for (const auto& [subtestName, test] : CopyOfSubtests()) {
    catalog += test->GetCatalogEntry(kTestIndent) + "\n";
  }
  return catalog + "</DIAGNOSTIC>";
}

std::string DiagnosticManager::GetDictionary() {
  std::string dictionary = "[en_US]\nName = TBC\nDescription = TBC\n";
  for (const auto& [subtestName, test] : CopyOfSubtests()) {
    dictionary += test->GetDictionaryEntry();
  }
  return dictionary;
}

}  // namespace panelglow
