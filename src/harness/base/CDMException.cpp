#include "harness/base/CDMException.h"

#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"

namespace panelglow {

namespace {

constexpr int kManagementCallFailed = 995174;

}  // namespace

void CDMException::addMessage(LogOptions option, int id, const std::string& text) {
  messages_.push_back(std::make_shared<const CDMMessage>(option, id, text));
}

void CDMException::Report() const {
  for (const auto& message : messages_) {
    if (message->id != -1) {
      CDMout::LogMessage(message->option, static_cast<unsigned int>(message->id), message->GetText());
    }
  }
  CDMout::TestFailed(code, "");
}

InvalidTmbWMIException::InvalidTmbWMIException(const std::string& call) : CDMException(kManagementCallFailed) {
  addMessage(LogOptions::ServiceErrors, kManagementCallFailed, "WMI call " + call + " failed.");
}

InvalidTmbWMICallException::InvalidTmbWMICallException(std::uint32_t a, std::uint32_t b)
    : CDMException(kManagementCallFailed) {
  addMessage(LogOptions::ServiceErrors, kManagementCallFailed,
             "tmbWMI call (" + CDMUtil::ToString(a) + "," + CDMUtil::ToString(b) + ") failed.");
}

}  // namespace panelglow
