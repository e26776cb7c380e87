// The base of every subtest: the parameters that all understand, the table of parameters that it declares, and the
// whole harness through one class: output, texts, prompts, run control. A subtest declares its arguments and its
// description in its constructor and implements Run.
#pragma once

#include <atomic>
#include <cstdint>
#include <map>
#include <memory>
#include <string>

#include "harness/CDMArgument.h"
#include "harness/base/CDMout.h"
#include "platform/Text.h"
#include "prompts/PromptState.h"

namespace panelglow {

class CDMDiag {
 public:
  CDMDiag();

  /// Gives up the prompt lock, should this thread still own it.
  virtual ~CDMDiag();
  CDMDiag(const CDMDiag&) = delete;
  CDMDiag& operator=(const CDMDiag&) = delete;

  /// The subtest itself. True: passed. False: failed, and said why through ReportFailure or the log. Called once,
  /// with a validated command line.
  virtual bool Run() = 0;

  /// Checks the command line against the declared arguments and logs the first bad parameter.
  virtual bool ValidateArguments();

  /// The help blocks of all arguments that are not hidden.
  virtual std::string GetArgumentsHelp();
  virtual std::string GetDescription() { return description; }

  /// The element of this subtest in the catalogue, behind `indent` blanks, without a line end.
  std::string GetCatalogEntry(int indent);

  /// The keys of this subtest in the dictionary, each line with its end.
  std::string GetDictionaryEntry();

  void SetName(const std::string& registeredName) { name = registeredName; }
  [[nodiscard]] const std::string& GetName() const { return name; }

  /// One line for each parameter, standard ones first.
  void LogArguments(LogOptions option, unsigned int id);

  // ---- output
  static void UpdatePercentage(int percent) { CDMout::UpdatePercentage(percent); }
  static void ReportFailure(const std::string& text) { CDMout::ReportFailure(text); }
  static void TestFailed(int code, const std::string& text) { CDMout::TestFailed(code, text); }
  template <class Text>
  static void LogMessage(LogOptions option, unsigned int id, const Text& text) {
    CDMout::LogMessage(option, id, text);
  }

  // ---- texts by message number
  static wstring GetResourceString(int id, const wstring& text);
  static wstring GetResourceString(int id, const wstring& text, const wstring& fallback, wstring& mediaPath);

  // ---- run control; each call looks anew, nothing is cached

  /// True when a control file tells the run to stop.
  static bool ShouldTestBeTerminated();
  static bool IsPauseRequested();
  static bool IsResumeRequested();

  /// True when a console control event has arrived.
  static bool IsSignalReceived() { return signalCount.load() != 0; }

  /// Notes a console control event; called on the system's control thread.
  static void AddSignal(std::uint32_t type);

  // ---- prompts: block until the operator has answered; the result is a PromptResult. With a diagnostic
  // configuration file the configurable windows take the plain ones' place, and the last two arguments have no
  // effect.
  static int PopWindow(const wstring& text, const wstring& title, unsigned int style, const wstring& imagePath,
                       AutoWorker autoWorker, int autoResult);
  static int PopWindow(const wstring& text, const wstring& title, unsigned int style, AutoWorker autoWorker,
                       int autoResult);
  static int PopWindow(const std::string& text, const std::string& title, unsigned int style);
  static int PopWindow(const wstring& text, const std::string& title, unsigned int style);

  /// The first of each mark's occurrences in the text is shown on coloured ground.
  static int PopWindow(const wstring& text, const std::string& title, unsigned int style, const wstring& greenMark,
                       const wstring& redMark);

  /// Shows a text for a time: 1 when `hook` ended the window, 2 when it was closed, -2 when the time was over.
  /// `seconds` 0: no limit. `hook` sees the window's messages first, and finishes one by returning 0; empty for none.
  static int PopMessageWindow(const wstring& text, const wstring& title, int seconds, platform::WindowProcedure hook);

  /// Lets the operator enter a line, at most 255 characters; what was typed is wiped when no further character comes
  /// within `clearInterval` ms. Ended by the button: 5; by the Enter key: 0.
  static int PopTextWindow(const wstring& text, const wstring& title, std::string& entered,
                           std::uint32_t clearInterval);

  /// Arms the next plain prompt: after `seconds` it ends with `timeoutResult`.
  static void SetPromptTimeout(unsigned int seconds, int timeoutResult);

  /// True when the diagnostic configuration file exists.
  static bool HasWindowSettings();

  /// The background colour that the diagnostic configuration file gives the windows.
  static platform::Color GetWindowBackgroundBrush();

 protected:
  /// Declares an argument, replacing one of the same name.
  void DeclareArgument(const std::string& argument, CDMArgumentType type, const std::string& defaultValue,
                       const std::string& argumentDescription, bool required,
                       std::unique_ptr<CDMConstraint> constraint, bool hidden, bool guiHidden);
  void SetDescription(const std::string& text) { description = text; }

  /// The command line's value; when that is empty the declared default; when that is empty too, the caller's.
  [[nodiscard]] std::string GetArgument(const std::string& argument, const char* defaultValue) const;
  [[nodiscard]] std::string GetArgument(const std::string& argument, const std::string& defaultValue) const;
  [[nodiscard]] bool GetArgument(const std::string& argument, bool defaultValue) const;
  [[nodiscard]] int GetArgument(const std::string& argument, int defaultValue) const;

  std::string name;     // as registered
  std::string subtest;  // value of -subtest
  bool help = false;
  bool debug = false;
  std::string locale;
  bool descriptionRequested = false;
  std::string description;
  std::string paramFile;
  std::string paramSection;
  std::string integratorMsgFile;
  std::string dataCollectionFile;
  std::map<std::string, std::unique_ptr<CDMArgument>> arguments;

 private:
  bool CheckParameter(const std::map<std::string, CDMArgument*>& declared, const std::string& key,
                      const std::string& value) const;

  static std::string diagConfPath;
  static bool debugEnabled;
  static std::atomic<unsigned int> signalCount;
};

}  // namespace panelglow
