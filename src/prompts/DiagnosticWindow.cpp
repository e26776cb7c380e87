#include "prompts/DiagnosticWindow.h"

#include "prompts/ConfigurablePrompt.h"

namespace panelglow {

namespace {

int Show(const DiagnosticConfiguration& configuration, const PromptRequest& request) {
  return ConfigurablePrompt(configuration.GetBackgroundBrush(), request).Run();
}

}  // namespace

int DiagnosticWindow::ImageForm(const wstring& text, const wstring& title, unsigned int style,
                                const wstring& imagePath) {
  return Show(configuration, {text, title, style, true, imagePath});
}

int DiagnosticWindow::TextForm(const wstring& text, const wstring& title, unsigned int style) {
  return Show(configuration, {text, title, style});
}

int DiagnosticWindow::MarkedForm(const wstring& text, const wstring& title, unsigned int style,
                                 const wstring& greenMark, const wstring& redMark) {
  PromptRequest request{text, title, style};
  request.marks = {greenMark, redMark};
  return Show(configuration, request);
}

}  // namespace panelglow
