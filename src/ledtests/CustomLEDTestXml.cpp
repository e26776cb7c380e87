// The button files of CustomLEDTest: checked against their schemas, read, and merged into the list of buttons.
#include <map>
#include <stdexcept>

#include "config/FileLock.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/Notices.h"
#include "ledtests/CustomLEDTest.h"
#include "ledtests/LedKind.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr int kSchemaFileMissing = 990826;
constexpr int kComponentMissing = 990638;
constexpr int kFileNotLoaded = 990632;
constexpr int kFileNotValid = 990163;
constexpr int kComponentFailed = 990404;

constexpr int kFileMessage = 61;
constexpr int kComponentMessage = 51;
constexpr unsigned int kNotValidMessage = 53;
constexpr unsigned int kErrorCountMessage = 56;

constexpr const char* kSchemaInstance = "http://www.w3.org/2001/XMLSchema-instance";
constexpr const char* kNoFunction = "none";     // of a button that is shown only
constexpr const char* kDefaultCode = "770146";  // of a function that no button has

// What a failure's text says of the component's problem, each line indented by `indent`.
std::string Describe(const platform::XmlProblem& problem, const std::string& indent) {
  return "ErrorCode: 0X" + CDMUtil::ToHexString(problem.code) + "\n" + indent + "Reason: " + problem.reason + indent +
         "Location: " + problem.location + "\n\n";
}

std::string Rule() { return std::string(79, '-') + "\n"; }

// A value for use between apostrophes in a filter.
std::string Quoted(const std::string& value) {
  return value.find_first_of("<>&'\"") == std::string::npos ? "'" + value + "'"
                                                            : "'" + CDMUtil::EscapeXml(value) + "'";
}

}  // namespace

void CustomLEDTest::RequireSchemaFile(const std::string& path, const std::string& textBehindPath) {
  if (!CDMUtil::FileExists(path)) {
    Fail({.recordedCode = CDMUtil::ToString(kSchemaFileMissing),
          .exceptionCode = kSchemaFileMissing,
          .messageId = kFileMessage,
          .text = "XML Validation file " + path + textBehindPath});
  }
}

void CustomLEDTest::LoadXmlConfigs() {
  RequireSchemaFile(uiValidationFile, " cannot be found");
  ValidateXMLFile(uiFile, uiValidationFile);
  LoadTree(uiXml, uiFile);
  RequireSchemaFile(buttonDefinitionValidationFile, "cannot be found");
  ValidateXMLFile(buttonDefinitionFile, buttonDefinitionValidationFile);
  LoadTree(buttonXml, buttonDefinitionFile);
  ParseXMLConfigurationFiles();
}

void CustomLEDTest::LoadTree(XmlObject& tree, const std::string& path) {
  bool loaded = false;
  try {
    loaded = tree.LoadFromFile(path, false, false, -1);
  } catch (const std::runtime_error& error) {
    // What a general XML processor accepts and this reader does not, as a CDATA section.
    LogMessage(LogOptions::Debug, kFreeText, error.what());
  }
  if (!loaded) {
    Fail({.recordedCode = CDMUtil::ToString(kFileNotLoaded),
          .exceptionCode = kFileNotLoaded,
          .messageId = kFileMessage,
          .text = path});
  }
}

std::unique_ptr<platform::XmlDocument> CustomLEDTest::LoadXMLForValidation(const std::string& inputXml) {
  std::unique_ptr<platform::XmlDocument> document = platform::TheHost().xmlDocuments.Create();
  if (!document) {
    Fail({.attemptNumber = attemptNumber,
          .recordedCode = CDMUtil::ToString(kComponentMissing),
          .exceptionCode = kComponentMissing,
          .option = LogOptions::ServiceErrors,
          .messageId = kComponentMessage});
  }
  platform::XmlProblem problem;
  if (!document->Load(inputXml, problem)) {
    document.reset();
    Fail({.attemptNumber = attemptNumber,
          .recordedCode = CDMUtil::ToString(kFileNotLoaded),
          .exceptionCode = kFileNotLoaded,
          .option = LogOptions::ServiceErrors,
          .messageId = kNote,
          .text =
              "\n    Input file " + inputXml + " is corrupt or cannot be found.\n    " + Describe(problem, "    ")});
  }
  return document;
}

