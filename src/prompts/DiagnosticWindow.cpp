#include "prompts/DiagnosticWindow.h"

#include <utility>

#include "prompts/PromptWindow.h"

namespace panelglow {

namespace {

int Show(const DiagnosticConfiguration& configuration, PromptWindow::Request request) {
  return PromptWindow({"MessageWindowClassName", configuration.GetBackgroundBrush(), true}, std::move(request)).Run();
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
  PromptWindow::Request request{text, title, style};
  request.marks = {greenMark, redMark};
  return Show(configuration, std::move(request));
}

}  // namespace panelglow
