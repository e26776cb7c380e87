// The subtest that lets an operator test all front-panel LEDs of a machine in one dialog: each LED blinks in turn,
// and the operator presses its button. What there is to test comes from two XML files.
#pragma once

#include <array>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include "config/XmlObject.h"
#include "ledtests/ButtonDefStruct.h"
#include "ledtests/FrontPanelTest.h"
#include "platform/XmlDocuments.h"

namespace panelglow {

class CustomLEDTest : public FrontPanelTest {
 public:
  CustomLEDTest();
  ~CustomLEDTest() override;

  /// True when all LEDs passed in some attempt; false when the last attempt failed and the LED has no code of its
  /// own. Throws a new CDMException in all other cases.
  bool Run() override;

  // ---- button files

  /// Checks both files against their schemas, reads them and merges them into `buttons`.
  void LoadXmlConfigs();
  void ParseXMLConfigurationFiles();

  /// Sets the function flags of active buttons and the drive settings.
  void MapButtonFunctionsToTests();
  void InitializeButtonArray();

  /// The code of the first button with this function key; "770146" when there is none.
  [[nodiscard]] std::string GetErrorCodeFromButtonFunctions(std::string_view key) const;

  /// Fills the device array from the function flags, in random order. Always true.
  bool PrepareDeviceArray();

  /// The dialog's buttons and what they answer, from `buttons` and their captions.
  void MakeDialogRules();

  bool autoStart = false;
  std::vector<ButtonDefStruct> buttons;
  std::set<std::string, std::less<>> functions;  // keys of the active buttons

  /// Captions of the buttons, in list order.
  static std::array<wstring, kMostButtons> _sButtonArr;

 private:
  void PrepareAttempt() override;
  void BeforeDialog() override;
  bool AfterFailure() override;
  [[nodiscard]] std::string CodeOf(std::string_view function) const override {
    return GetErrorCodeFromButtonFunctions(function);
  }

  void DeclareArguments();
  void ReadArguments();
  void RequireFiles();

  std::unique_ptr<platform::XmlDocument> LoadXMLForValidation(const std::string& inputXml);
  bool ValidateXMLFile(const std::string& inputXml, const std::string& inputXsd);
  std::vector<platform::XmlProblem> FindProblems(const std::string& inputXml, const std::string& inputXsd,
                                                 const std::string& workFile);
  void LoadTree(XmlObject& tree, const std::string& path);
  void RequireSchemaFile(const std::string& path, const std::string& textBehindPath);
  void TellOddities(const XmlObject& section) const;

  std::string uiFile;
  std::string uiValidationFile;
  std::string buttonDefinitionFile;
  std::string buttonDefinitionValidationFile;
  std::string sectionId;
  wstring beginPromptText;
  wstring beginPromptMedia;
  wstring retryPromptText;
  wstring retryPromptMedia;
  XmlObject uiXml;
  XmlObject buttonXml;
};

/// The driver client of the legacy port code; built before main runs, so that the driver is there for every subtest.
extern CDevio g_objDriverObjectCustom;

}  // namespace panelglow