// The check runs on a copy beside the file, whose root names the schema; the file itself is never changed. A copy
// that does not fit stays for the integrator to look at. Two runs in one folder take turns at the copy.
bool CustomLEDTest::ValidateXMLFile(const std::string& inputXml, const std::string& inputXsd) {
  const std::string workFile = inputXml + ".modif";
  const FileLock turn(workFile);
  const std::vector<platform::XmlProblem> problems = FindProblems(inputXml, inputXsd, workFile);
  if (problems.empty()) {
    platform::TheHost().files.Remove(workFile);
    return true;
  }
  LogMessage(LogOptions::ServiceErrors, kNotValidMessage, "");
  LogMessage(LogOptions::ServiceErrors, kErrorCountMessage, static_cast<int>(problems.size()));
  LogMessage(LogOptions::ServiceErrors, kNote,
             "\nInput XML file " + inputXml + " is not proper. Parsing errors are listed below :\n\n" + Rule());
  std::string blocks;
  for (std::size_t i = 0; i < problems.size(); ++i) {
    blocks += "\n[Err:" + CDMUtil::ToString(i + 1) + "] " + Describe(problems[i], "        ") + Rule();
  }
  Fail({.attemptNumber = attemptNumber,
        .recordedCode = CDMUtil::ToString(kFileNotValid),
        .exceptionCode = kFileNotValid,
        .option = LogOptions::ServiceErrors,
        .messageId = kNote,
        .text = blocks});
}

// Where the copy cannot be written, in a folder for reading only, the document is judged as it stands in memory.
std::vector<platform::XmlProblem> CustomLEDTest::FindProblems(const std::string& inputXml,
                                                              const std::string& inputXsd,
                                                              const std::string& workFile) {
  try {
    const std::unique_ptr<platform::XmlDocument> document = LoadXMLForValidation(inputXml);
    document->SetRootAttribute("xmlns:xsi", kSchemaInstance);
    document->SetRootAttribute("xsi:noNamespaceSchemaLocation", inputXsd);
    return platform::TheHost().files.Write(workFile, document->Text()) ? document->LoadAndValidate(workFile)
                                                                       : document->Validate();
  } catch (const platform::XmlComponentError& error) {
    Fail({.attemptNumber = attemptNumber,
          .recordedCode = CDMUtil::ToString(kComponentFailed),
          .exceptionCode = kComponentFailed,
          .option = LogOptions::ServiceErrors,
          .messageId = kNote,
          .text = error.what()});
  }
}

