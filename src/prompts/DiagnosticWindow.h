// The colour-configurable form of the prompts, which takes the plain ones' place when a diagnostic configuration file
// exists. It has no time-out and no worker; it ends with -1 within five seconds when the run is told to stop.
#pragma once

#include <string>

#include "platform/Text.h"
#include "prompts/DiagnosticConfiguration.h"

namespace panelglow {

class DiagnosticWindow {
 public:
  explicit DiagnosticWindow(const std::string& configurationPath) : configuration(configurationPath) {}
  virtual ~DiagnosticWindow() = default;

  /// Each form blocks and returns a PromptResult.
  int ImageForm(const wstring& text, const wstring& title, unsigned int style, const wstring& imagePath);
  int TextForm(const wstring& text, const wstring& title, unsigned int style);
  int MarkedForm(const wstring& text, const wstring& title, unsigned int style, const wstring& greenMark,
                 const wstring& redMark);

 private:
  DiagnosticConfiguration configuration;
};

}  // namespace panelglow
