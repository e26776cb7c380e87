#include "prompts/DiagnosticWindow.h"

#include "prompts/PromptWindow.h"

namespace panelglow {

namespace {
constexpr const char* kClassName = "MessageWindowClassName";
}  // namespace

int DiagnosticWindow::ImageForm(const wstring& text, const wstring& title, unsigned int style,
                                const wstring& imagePath) {
  return PromptWindow({kClassName, configuration.GetBackgroundBrush(), true},
                      {text, title, style, true, imagePath, nullptr, 0})
      .Run();
}

int DiagnosticWindow::TextForm(const wstring& text, const wstring& title, unsigned int style) {
  return PromptWindow({kClassName, configuration.GetBackgroundBrush(), true},
                      {text, title, style, false, {}, nullptr, 0})
      .Run();
}

}  // namespace panelglow
