#include "prompts/CDMWindow.h"

#include <atomic>
#include <utility>

#include "platform/Host.h"
#include "prompts/PromptState.h"

namespace panelglow {

namespace {

constexpr const char* kPromptMutex = "_HalcyonPromptLock";

std::atomic<platform::MutexHandle> g_promptMutex{0};

CDMWindow::Services& TheServices() {
  static CDMWindow::Services services;
  return services;
}

}  // namespace

PromptState& ThePromptState() {
  static PromptState state;
  return state;
}

void CDMWindow::LockPrompt() {
  // Whatever the operator is shown comes through here first.
  platform::TheHost().desktop.SetLanguage(Locale());
  platform::NamedMutexes& mutexes = platform::TheHost().mutexes;
  g_promptMutex = mutexes.Create(kPromptMutex);
  mutexes.WaitFor(g_promptMutex);
}

void CDMWindow::ReleasePrompt() {
  if (g_promptMutex != 0) {
    platform::TheHost().mutexes.Release(g_promptMutex);
  }
}

bool CDMWindow::TestPromptEvents(std::uint32_t mask) { return (ThePromptState().promptEvents & mask) != 0; }

void CDMWindow::ClearPromptEvents(std::uint32_t mask) { ThePromptState().promptEvents &= ~mask; }

void CDMWindow::SetServices(Services services) { TheServices() = std::move(services); }

wstring CDMWindow::Text(int id, const wstring& fallback) {
  return TheServices().text ? TheServices().text(id, fallback) : fallback;
}

std::string CDMWindow::Locale() { return TheServices().locale ? TheServices().locale() : "en_US"; }

bool CDMWindow::IsStopRequested() { return TheServices().isStopRequested && TheServices().isStopRequested(); }

}  // namespace panelglow