void CustomLEDTest::ParseXMLConfigurationFiles() {
  XmlObject* section = uiXml.FindFirstMatch("Section", "@ID=" + Quoted(sectionId));
  const auto refuse = [this](const std::string& text) {
    Fail({.recordedCode = CDMUtil::ToString(kFileNotValid),
          .exceptionCode = kFileNotValid,
          .messageId = kFreeText,
          .text = text});
  };
  if (section == nullptr) {
    refuse("There is no section \"" + sectionId + "\" in the file " + uiFile +
           ": name one of its sections with -SectionID.");
  }
  buttons.clear();
  TellOddities(*section);
  for (XmlObject& child : section->children) {
    ButtonDefStruct button;
    if (const XmlObject* config = child.FindFirstMatch("Config", "")) {
      button.controller = config->GetAttributeValue("Controller", "");
      button.deviceDescription = config->GetAttributeValue("DeviceDescription", "");
      button.connector = config->GetAttributeValue("Connector", "");
      button.ledOnTime = CDMUtil::ToInt(config->GetAttributeValue("LEDOnTime", ""));
      button.ledOffTime = CDMUtil::ToInt(config->GetAttributeValue("LEDOffTime", ""));
      button.ledBlinkTime = CDMUtil::ToInt(config->GetAttributeValue("LEDBlinkTime", ""));
    }
    button.active = child.GetAttributeValue("Active", "") != "false";
    button.id = child.GetAttributeValue("ID", "");
    button.caption = child.GetAttributeValue("Caption", "");
    button.errorCode = child.GetAttributeValue("ErrorCode", "");
    button.messageId = child.GetAttributeValue("MessageID", "");
    const XmlObject* definition = buttonXml.FindFirstMatch("Button", "@ID=" + Quoted(CDMUtil::ToLower(button.id)));
    if (definition == nullptr) {
      Notices::Tell("The button with the ID \"" + button.id + "\" in the section \"" + sectionId + "\" of " + uiFile +
                    " is left out: " + buttonDefinitionFile + " has no Button with the ID \"" +
                    CDMUtil::ToLower(button.id) + "\".");
      continue;
    }
    button.function = definition->GetAttributeValue("Function", "");
    button.buttonIco = definition->GetAttributeValue("ButtonIco", "");
    button.buttonLParam = definition->GetAttributeValue("ButtonLParam", "");
    const std::string function = CDMUtil::ToLower(button.function);
    if (function != kNoFunction && FindLedKindByFunction(function) == nullptr) {
      Notices::Tell("The Button \"" + CDMUtil::ToLower(button.id) + "\" of " + buttonDefinitionFile +
                    " has the function \"" + button.function +
                    "\", which no LED has: it is shown and tests nothing. Say \"none\" where that is meant.");
    }
    if (button.errorCode.empty()) {
      button.errorCode = definition->GetAttributeValue("ErrorCode", "");
    }
    if (button.messageId.empty()) {
      button.messageId = definition->GetAttributeValue("MessageID", "");
    }
    buttons.push_back(std::move(button));
  }
  if (buttons.size() > kMostButtons) {
    refuse("The section \"" + sectionId + "\" in the file " + uiFile + " has " + CDMUtil::ToString(buttons.size()) +
           " buttons: the dialog has room for " + CDMUtil::ToString(kMostButtons) + ".");
  }
}

void CustomLEDTest::MapButtonFunctionsToTests() {
  for (ButtonDefStruct& button : buttons) {
    button.function = CDMUtil::ToLower(button.function);
    if (!button.active || FindLedKindByFunction(button.function) == nullptr) {
      continue;
    }
    functions.insert(button.function);
    if (button.function != "hdgreen") {
      continue;
    }
    button.controller = CDMUtil::ToLower(button.controller);
    const bool isEvery = button.controller == "all" || button.controller == "any";
    hdControllers = isEvery ? "all" : button.controller;
    hdOnTime = button.ledOnTime > 0 ? button.ledOnTime : hdOnTime;
    hdOffTime = button.ledOffTime > 0 ? button.ledOffTime : hdOffTime;
  }
}

void CustomLEDTest::InitializeButtonArray() {
  for (std::size_t i = 0; i < buttons.size() && i < _sButtonArr.size(); ++i) {
    _sButtonArr[i] = GetResourceString(CDMUtil::ToInt(buttons[i].messageId), u"");
  }
}

// What the format allows and an integrator hardly means.
void CustomLEDTest::TellOddities(const XmlObject& section) const {
  const std::string place = "the section \"" + sectionId + "\" of " + uiFile;
  std::map<std::string, int> timesOf;
  for (const XmlObject& child : section.children) {
    const std::string id = child.GetAttributeValue("ID", "");
    ++timesOf[id];
    if (id.empty()) {
      Notices::Tell("A button of " + place + " has no ID: give it the ID of a Button of " + buttonDefinitionFile +
                    ".");
    }
    if (child.name != "Button") {
      Notices::Tell("The element \"" + std::string(child.name) + "\" of " + place +
                    " is taken for a button: the usual name is Button.");
    }
  }
  for (const auto& [id, times] : timesOf) {
    if (times > 1 && !id.empty()) {
      Notices::Tell("The button \"" + id + "\" stands " + CDMUtil::ToString(times) + " times in " + place + ".");
    }
  }
}

std::string CustomLEDTest::GetErrorCodeFromButtonFunctions(std::string_view key) const {
  for (const ButtonDefStruct& button : buttons) {
    if (CDMUtil::ToLower(button.function) == key) {
      return button.errorCode;
    }
  }
  return kDefaultCode;
}

}  // namespace panelglow
