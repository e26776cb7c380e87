#include "ledtests/PutBack.h"

#include <exception>
#include <memory>
#include <utility>

#include "harness/base/CDMException.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "platform/Threads.h"

namespace panelglow {

namespace {

void LogFailure(const std::string& reason) {
  CDMout::LogMessage(LogOptions::DeviceErrors, kFreeText, "A LED could not be blinked: " + reason);
}

}  // namespace

std::string TextOf(const CDMException& failure) {
  std::string text = "code " + CDMUtil::ToString(failure.code);
  for (const auto& message : failure.GetMessages()) {
    text += ", " + message->GetText();
  }
  return text;
}

// Everything that a chip, a driver or a firmware call can throw.
void ActAndLog(const std::function<void()>& action) {
  try {
    action();
  } catch (const platform::ThreadTerminated&) {
    throw;
  } catch (CDMException* failure) {
    const std::unique_ptr<CDMException> owned(failure);
    LogFailure(TextOf(*owned));
  } catch (const CDMException& failure) {
    LogFailure(TextOf(failure));
  } catch (const std::exception& failure) {
    LogFailure(failure.what());
  } catch (const std::string& text) {
    LogFailure(text);
  } catch (int code) {
    LogFailure("code " + CDMUtil::ToString(code));
  } catch (...) {
    LogFailure("an unknown failure");
  }
}

PutBack::PutBack(std::function<void()> action) : action_(std::move(action)) {}

PutBack::~PutBack() {
  try {
    ActAndLog(action_);
  } catch (const platform::ThreadTerminated&) {
    ActAndLog(action_);
  }
}

}  // namespace panelglow
